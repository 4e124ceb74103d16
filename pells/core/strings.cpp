#include "pells/core/strings.h"

namespace pells {

unsigned string_split(const std::string& text, const std::string& separators,
                      std::vector<std::string>& out) {
    // Collected aside, so that the text or the separators may be elements of the output.
    std::vector<std::string> pieces;
    std::string::size_type begin = text.find_first_not_of(separators);
    while (begin != std::string::npos) {
        const std::string::size_type end = text.find_first_of(separators, begin);
        pieces.push_back(text.substr(begin, end - begin));
        begin = text.find_first_not_of(separators, end);
    }
    out.swap(pieces);
    return static_cast<unsigned>(out.size());
}

std::string getSingularName(const std::string& name) {
    if (name.empty() || name.back() != 's')
        return name + "Item";
    std::string singular = name.substr(0, name.size() - 1);
    const std::string::size_type size = singular.size();
    if (size >= 2 && singular.compare(size - 2, 2, "ie") == 0)
        singular.replace(size - 2, 2, "y");
    return singular;
}

}  // namespace pells
