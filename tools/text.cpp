#include "tools/text.h"

#include <algorithm>
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

/// The character of a valid sequence.
unsigned codePoint(const std::string& sequence) {
    const unsigned lead = byteAt(sequence, 0);
    if (sequence.size() == 1)
        return lead;
    unsigned code = lead & (0xFFU >> (sequence.size() + 1));
    for (std::size_t i = 1; i < sequence.size(); ++i)
        code = code << 6 | (byteAt(sequence, i) & 0x3F);
    return code;
}

/// Control characters, C1 among them, breaks of lines and paragraphs, and what turns the direction
/// of the text around it.
bool misleadsTerminal(unsigned code) {
    return code < 0x20 || (code >= 0x7F && code < 0xA0) || code == 0x2028 || code == 0x2029 ||
           (code >= 0x202A && code <= 0x202E) || (code >= 0x2066 && code <= 0x2069) ||
           code == 0xFEFF;
}

/// \param length of the UTF-8 sequence, 0 for a byte that is none: terminals with other encodings
///               take the lower half of those for control characters.
bool isHarmless(const std::string& piece, std::size_t length) {
    return length == 0 ? byteAt(piece, 0) >= 0xA0 : !misleadsTerminal(codePoint(piece));
}

std::string escaped(const std::string& bytes) {
    const char digits[] = "0123456789abcdef";
    std::string result;
    for (const char c : bytes) {
        const unsigned byte = static_cast<unsigned char>(c);
        result += {'\\', 'x', digits[byte / 16], digits[byte % 16]};
    }
    return result;
}

}  // namespace

std::string printable(const std::string& text) {
    std::string result;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t length = sequenceLength(text, at);
        const std::string piece = text.substr(at, std::max<std::size_t>(length, 1));
        result += isHarmless(piece, length) ? piece : escaped(piece);
        at += piece.size();
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
