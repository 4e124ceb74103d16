#include "pells/core/class_name.h"

#include <cctype>
#include <cstdlib>
#include <cstring>
#include <memory>

#if defined(__GNUG__)
#include <cxxabi.h>
#endif

namespace pells {

namespace {

std::string demangled(const char* name) {
#if defined(__GNUG__)
    int status = 0;
    const std::unique_ptr<char, void (*)(void*)> text(
        abi::__cxa_demangle(name, nullptr, nullptr, &status), std::free);
    if (status == 0 && text)
        return text.get();
#endif
    return name;
}

bool isIdentifierCharacter(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_' || c == ':';
}

}  // namespace

std::string className(const std::type_info& type) {
    static const char prefix[] = "pells::";
    std::string name = demangled(type.name());
    std::string::size_type at = 0;
    while ((at = name.find(prefix, at)) != std::string::npos) {
        // Only the outermost namespace goes: "other::pells::X" and "mypells::X" keep their names.
        if (at == 0 || !isIdentifierCharacter(name[at - 1]))
            name.erase(at, std::strlen(prefix));
        else
            ++at;
    }
    return name;
}

}  // namespace pells
