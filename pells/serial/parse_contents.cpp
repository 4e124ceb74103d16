#include <cstdint>
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

/// \param end of the document at the latest, see XMLTokenizer::getToken().
XMLTokenizer::Token nextToken(XMLTokenizer& tokenizer, std::uint64_t end) {
    static const NoDestructor<Enum<PerformanceCategory>> parser("parser");
    static const NoDestructor<std::string> label("next token");
    const Performance probe(*label, parser->get());
    try {
        return tokenizer.getToken(end);
    } catch (const XMLTokenizer::TooLarge& reason) {
        throw Serializable::LoadFail(reason.what());
    }
}

}  // namespace

/// The unrecognised elements that are open inside the element being read, innermost last.
///
/// They would each be an IgnoreField that reads its content through a tag of its own; this list is
/// all that such a tag knows, so that nesting costs no stack, and a level of it no more memory than
/// its name and, unless that is long, one byte. Behind each name stands its length, and whether the
/// element around it has warned, as a number that is read from its end: the innermost name is
/// found at once, however long the names around it are.
class OpenTag::SkippedElements {
public:
    bool empty() const { return names.empty(); }

    std::string innermost() const { return names.substr(start, length); }

    bool isInnermost(const std::string& name) const {
        return names.compare(start, length, name) == 0;
    }

    void open(const std::string& name, bool outerHasWarned) {
        start = names.size();
        length = name.size();
        hasOuterWarned = outerHasWarned;
        names += name;
        appendNumber(2 * std::uint64_t{length} + (outerHasWarned ? 1 : 0));
    }

    /// \return what open() was told about the element around the one that is closed.
    bool close() {
        const bool outerHasWarned = hasOuterWarned;
        names.resize(start);
        if (!names.empty())
            findInnermost();
        return outerHasWarned;
    }

private:
    static constexpr unsigned digitBits = 7;
    static constexpr unsigned digitMask = (1U << digitBits) - 1;
    /// Marks a digit that others stand before.
    static constexpr unsigned hasHigher = 1U << digitBits;

    void appendNumber(std::uint64_t number) {
        unsigned shift = 0;
        while (number >> shift > digitMask)
            shift += digitBits;
        for (unsigned higher = 0;; shift -= digitBits, higher = hasHigher) {
            names += static_cast<char>((number >> shift & digitMask) | higher);
            if (shift == 0)
                return;
        }
    }

    void findInnermost() {
        std::uint64_t number = 0;
        std::string::size_type at = names.size();
        unsigned digit = hasHigher;
        for (unsigned shift = 0; (digit & hasHigher) != 0; shift += digitBits) {
            digit = static_cast<unsigned char>(names[--at]);
            number |= std::uint64_t{digit & digitMask} << shift;
        }
        hasOuterWarned = (number & 1) != 0;
        length = static_cast<std::string::size_type>(number / 2);
        start = at - length;
    }

    std::string names;
    std::string::size_type start = 0;
    std::string::size_type length = 0;
    bool hasOuterWarned = false;
};

void OpenTag::parseContents(Serializable* obj, const ClassDesc& desc) {
    if (depth > maximumDepth())
        throw Serializable::LoadFail("Malformed XML: nested too deeply");
    SkippedElements skipped;
    bool open = true;
    while (open) {
        Token token = nextToken(tokenizer, documentEnd);
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

void InTag::checkEndText(std::istream& in) const {
    for (char c; in.get(c);) {
        if (!std::isspace(c, std::locale::classic()))
            throw Serializable::LoadFail("Failed to scan text value");
    }
}

}  // namespace pells
