#include <string>
#include <utility>

#include "pells/core/no_destructor.h"
#include "pells/log/log.h"
#include "pells/serial/class_desc.h"
#include "pells/serial/composite_field.h"
#include "pells/serial/enum.h"
#include "pells/serial/serializable.h"
#include "pells/timing/performance.h"
#include "pells/xml/tag.h"

namespace pells {

namespace {

XMLTokenizer::Token nextToken(XMLTokenizer& tokenizer) {
    static const NoDestructor<Enum<PerformanceCategory>> parser("parser");
    static const NoDestructor<std::string> label("next token");
    const Performance probe(*label, parser->get());
    return tokenizer.getToken();
}

}  // namespace

/// The unrecognised elements that are open inside the element being read, innermost last.
///
/// They would each be an IgnoreField that reads its content through a tag of its own; this list is
/// all that such a tag knows, so that nesting costs no stack, and a level of it no more memory than
/// its name and one byte. That byte, which occurs in no name, comes before the name and keeps
/// whether the element around it has warned.
class OpenTag::SkippedElements {
public:
    bool empty() const { return names.empty(); }

    std::string innermost() const { return names.substr(start); }

    bool isInnermost(const std::string& name) const {
        return names.compare(start, std::string::npos, name) == 0;
    }

    void open(const std::string& name, bool outerHasWarned) {
        names += outerHasWarned ? hasWarned : hasNot;
        start = names.size();
        names += name;
    }

    /// \return what open() was told about the element around the one that is closed.
    bool close() {
        const bool outerHasWarned = names[start - 1] == hasWarned;
        names.resize(start - 1);
        start = names.empty() ? 0 : names.find_last_of(marks) + 1;
        return outerHasWarned;
    }

private:
    static constexpr char hasNot = '<';
    static constexpr char hasWarned = '!';
    static constexpr char marks[] = {hasNot, hasWarned, 0};

    std::string names;
    std::string::size_type start = 0;
};

void OpenTag::parseContents(Serializable* obj, const ClassDesc& desc) {
    if (depth > maximumDepth())
        throw Serializable::LoadFail("Malformed XML: nested too deeply");
    SkippedElements skipped;
    bool open = true;
    while (open) {
        Token token = nextToken(tokenizer);
        PELLS_LOG("load", "Processing " << token);
        open = _parseToken(token, obj, desc, skipped);
    }
}

/// \return false at the end tag of this element.
bool OpenTag::_parseToken(Token& token, Serializable* obj, const ClassDesc& desc,
                          SkippedElements& skipped) {
    const ClassDesc& known = skipped.empty() ? desc : IgnoreField::emptyDesc();
    Field* field = nullptr;
    switch (token.type) {
        case Token::T_SINGLE:
            field = known.find(token.value);
            if (field) {
                SingleTag child(*this, std::move(token));
                field->load(obj, child);
            } else {
                _showValidTags("<" + token.value + "/>", known);
            }
            return true;
        case Token::T_OPEN:
            field = known.find(token.value);
            if (field) {
                OpenTag child(*this, std::move(token));
                field->load(obj, child);
            } else {
                _showValidTags("<" + token.value + ">", known);
                skipped.open(token.value, warned);
                warned = false;
            }
            return true;
        case Token::T_TEXT:
            field = known.find("");
            if (field) {
                setText(std::move(token.value));
                field->load(obj, *this);
            }
            return true;
        default:
            return _closeElement(token, skipped);
    }
}

/// Takes the tokens that end an element, or reading altogether.
bool OpenTag::_closeElement(const Token& token, SkippedElements& skipped) {
    const bool ownTag = skipped.empty();
    if (token.type == Token::T_CLOSE &&
        (ownTag ? token.value == getName() : skipped.isInnermost(token.value))) {
        if (!ownTag)
            warned = skipped.close();
        return !ownTag;
    }
    const std::string element = ownTag ? getName() : skipped.innermost();
    if (token.type == Token::T_EOF) {
        PELLS_LOG("error", "Malformed XML! Reached EOF without seeing close </" << element << ">");
        throw Serializable::LoadFail("Malformed XML: premature EOF");
    }
    if (token.type != Token::T_CLOSE) {
        PELLS_LOG("error",
                  "Unrecognized XMLTokenizer::Token::TokenType " << static_cast<int>(token.type));
        throw Serializable::LoadFail("Unrecognized token type");
    }
    PELLS_LOG("error", "Malformed XML: <" << element << "> paired with </" << token.value << ">");
    throw Serializable::LoadFail("Malformed XML: bad close tag");
}

void OpenTag::_showValidTags(const std::string& tagText, const ClassDesc& desc) {
    PELLS_LOG("load.warn", "Unrecognized tag " << tagText);
    if (warned)
        return;
    warned = true;
    PELLS_LOG("load.warn", "    valid ones are:");
    for (const boost::intrusive_ptr<Field>& field : desc)
        PELLS_LOG("load.warn", "    <" << field->getName() << ">");
}

void SingleTag::parseContents(Serializable* obj, const ClassDesc& desc) {
    Field* const field = desc.find("");
    if (field)
        field->load(obj, *this);
}

}  // namespace pells
