#include "pells/xml/tokenizer.h"

#include <algorithm>
#include <limits>
#include <string_view>

#include "pells/xml/char_class.h"
#include "pells/xml/stream_window.h"

namespace pells {

namespace {

typedef XMLTokenizer::Token Token;

/// Takes the place of a string whose characters nobody wants.
struct Discard {
    void append(const char*, const char*) {}
    void push_back(char) {}
};

unsigned digitValue(char digit) {
    if (digit <= '9')
        return static_cast<unsigned>(digit - '0');
    return static_cast<unsigned>((digit | 0x20) - 'a') + 10;
}

char entity(std::string_view name) {
    constexpr std::pair<std::string_view, char> entities[] = {
        {"amp", '&'}, {"lt", '<'}, {"gt", '>'}, {"apos", '\''}, {"quot", '"'}};
    for (const auto& [known, character] : entities) {
        if (name == known)
            return character;
    }
    return '?';
}

const char* typeName(Token::TokenType type) {
    switch (type) {
        case Token::T_IGNORE:
            return "T_IGNORE";
        case Token::T_SINGLE:
            return "T_SINGLE";
        case Token::T_OPEN:
            return "T_OPEN";
        case Token::T_CLOSE:
            return "T_CLOSE";
        case Token::T_TEXT:
            return "T_TEXT";
        case Token::T_EOF:
            return "T_EOF";
    }
    return "**bad**";
}

/// The grammar, written out by hand.
///
/// One character always tells which way to go on, and the place where no way leads on is final. So
/// nothing is read twice, and a start tag turns into an empty-element tag when its "/" comes.
class XMLParser final : public XMLTokenizer::XMLParserMixin {
public:
    explicit XMLParser(std::istream& in);

    Token next() override;

private:
    bool readToken(Token& token);
    bool readMarkup(Token& token);
    bool readElement(Token& token);
    bool readAttribute(Token& token);
    bool readEndTag(Token& token);
    bool readText(Token& token);

    bool skipComment();
    bool skipDeclaration();
    bool skipPseudoAttribute(const char* name);

    template <class Text>
    bool readValue(Text& value);
    bool readReference(char& decoded);
    bool readNumber(CharClass digits, unsigned base, char& decoded);
    bool readEntity(char& decoded);

    bool at(char wanted) { return window.more() && *window.next == wanted; }
    bool atAny(unsigned char classes) { return window.more() && isOf(classes, *window.next); }
    bool expect(char wanted);
    bool expect(const char* wanted);
    bool skip(unsigned char classes);

    template <class Text, class Ends>
    void take(Text& into, Ends ends);

    StreamWindow window;
    /// No more tokens. Set while one is read, too, so that an exception ends them.
    bool ended = true;
    /// The text just read is the last token: what follows it is no reference.
    bool lastText = false;
};

XMLParser::XMLParser(std::istream& in) : window(in) {
    ended = !(window.attach() && window.more());
}

Token XMLParser::next() {
    Token token;
    if (!ended) {
        ended = true;
        if (window.attach()) {
            const bool found = readToken(token);
            window.release();
            ended = !found;
        }
    }
    if (ended) {
        token = Token();
        token.type = Token::T_EOF;
    }
    ended = ended || lastText;
    return token;
}

bool XMLParser::readToken(Token& token) {
    while (token.type == Token::T_IGNORE) {
        if (skip(CLASS_SPACE))
            continue;
        if (!window.more() || !(*window.next == '<' ? readMarkup(token) : readText(token)))
            return false;
    }
    return true;
}

bool XMLParser::readMarkup(Token& token) {
    ++window.next;
    if (!window.more())
        return false;
    switch (*window.next) {
        case '/':
            return readEndTag(token);
        case '!':
            return skipComment();
        case '?':
            return skipDeclaration();
        default:
            return readElement(token);
    }
}

bool XMLParser::readElement(Token& token) {
    if (!atAny(CLASS_NAME_START))
        return false;
    take(token.value, [](char c) { return !isOf(CLASS_NAME, c); });
    for (;;) {
        const bool spaced = skip(CLASS_SPACE);
        if (expect('>')) {
            token.type = Token::T_OPEN;
            return true;
        }
        if (expect('/')) {
            token.type = Token::T_SINGLE;
            return expect('>');
        }
        if (!spaced || !readAttribute(token))
            return false;
    }
}

bool XMLParser::readAttribute(Token& token) {
    if (!atAny(CLASS_NAME_START))
        return false;
    token.attrs.emplace_back();
    take(token.attrs.back().first, [](char c) { return !isOf(CLASS_NAME, c); });
    return readValue(token.attrs.back().second);
}

bool XMLParser::readEndTag(Token& token) {
    ++window.next;
    if (!atAny(CLASS_NAME_START))
        return false;
    take(token.value, [](char c) { return !isOf(CLASS_NAME, c); });
    skip(CLASS_SPACE);
    token.type = Token::T_CLOSE;
    return expect('>');
}

/// Reads up to markup, or up to an "&" that begins no reference, where the tokens end.
bool XMLParser::readText(Token& token) {
    do {
        take(token.value, [](char c) { return c == '<' || c == '&'; });
        if (!at('&'))
            break;
        char decoded = 0;
        if (!readReference(decoded)) {
            lastText = true;
            break;
        }
        token.value.push_back(decoded);
    } while (window.more() && *window.next != '<');
    token.type = Token::T_TEXT;
    return !token.value.empty();
}

/// A hyphen takes the next character with it, whatever that is but another hyphen.
bool XMLParser::skipComment() {
    ++window.next;
    if (!expect("--"))
        return false;
    Discard nothing;
    for (;;) {
        take(nothing, [](char c) { return !isOf(CLASS_COMMENT, c); });
        if (!expect('-'))
            return false;
        if (expect('-'))
            return expect('>');
        if (!atAny(CLASS_COMMENT))
            return false;
        ++window.next;
    }
}

bool XMLParser::skipDeclaration() {
    ++window.next;
    if (!expect("xml") || !skip(CLASS_SPACE) || !skipPseudoAttribute("version"))
        return false;
    bool spaced = skip(CLASS_SPACE);
    if (spaced && at('e')) {
        if (!skipPseudoAttribute("encoding"))
            return false;
        spaced = skip(CLASS_SPACE);
    }
    if (spaced && at('s')) {
        if (!skipPseudoAttribute("standalone"))
            return false;
        skip(CLASS_SPACE);
    }
    return expect("?>");
}

bool XMLParser::skipPseudoAttribute(const char* name) {
    Discard nothing;
    return expect(name) && readValue(nothing);
}

template <class Text>
bool XMLParser::readValue(Text& value) {
    skip(CLASS_SPACE);
    if (!expect('='))
        return false;
    skip(CLASS_SPACE);
    if (!at('"') && !at('\''))
        return false;
    const char quote = *window.next++;
    for (;;) {
        take(value, [quote](char c) { return c == quote || c == '<' || c == '&'; });
        if (expect(quote))
            return true;
        char decoded = 0;
        if (!at('&') || !readReference(decoded))
            return false;
        value.push_back(decoded);
    }
}

bool XMLParser::readReference(char& decoded) {
    ++window.next;
    if (!expect('#'))
        return readEntity(decoded);
    if (!expect('x'))
        return readNumber(CLASS_DIGIT, 10, decoded);
    return readNumber(CLASS_HEX_DIGIT, 16, decoded);
}

/// Digits give the same number as they give std::strtoul().
bool XMLParser::readNumber(CharClass digits, unsigned base, char& decoded) {
    if (!atAny(digits))
        return false;
    const unsigned long largest = std::numeric_limits<unsigned long>::max();
    unsigned long number = 0;
    for (; atAny(digits); ++window.next) {
        const unsigned digit = digitValue(*window.next);
        number = number > (largest - digit) / base ? largest : number * base + digit;
    }
    decoded = static_cast<char>(static_cast<unsigned char>(number & 0xFF));
    return expect(';');
}

bool XMLParser::readEntity(char& decoded) {
    if (!atAny(CLASS_NAME_START))
        return false;
    // One more than the longest name that means something.
    char name[5] = {};
    std::size_t size = 0;
    for (; atAny(CLASS_NAME); ++window.next) {
        if (size < sizeof name)
            name[size++] = *window.next;
    }
    decoded = entity(std::string_view(name, size));
    return expect(';');
}

bool XMLParser::expect(char wanted) {
    const bool found = at(wanted);
    if (found)
        ++window.next;
    return found;
}

bool XMLParser::expect(const char* wanted) {
    while (*wanted != '\0' && expect(*wanted))
        ++wanted;
    return *wanted == '\0';
}

/// Skips characters of the classes; false when there are none.
bool XMLParser::skip(unsigned char classes) {
    if (!atAny(classes))
        return false;
    Discard nothing;
    take(nothing, [classes](char c) { return !isOf(classes, c); });
    return true;
}

/// Appends the characters up to one that `ends` them, in one piece if they are at hand in one.
template <class Text, class Ends>
void XMLParser::take(Text& into, Ends ends) {
    const char* stop = nullptr;
    do {
        stop = std::find_if(window.next, window.limit, ends);
        into.append(window.next, stop);
        window.next = stop;
    } while (stop == window.limit && window.refill());
}

}  // namespace

XMLTokenizer::XMLParserMixin::~XMLParserMixin() = default;

XMLTokenizer::XMLTokenizer(std::istream& in) {
    in.unsetf(std::ios_base::skipws);
    parser = std::make_unique<XMLParser>(in);
}

XMLTokenizer::~XMLTokenizer() = default;

XMLTokenizer::Token XMLTokenizer::getToken() {
    if (pending.type != Token::T_IGNORE)
        return std::exchange(pending, Token());
    Token token = parser->next();
    if (token.type == Token::T_TEXT) {
        Token follower = parser->next();
        for (; follower.type == Token::T_TEXT; follower = parser->next())
            token.value += follower.value;
        pending = std::move(follower);
    }
    return token;
}

std::ostream& operator<<(std::ostream& out, const XMLTokenizer::Token& token) {
    out << "Token: " << std::to_string(token.type) << " (" << typeName(token.type) << ") ";
    switch (token.type) {
        case Token::T_SINGLE:
        case Token::T_OPEN:
            out << '<' << token.value;
            for (const Token::Attribute& attr : token.attrs)
                out << ' ' << attr.first << "=\"" << attr.second << '"';
            return out << (token.type == Token::T_SINGLE ? "/>" : ">");
        case Token::T_CLOSE:
            return out << "</" << token.value << '>';
        case Token::T_TEXT:
            return out << '"' << token.value << '"';
        default:
            return out << token.value;
    }
}

}  // namespace pells
