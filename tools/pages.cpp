#include "tools/pages.h"

#include <algorithm>
#include <boost/filesystem/operations.hpp>

#include "tools/atomic_file.h"

namespace pells_tool {

namespace fs = boost::filesystem;

std::string Page::path(const std::string& output) const {
    if (count == 1)
        return output;
    std::string digits = std::to_string(number);
    digits.insert(0, std::to_string(count).size() - digits.size(), '0');
    const std::string::size_type slash = output.rfind('/');
    const std::string::size_type dot = output.rfind('.');
    const bool hasExtension =
        dot != std::string::npos && (slash == std::string::npos || dot > slash + 1) && dot != 0;
    return hasExtension ? output.substr(0, dot) + "-" + digits + output.substr(dot)
                        : output + "-" + digits;
}

std::string Page::title() const {
    if (count == 1)
        return "";
    return " (page " + std::to_string(number) + " of " + std::to_string(count) + ")";
}

std::vector<Page> paginate(std::size_t cells, std::size_t mostCells) {
    const std::size_t count = std::max<std::size_t>(1, (cells + mostCells - 1) / mostCells);
    std::vector<Page> pages;
    for (std::size_t i = 0; i < count; ++i)
        pages.push_back({i * mostCells, std::min(cells, (i + 1) * mostCells), i + 1, count});
    return pages;
}

void protectInput(const std::string& output, const std::string& input) {
    boost::system::error_code ignored;
    if (fs::equivalent(output, input, ignored))
        throw pells::FileError(output, std::string("It would replace what is read"));
}

}  // namespace pells_tool
