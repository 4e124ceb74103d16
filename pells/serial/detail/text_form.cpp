#include "pells/serial/detail/text_form.h"

#include <charconv>
#include <cstddef>

namespace pells::detail {

namespace {

/// White space of the classic locale, without looking its facet up for each character.
bool isSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

/// Reads a text that is a plain decimal number as a whole, as most are; false leaves it to a
/// stream.
template <class T>
bool scanPlain(const std::string& text, T& value) {
    const char* at = text.data();
    const char* end = at + text.size();
    while (at != end && isSpace(*at))
        ++at;
    while (at != end && isSpace(end[-1]))
        --end;
    // Only a stream decides about the spellings of infinity, hexadecimal digits and lone signs.
    const char* const digits = at != end && *at == '-' ? at + 1 : at;
    if (digits == end || !isDigit(*digits))
        return false;
#if !defined(__cpp_lib_to_chars)
    // Such a standard library, of which libc++ is one, reads only integers from characters.
    if constexpr (std::is_floating_point_v<T>)
        return false;
    else
#endif
    {
        T scanned;
        const std::from_chars_result result = std::from_chars(at, end, scanned);
        if (result.ec != std::errc() || result.ptr != end)
            return false;
        value = scanned;
        return true;
    }
}

template <>
bool scanPlain(const std::string& text, bool& value) {
    if (text != "0" && text != "1")
        return false;
    value = text == "1";
    return true;
}

/// A stream would wrap a negative number around.
template <class T>
bool isNegativeUnsigned(std::istream& in) {
    if constexpr (std::is_unsigned_v<T> && !std::is_same_v<T, bool>)
        return (in >> std::ws).peek() == '-';
    return false;
}

}  // namespace

std::string formatFloat(double value, const std::ios_base& settings) {
    const std::ios_base::fmtflags formatting = std::ios_base::floatfield |
                                               std::ios_base::showpoint | std::ios_base::showpos |
                                               std::ios_base::uppercase;
    char buffer[64];
    if ((settings.flags() & formatting) == 0 && settings.precision() <= 40) {
        const std::to_chars_result result =
            std::to_chars(std::begin(buffer), std::end(buffer), value, std::chars_format::general,
                          static_cast<int>(settings.precision()));
        return std::string(buffer, result.ptr);
    }
    std::ostringstream text;
    text.imbue(std::locale::classic());
    text.flags(settings.flags());
    text.precision(settings.precision());
    text << value;
    return text.str();
}

std::string formatFloat(double value) {
    const int defaultDigits = 6;
    char buffer[32];
    const std::to_chars_result result = std::to_chars(std::begin(buffer), std::end(buffer), value,
                                                      std::chars_format::general, defaultDigits);
    return std::string(buffer, result.ptr);
}

template <class T>
void scanNumber(const std::string& text, const InTag& tag, T& value) {
    if (scanPlain(text, value))
        return;
    std::istringstream in(text);
    in.imbue(std::locale::classic());
    T scanned;
    if (isNegativeUnsigned<T>(in) || !(in >> scanned))
        return;
    value = scanned;
    tag.checkEndText(in);
}

template void scanNumber(const std::string&, const InTag&, bool&);
template void scanNumber(const std::string&, const InTag&, float&);
template void scanNumber(const std::string&, const InTag&, double&);
template void scanNumber(const std::string&, const InTag&, short&);
template void scanNumber(const std::string&, const InTag&, unsigned short&);
template void scanNumber(const std::string&, const InTag&, int&);
template void scanNumber(const std::string&, const InTag&, unsigned&);
template void scanNumber(const std::string&, const InTag&, long&);
template void scanNumber(const std::string&, const InTag&, unsigned long&);
template void scanNumber(const std::string&, const InTag&, long long&);
template void scanNumber(const std::string&, const InTag&, unsigned long long&);

}  // namespace pells::detail
