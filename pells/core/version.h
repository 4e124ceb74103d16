#pragma once

#include <cstdint>
#include <iosfwd>
#include <string>
#include <utility>

#include "pells/core/export.h"

namespace pells {

/// A version number of two parts, ordered by the first and then by the second.
class PELLS_API Version {
public:
    /// Major and minor number.
    typedef std::pair<std::int16_t, std::int16_t> Pair;

    /// 0.0
    Version() = default;
    /// Any two numbers, negative ones too.
    Version(std::int16_t majorNumber, std::int16_t minorNumber);
    Version(const Pair& numbers);  // NOLINT(google-explicit-constructor): a pair is the value

    /// Reads "MAJOR.MINOR" or "MAJOR" (minor 0), in decimal.
    ///
    /// \throws boost::bad_lexical_cast when a part is no number of 16 bits, as in "", "1." and
    ///         "1.5.3".
    explicit Version(const std::string& text);

    /// The two numbers, one by one and together.
    std::int16_t getMajor() const { return numbers.first; }
    std::int16_t getMinor() const { return numbers.second; }
    const Pair& getPair() const { return numbers; }

    /// "MAJOR.MINOR"
    std::string str() const;

private:
    Pair numbers{0, 0};
};

/// Versions compare by the major number first.
inline bool operator<(const Version& a, const Version& b) {
    return a.getPair() < b.getPair();
}
inline bool operator<=(const Version& a, const Version& b) {
    return a.getPair() <= b.getPair();
}
inline bool operator==(const Version& a, const Version& b) {
    return a.getPair() == b.getPair();
}
inline bool operator!=(const Version& a, const Version& b) {
    return a.getPair() != b.getPair();
}
inline bool operator>=(const Version& a, const Version& b) {
    return a.getPair() >= b.getPair();
}
inline bool operator>(const Version& a, const Version& b) {
    return a.getPair() > b.getPair();
}

/// Writes str().
PELLS_API std::ostream& operator<<(std::ostream& out, const Version& version);

}  // namespace pells
