#include "pells/xml/tag.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <locale>
#include <ostream>
#include <sstream>
#include <utility>
#include <vector>

#include "pells/core/no_destructor.h"
#include "pells/xml/detail/scan.h"

namespace pells {

namespace {

unsigned depthLimit = 200;
std::uint64_t documentLimit = std::uint64_t{256} * 1024 * 1024;

std::uint64_t endOfDocument(std::uint64_t start) {
    const std::uint64_t most = std::numeric_limits<std::uint64_t>::max();
    return start + std::min(documentLimit, most - start);
}

}  // namespace

Tag::~Tag() = default;

const std::string& Tag::getAttr(const std::string& attrName) const {
    static const NoDestructor<std::string> none;
    const std::string* const value = attrs.find(attrName);
    return value ? *value : *none;
}

void Tag::setAttr(const std::string& attrName, std::string value) {
    attrs.set(attrName, std::move(value));
}

InTag::InTag(XMLTokenizer& source)
    : tokenizer(source), documentEnd(endOfDocument(source.getPosition())) {}

InTag::InTag(const InTag& other)
    : Tag(other),
      tokenizer(other.tokenizer),
      depth(other.depth),
      documentEnd(other.documentEnd),
      text(other.text),
      version(other.version) {}

InTag::InTag(const ChildOf& family)
    : tokenizer(family.parent.tokenizer),
      depth(family.parent.depth + 1),
      documentEnd(family.parent.documentEnd),
      version(family.parent.version) {}

InTag::~InTag() = default;

std::istringstream& InTag::textStream() {
    if (!scanner) {
        scanner = std::make_unique<std::istringstream>(text, std::ios_base::in);
        scanner->imbue(std::locale::classic());
    }
    return *scanner;
}

unsigned InTag::maximumDepth() {
    return depthLimit;
}

void InTag::setMaximumDepth(unsigned levels) {
    depthLimit = levels;
}

std::uint64_t InTag::maximumDocumentSize() {
    return documentLimit;
}

void InTag::setMaximumDocumentSize(std::uint64_t bytes) {
    documentLimit = bytes;
}

void InTag::setData(const Token& token) {
    setData(Token(token));
}

void InTag::setData(Token&& token) {
    if (token.type == Token::T_TEXT) {
        name.clear();
        attrs.clear();
        setText(std::move(token.value));
    } else {
        name = std::move(token.value);
        if (!token.attrs.empty() || !attrs.empty())
            attrs.assign(std::move(token.attrs));
        if (!text.empty() || scanner)
            setText(std::string());
    }
}

void InTag::setText(std::string&& newText) {
    text = std::move(newText);
    scanner.reset();
}

OpenTag::OpenTag(XMLTokenizer& source, const Token& token) : InTag(source) {
    setData(token);
}

OpenTag::OpenTag(InTag& parent, const Token& token) : InTag(ChildOf{parent}) {
    setData(token);
}

OpenTag::OpenTag(InTag& parent, Token&& token) : InTag(ChildOf{parent}) {
    setData(std::move(token));
}

OpenTag::~OpenTag() = default;

SingleTag::SingleTag(XMLTokenizer& source, const Token& token) : InTag(source) {
    setData(token);
}

SingleTag::SingleTag(InTag& parent, const Token& token) : InTag(ChildOf{parent}) {
    setData(token);
}

SingleTag::SingleTag(InTag& parent, Token&& token) : InTag(ChildOf{parent}) {
    setData(std::move(token));
}

SingleTag::~SingleTag() = default;

OutTag::OutTag(std::ostream& stream, const std::string& tagName) : out(stream) {
    name = tagName;
}

OutTag::OutTag(OutTag& outer)
    : Tag(outer), out(outer.out), parent(&outer), depth(outer.depth + 1) {}

OutTag::OutTag(OutTag& outer, const std::string& tagName)
    : out(outer.out), parent(&outer), depth(outer.depth + 1) {
    name = tagName;
}

OutTag::~OutTag() = default;

std::string OutTag::getPath() const {
    std::vector<const std::string*> names;
    for (const OutTag* each = this; each; each = each->parent)
        names.push_back(&each->name);
    std::string path = *names.back();
    for (auto each = names.rbegin() + 1; each != names.rend(); ++each)
        path += '/' + **each;
    return path;
}

void OutTag::setTag(const std::string& tagName) {
    name = tagName;
}

void OutTag::clearAttrs() {
    attrs.clear();
}

/// Collects pieces of text, and writes them to the stream together.
class OutTag::Line {
public:
    explicit Line(std::ostream& stream) : out(stream) {}
    Line(const Line&) = delete;
    Line& operator=(const Line&) = delete;

    Line& append(const char* text, std::size_t length) {
        if (length > sizeof pieces - used) {
            flush();
            if (length > sizeof pieces) {
                out.write(text, static_cast<std::streamsize>(length));
                return *this;
            }
        }
        std::memcpy(pieces + used, text, length);
        used += length;
        return *this;
    }

    Line& append(const std::string& text) { return append(text.data(), text.size()); }

    template <std::size_t size>
    Line& append(const char (&text)[size]) {
        return append(text, size - 1);
    }

    Line& appendSpaces(std::size_t count) {
        static const char spaces[] = "                                ";
        for (std::size_t piece; count != 0; count -= piece) {
            piece = std::min(count, sizeof spaces - 1);
            append(spaces, piece);
        }
        return *this;
    }

    Line& appendEscaped(const std::string& text) {
        const detail::EndOfValue isSpecial{'"'};
        const char* done = text.data();
        const char* const end = done + text.size();
        for (const char* at; (at = scan(done, end, isSpecial)) != end; done = at + 1) {
            append(done, static_cast<std::size_t>(at - done));
            *at == '<' ? append("&lt;") : *at == '&' ? append("&amp;") : append("&quot;");
        }
        return append(done, static_cast<std::size_t>(end - done));
    }

    void flush() {
        out.write(pieces, static_cast<std::streamsize>(used));
        used = 0;
    }

private:
    std::ostream& out;
    std::size_t used = 0;
    char pieces[512];
};

void OutTag::writeOpenTag(bool newline) {
    Line line(out);
    line.appendSpaces(indent()).append("<");
    appendTagAndAttrs(line);
    line.append(">\n", newline ? 2 : 1).flush();
}

void OutTag::writeCloseTag(bool indented) {
    Line line(out);
    line.appendSpaces(indented ? indent() : 0).append("</").append(name).append(">\n").flush();
}

void OutTag::writeSingleTag() {
    Line line(out);
    line.appendSpaces(indent()).append("<");
    appendTagAndAttrs(line);
    line.append("/>\n").flush();
}

void OutTag::writeText(const std::string& text) {
    Line(out).appendEscaped(text).flush();
}

void OutTag::writeTagAndAttrs() {
    Line line(out);
    appendTagAndAttrs(line);
    line.flush();
}

void OutTag::appendTagAndAttrs(Line& line) const {
    line.append(name);
    for (const auto& attr : attrs) {
        line.append(" ").append(attr.first).append("=\"");
        line.appendEscaped(attr.second).append("\"");
    }
}

}  // namespace pells
