#include "pells/core/version.h"

#include <boost/lexical_cast.hpp>

namespace pells {

Version::Version(std::int16_t majorNumber, std::int16_t minorNumber)
    : numbers(majorNumber, minorNumber) {}

Version::Version(const Pair& bothNumbers) : numbers(bothNumbers) {}

Version::Version(const std::string& text) {
    const std::string::size_type dot = text.find('.');
    numbers.first = boost::lexical_cast<std::int16_t>(text.substr(0, dot));
    if (dot != std::string::npos)
        numbers.second = boost::lexical_cast<std::int16_t>(text.substr(dot + 1));
}

std::string Version::str() const {
    return std::to_string(getMajor()) + '.' + std::to_string(getMinor());
}

std::ostream& operator<<(std::ostream& out, const Version& version) {
    return out << version.str();
}

}  // namespace pells
