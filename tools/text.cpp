#include "tools/text.h"

#include <cstddef>

namespace pells_tool {

namespace {

const char replacementCharacter[] = "\xEF\xBF\xBD";

unsigned byteAt(const std::string& text, std::size_t at) {
    return at < text.size() ? static_cast<unsigned char>(text[at]) : 0;
}

/// The length of the UTF-8 sequence (RFC 3629) at a position; 0 when there is none.
std::size_t sequenceLength(const std::string& text, std::size_t at) {
    const unsigned lead = byteAt(text, at);
    if (lead < 0x80)
        return 1;
    if (lead < 0xC2 || lead > 0xF4)
        return 0;
    const std::size_t length = lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    // The second byte excludes overlong forms, surrogates and what lies beyond U+10FFFF.
    const unsigned second = byteAt(text, at + 1);
    const unsigned lowest = lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
    const unsigned highest = lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
    if (second < lowest || second > highest)
        return 0;
    for (std::size_t i = 2; i < length; ++i) {
        if ((byteAt(text, at + i) & 0xC0) != 0x80)
            return 0;
    }
    return length;
}

}  // namespace

std::string printable(const std::string& text) {
    const char digits[] = "0123456789abcdef";
    std::string result;
    for (const char c : text) {
        const unsigned byte = static_cast<unsigned char>(c);
        if (byte >= 0x20 && byte != 0x7F)
            result += c;
        else
            result += {'\\', 'x', digits[byte / 16], digits[byte % 16]};
    }
    return result;
}

std::string printableUtf8(const std::string& text) {
    const std::string clean = printable(text);
    std::string result;
    for (std::size_t at = 0; at < clean.size();) {
        const std::size_t length = sequenceLength(clean, at);
        result += length != 0 ? clean.substr(at, length) : replacementCharacter;
        at += length != 0 ? length : 1;
    }
    return result;
}

std::string counted(std::size_t number, const std::string& singular) {
    return std::to_string(number) + " " + singular + (number == 1 ? "" : "s");
}

}  // namespace pells_tool
