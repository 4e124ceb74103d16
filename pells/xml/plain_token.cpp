#include "pells/xml/plain_token.h"

#include <string_view>

#include "pells/xml/scan.h"

namespace pells {

namespace {

typedef XMLTokenizer::Token Token;

inline const char* skipSpace(const char* next, const char* limit) {
    return scan(next, limit, EndOfSpace());
}

/// The end of the name at `next`, null when there is none or it may go on behind `limit`.
inline const char* endOfName(const char* next, const char* limit) {
    if (next == limit || !isOf(CLASS_NAME_START, *next))
        return nullptr;
    const char* const end = scan(next + 1, limit, EndOfName());
    return end == limit ? nullptr : end;
}

inline std::string_view piece(const char* first, const char* last) {
    return std::string_view(first, static_cast<std::size_t>(last - first));
}

}  // namespace

const char* PlainToken::read(const char* next, const char* limit) {
    next = skipSpace(next, limit);
    if (limit - next < 2)
        return nullptr;
    if (*next != '<')
        return readText(next, limit);
    return next[1] == '/' ? readEndTag(next + 2, limit) : readElement(next + 1, limit);
}

inline const char* PlainToken::readText(const char* next, const char* limit) {
    const char* const end = scan(next, limit, EndOfText());
    if (end == limit || *end != '<')
        return nullptr;
    kind = Token::T_TEXT;
    text = next;
    endText = end;
    return end;
}

inline const char* PlainToken::readEndTag(const char* next, const char* limit) {
    const char* const endName = endOfName(next, limit);
    if (!endName)
        return nullptr;
    const char* const end = skipSpace(endName, limit);
    if (end == limit || *end != '>')
        return nullptr;
    kind = Token::T_CLOSE;
    text = next;
    endText = endName;
    return end + 1;
}

inline const char* PlainToken::readElement(const char* next, const char* limit) {
    const char* const endName = endOfName(next, limit);
    if (!endName)
        return nullptr;
    for (const char* at = endName; at;) {
        const char* const mark = skipSpace(at, limit);
        if (mark == limit)
            return nullptr;
        const bool isSingle = *mark == '/' && limit - mark >= 2 && mark[1] == '>';
        if (isSingle || *mark == '>') {
            kind = isSingle ? Token::T_SINGLE : Token::T_OPEN;
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
    const char* value = skipSpace(endName, limit);
    if (value == limit || *value != '=')
        return nullptr;
    value = skipSpace(value + 1, limit);
    if (value == limit || (*value != '"' && *value != '\''))
        return nullptr;
    const char quote = *value++;
    const char* const endValue = scan(value, limit, EndOfValue{quote});
    if (endValue == limit || *endValue != quote)
        return nullptr;
    attributes[attributeCount++] = {next, endName, value, endValue};
    return endValue + 1;
}

void PlainToken::getAttributes(std::vector<Token::Attribute>& list) const {
    if (attributeCount == 0)
        return;
    list.reserve(attributeCount);
    for (const Attribute* one = attributes; one != attributes + attributeCount; ++one)
        list.emplace_back(piece(one->name, one->endName), piece(one->value, one->endValue));
}

}  // namespace pells
