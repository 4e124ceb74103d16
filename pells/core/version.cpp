#include "pells/core/version.h"

#include <boost/lexical_cast.hpp>
#include <typeinfo>

namespace pells {

namespace {

/// \throws boost::bad_lexical_cast
std::int16_t numberOf(const std::string& text) {
    // Not a lexical_cast to 16 bits, whose arithmetic overflows for some texts.
    const int number = boost::lexical_cast<int>(text);
    if (number != static_cast<std::int16_t>(number))
        throw boost::bad_lexical_cast(typeid(std::string), typeid(std::int16_t));
    return static_cast<std::int16_t>(number);
}

}  // namespace

Version::Version(std::int16_t majorNumber, std::int16_t minorNumber)
    : numbers(majorNumber, minorNumber) {}

Version::Version(const Pair& bothNumbers) : numbers(bothNumbers) {}

Version::Version(const std::string& text) {
    const std::string::size_type dot = text.find('.');
    numbers.first = numberOf(text.substr(0, dot));
    if (dot != std::string::npos)
        numbers.second = numberOf(text.substr(dot + 1));
}

std::string Version::str() const {
    return std::to_string(getMajor()) + '.' + std::to_string(getMinor());
}

std::ostream& operator<<(std::ostream& out, const Version& version) {
    return out << version.str();
}

}  // namespace pells
