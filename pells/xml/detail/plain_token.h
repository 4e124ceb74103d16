#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "pells/xml/detail/scan.h"
#include "pells/xml/tokenizer.h"

namespace pells::detail {

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

    /// Makes it as it was before a token was read.
    void forget() {
        kind = XMLTokenizer::Token::T_IGNORE;
        text = endText = nullptr;
    }

    XMLTokenizer::Token::TokenType type() const { return kind; }

    static const std::size_t mostAttributes = 16;

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

    static const char* endOfName(const char* next, const char* limit);
    static std::string_view piece(const char* first, const char* last);

    const char* readElement(const char* next, const char* limit);
    const char* readEndTag(const char* next, const char* limit);
    const char* readText(const char* next, const char* limit);
    const char* readAttribute(const char* next, const char* limit);

    XMLTokenizer::Token::TokenType kind = XMLTokenizer::Token::T_IGNORE;
    const char* text = nullptr;
    const char* endText = nullptr;

    std::size_t attributeCount = 0;
    /// Not filled in advance, which would cost more than most tags do.
    Attribute attributes[mostAttributes];
};

// Defined here, so that the one function that reads tokens holds all of it.

inline const char* PlainToken::read(const char* next, const char* limit) {
    next = scanSpace(next, limit);
    if (limit - next < 2)
        return nullptr;
    if (*next != '<')
        return readText(next, limit);
    return next[1] == '/' ? readEndTag(next + 2, limit) : readElement(next + 1, limit);
}

/// The end of the name at `next`, null when there is none or it may go on behind `limit`.
inline const char* PlainToken::endOfName(const char* next, const char* limit) {
    if (next == limit || !isOf(CLASS_NAME_START, *next))
        return nullptr;
    const char* const end = scan(next + 1, limit, EndOfName());
    return end == limit ? nullptr : end;
}

inline std::string_view PlainToken::piece(const char* first, const char* last) {
    return std::string_view(first, static_cast<std::size_t>(last - first));
}

inline const char* PlainToken::readText(const char* next, const char* limit) {
    const char* const end = scan(next, limit, EndOfText());
    if (end == limit || *end != '<')
        return nullptr;
    kind = XMLTokenizer::Token::T_TEXT;
    text = next;
    endText = end;
    return end;
}

inline const char* PlainToken::readEndTag(const char* next, const char* limit) {
    const char* const endName = endOfName(next, limit);
    if (!endName)
        return nullptr;
    const char* const end = scanSpace(endName, limit);
    if (end == limit || *end != '>')
        return nullptr;
    kind = XMLTokenizer::Token::T_CLOSE;
    text = next;
    endText = endName;
    return end + 1;
}

inline const char* PlainToken::readElement(const char* next, const char* limit) {
    const char* const endName = endOfName(next, limit);
    if (!endName)
        return nullptr;
    for (const char* at = endName; at;) {
        const char* const mark = scanSpace(at, limit);
        if (mark == limit)
            return nullptr;
        const bool isSingle = *mark == '/' && limit - mark >= 2 && mark[1] == '>';
        if (isSingle || *mark == '>') {
            kind = isSingle ? XMLTokenizer::Token::T_SINGLE : XMLTokenizer::Token::T_OPEN;
            text = next;
            endText = endName;
            return mark + (isSingle ? 2 : 1);
        }
        at = mark != at ? readAttribute(mark, limit) : nullptr;
    }
    return nullptr;
}

inline const char* PlainToken::readAttribute(const char* next, const char* limit) {
    const char* const endName = endOfName(next, limit);
    if (!endName || attributeCount == mostAttributes)
        return nullptr;
    const char* value = scanSpace(endName, limit);
    if (value == limit || *value != '=')
        return nullptr;
    value = scanSpace(value + 1, limit);
    if (value == limit || (*value != '"' && *value != '\''))
        return nullptr;
    const char quote = *value++;
    const char* const endValue = scan(value, limit, EndOfValue{quote});
    if (endValue == limit || *endValue != quote)
        return nullptr;
    attributes[attributeCount++] = {next, endName, value, endValue};
    return endValue + 1;
}

inline void PlainToken::getAttributes(std::vector<XMLTokenizer::Token::Attribute>& list) const {
    if (attributeCount == 0)
        return;
    list.reserve(attributeCount);
    for (const Attribute* one = attributes; one != attributes + attributeCount; ++one)
        list.emplace_back(piece(one->name, one->endName), piece(one->value, one->endValue));
}

}  // namespace pells::detail
