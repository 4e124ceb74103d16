#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "pells/xml/tokenizer.h"

namespace pells {

/// A token that needs no decoding, as a view of characters that are all at hand: a tag or character
/// data without references, with few attributes.
///
/// This is all that most documents consist of, so it is worth a reading of its own, in one go and
/// without asking the stream.
class PlainToken {
public:
    /// Reads from `next`, and white space before it.
    ///
    /// \return the place behind the token; null when the characters begin with something else, or
    ///         the token may go on behind `limit`. Then it stays one of type T_IGNORE.
    const char* read(const char* next, const char* limit);

    XMLTokenizer::Token::TokenType type() const { return kind; }

    /// A tag's name, or character data; empty before a token was read.
    std::string value() const { return std::string(text, endText); }

    /// Fills a list that is empty, with one allocation for the list.
    void getAttributes(std::vector<XMLTokenizer::Token::Attribute>& list) const;

private:
    struct Attribute {
        const char* name;
        const char* endName;
        const char* value;
        const char* endValue;
    };

    const char* readElement(const char* next, const char* limit);
    const char* readEndTag(const char* next, const char* limit);
    const char* readText(const char* next, const char* limit);
    const char* readAttribute(const char* next, const char* limit);

    XMLTokenizer::Token::TokenType kind = XMLTokenizer::Token::T_IGNORE;
    const char* text = nullptr;
    const char* endText = nullptr;

    static const std::size_t mostAttributes = 16;
    std::size_t attributeCount = 0;
    /// Not filled in advance, which would cost more than most tags do.
    Attribute attributes[mostAttributes];
};

}  // namespace pells
