#include "pells/log/detail/number_format.h"

#include <algorithm>
#include <cfenv>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <ios>
#include <limits>

#include "pells/core/no_destructor.h"

namespace pells::detail {

namespace {

/// Whether a stream asks for nothing but the shortest way to write a number.
bool isPlain(const std::ios_base& stream) {
    const std::ios_base::fmtflags special = std::ios_base::oct | std::ios_base::hex |
                                            std::ios_base::floatfield | std::ios_base::showpos |
                                            std::ios_base::showpoint | std::ios_base::uppercase;
    return (stream.flags() & special) == 0 && stream.width() == 0;
}

const int significantDigits = 6;  // a stream's default precision
const int smallestExponent = -4;  // of the numbers that are written without an exponent

/// Zero, or a positive number of six significant digits: d.ddddd times ten to the exponent.
struct SixDigits {
    std::uint32_t digits;
    int exponent;
};

/// Rounds to six digits.
///
/// \return false for numbers that are not written plainly, for which the exponent leaves the range
///         from -4 to 5, and for those so near the middle between two results that a double cannot
///         tell which one is nearer.
bool roundToSixDigits(double value, SixDigits& result) {
    static const double powers[] = {1, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6, 1e7, 1e8, 1e9};
    const double lowest = 1e5, end = 1e6;
    if (value == 0) {
        result = {0, 0};
        return true;
    }
    const auto* const power = std::find_if(std::begin(powers), std::end(powers),
                                           [=](double each) { return value * each >= lowest; });
    if (power == std::end(powers))
        return false;
    // The powers are exact, so this is off by no more than one rounding: less than 1e-10.
    const double scaled = value * *power;
    if (!(scaled < end))
        return false;
    result.digits = static_cast<std::uint32_t>(scaled);
    const double rest = scaled - result.digits;
    if (std::fabs(rest - 0.5) < 1e-9)
        return false;
    if (rest > 0.5)
        ++result.digits;
    result.exponent = significantDigits - 1 - static_cast<int>(power - powers);
    return result.digits < end;
}

/// Writes a number without zeros at its end. \return the end of the text.
char* write(const SixDigits& number, char* to) {
    char all[significantDigits - smallestExponent];
    const int zeros = std::max(-number.exponent, 0);
    std::fill_n(all, zeros, '0');
    const char* end = std::to_chars(all + zeros, std::end(all), number.digits).ptr;
    const char* const wholeEnd = all + std::max(number.exponent, 0) + 1;
    while (end > wholeEnd && end[-1] == '0')
        --end;
    to = std::copy(static_cast<const char*>(all), wholeEnd, to);
    if (end > wholeEnd)
        *to++ = '.';
    return std::copy(wholeEnd, end, to);
}

/// Writes plain numbers itself and leaves the others to its base.
class FastNumPut : public std::num_put<char> {
public:
    using std::num_put<char>::num_put;

protected:
    iter_type do_put(iter_type out, std::ios_base& stream, char fill, long value) const override {
        return putInteger(out, stream, fill, value);
    }
    iter_type do_put(iter_type out, std::ios_base& stream, char fill,
                     unsigned long value) const override {
        return putInteger(out, stream, fill, value);
    }
    iter_type do_put(iter_type out, std::ios_base& stream, char fill,
                     long long value) const override {
        return putInteger(out, stream, fill, value);
    }
    iter_type do_put(iter_type out, std::ios_base& stream, char fill,
                     unsigned long long value) const override {
        return putInteger(out, stream, fill, value);
    }
    iter_type do_put(iter_type out, std::ios_base& stream, char fill, double value) const override;

    // The other overloads are the base's.
    using std::num_put<char>::do_put;

private:
    template <class Integer>
    iter_type putInteger(iter_type out, std::ios_base& stream, char fill, Integer value) const {
        if (!isPlain(stream))
            return std::num_put<char>::do_put(out, stream, fill, value);
        char text[std::numeric_limits<Integer>::digits10 + 2];
        return std::copy(text, std::to_chars(std::begin(text), std::end(text), value).ptr, out);
    }
};

FastNumPut::iter_type FastNumPut::do_put(iter_type out, std::ios_base& stream, char fill,
                                         double value) const {
    SixDigits rounded;
    const bool fast = isPlain(stream) && stream.precision() == significantDigits &&
                      std::fegetround() == FE_TONEAREST &&
                      roundToSixDigits(std::fabs(value), rounded);
    if (!fast)
        return std::num_put<char>::do_put(out, stream, fill, value);
    char text[1 + 1 + 1 + significantDigits - smallestExponent];  // sign, zero, point
    text[0] = '-';
    char* const digits = std::signbit(value) ? text + 1 : text;
    return std::copy(static_cast<char*>(text), write(rounded, digits), out);
}

}  // namespace

std::locale fastClassicLocale() {
    // Not the locale's: one that cannot be made for lack of memory would not delete the facet.
    static const std::size_t keptForever = 1;
    static NoDestructor<FastNumPut> facet(keptForever);
    return std::locale(std::locale::classic(), &*facet);
}

}  // namespace pells::detail
