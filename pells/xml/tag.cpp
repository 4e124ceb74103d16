#include "pells/xml/tag.h"

#include <locale>
#include <utility>

#include "pells/serial/serializable.h"

namespace pells {

namespace {

const std::size_t indentStep = 4;

unsigned depthLimit = 200;

void appendEscaped(std::string& line, const std::string& text) {
    std::string::size_type done = 0;
    for (;;) {
        const std::string::size_type special = text.find_first_of("<&\"", done);
        line.append(text, done, special - done);
        if (special == std::string::npos)
            return;
        line += text[special] == '<' ? "&lt;" : text[special] == '&' ? "&amp;" : "&quot;";
        done = special + 1;
    }
}

}  // namespace

Tag::~Tag() = default;

std::string Tag::getAttr(const std::string& attrName) const {
    const std::string* const value = attrs.find(attrName);
    return value ? *value : std::string();
}

void Tag::setAttr(const std::string& attrName, const std::string& value) {
    attrs.set(attrName, value);
}

InTag::InTag(XMLTokenizer& source) : tokenizer(source) {}

InTag::InTag(const InTag& other)
    : Tag(other),
      tokenizer(other.tokenizer),
      depth(other.depth),
      text(other.text),
      version(other.version) {}

InTag::InTag(const ChildOf& family)
    : tokenizer(family.parent.tokenizer),
      depth(family.parent.depth + 1),
      version(family.parent.version) {}

InTag::~InTag() = default;

std::istringstream& InTag::textStream() {
    if (!scanner) {
        scanner = std::make_unique<std::istringstream>(text, std::ios_base::in);
        scanner->imbue(std::locale::classic());
    }
    return *scanner;
}

void InTag::checkEndText(std::istream& in) const {
    for (char c; in.get(c);) {
        if (!std::isspace(c, std::locale::classic()))
            throw Serializable::LoadFail("Failed to scan text value");
    }
}

unsigned InTag::maximumDepth() {
    return depthLimit;
}

void InTag::setMaximumDepth(unsigned levels) {
    depthLimit = levels;
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
        attrs.assign(std::move(token.attrs));
        setText(std::string());
    }
}

void InTag::setText(std::string newText) {
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

OutTag::OutTag(OutTag& parent) : Tag(parent), out(parent.out), indent(parent.indent + indentStep) {}

OutTag::OutTag(OutTag& parent, const std::string& tagName)
    : out(parent.out), indent(parent.indent + indentStep) {
    name = tagName;
}

OutTag::~OutTag() = default;

void OutTag::setTag(const std::string& tagName) {
    name = tagName;
}

void OutTag::clearAttrs() {
    attrs.clear();
}

void OutTag::writeOpenTag(bool newline) {
    std::string line(indent, ' ');
    line += '<';
    appendTagAndAttrs(line);
    line += newline ? ">\n" : ">";
    write(line);
}

void OutTag::writeCloseTag(bool indented) {
    std::string line(indented ? indent : 0, ' ');
    line += "</";
    line += name;
    line += ">\n";
    write(line);
}

void OutTag::writeSingleTag() {
    std::string line(indent, ' ');
    line += '<';
    appendTagAndAttrs(line);
    line += "/>\n";
    write(line);
}

void OutTag::writeText(const std::string& text) {
    std::string escaped;
    appendEscaped(escaped, text);
    write(escaped);
}

void OutTag::writeTagAndAttrs() {
    std::string piece;
    appendTagAndAttrs(piece);
    write(piece);
}

void OutTag::appendTagAndAttrs(std::string& line) const {
    line += name;
    for (const auto& attr : attrs) {
        line += ' ';
        line += attr.first;
        line += "=\"";
        appendEscaped(line, attr.second);
        line += '"';
    }
}

void OutTag::write(const std::string& line) {
    out.write(line.data(), static_cast<std::streamsize>(line.size()));
}

}  // namespace pells
