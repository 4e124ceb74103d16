#include "pells/asset/detail/regular_file.h"

#include <boost/filesystem/operations.hpp>

namespace pells::detail {

void openRegularFile(std::ifstream& stream, const std::string& path) {
    if (isRegularFile(path))
        stream.open(path, std::ios_base::in | std::ios_base::binary);
    else
        stream.setstate(std::ios_base::failbit);
}

bool isRegularFile(const std::string& path) {
    boost::system::error_code ignored;
    return path.find('\0') == std::string::npos &&
           boost::filesystem::is_regular_file(path, ignored);
}

}  // namespace pells::detail
