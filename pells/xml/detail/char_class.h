#pragma once

namespace pells::detail {

/// The classes of bytes that XML text is made of.
enum CharClass : unsigned char {
    CLASS_SPACE = 1,
    CLASS_NAME_START = 2,
    CLASS_DIGIT = 4,
    CLASS_HEX_DIGIT = 8,
    CLASS_NAME = CLASS_NAME_START | CLASS_DIGIT,
    CLASS_COMMENT = 16  ///< what comments consist of, hyphens excluded
};

struct CharClassTable {
    constexpr CharClassTable() : classes() {
        for (int byte = 0; byte < 256; ++byte)
            classes[byte] = classesOf(byte);
    }

    static constexpr unsigned char classesOf(int byte) {
        const bool digit = byte >= '0' && byte <= '9';
        const bool letter = (byte >= 'A' && byte <= 'Z') || (byte >= 'a' && byte <= 'z');
        const bool hexLetter = (byte >= 'A' && byte <= 'F') || (byte >= 'a' && byte <= 'f');
        const bool space = byte == '\t' || byte == '\n' || byte == '\r' || byte == ' ';
        return static_cast<unsigned char>(
            (space ? CLASS_SPACE : 0) |
            (letter || byte == '_' || byte == '-' ? CLASS_NAME_START : 0) |
            (digit ? CLASS_DIGIT : 0) | (digit || hexLetter ? CLASS_HEX_DIGIT : 0) |
            ((space || byte > ' ') && byte != '-' ? CLASS_COMMENT : 0));
    }

    unsigned char classes[256];
};

constexpr CharClassTable charClassTable;

/// Whether a character belongs to one of the classes.
inline bool isOf(unsigned char classes, char character) {
    return (charClassTable.classes[static_cast<unsigned char>(character)] & classes) != 0;
}

}  // namespace pells::detail
