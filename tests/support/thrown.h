#pragma once

#include <string>

namespace pells_test {

/// What an error of one class says; "" when nothing is thrown. Errors of other classes pass.
template <class Error, class Function>
std::string thrown(const Function& function) {
    try {
        function();
    } catch (const Error& error) {
        return error.what();
    }
    return "";
}

}  // namespace pells_test
