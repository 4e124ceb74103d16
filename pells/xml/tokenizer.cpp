#include "pells/xml/tokenizer.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <string>
#include <string_view>
#include <type_traits>

#include "pells/xml/detail/char_class.h"
#include "pells/xml/detail/plain_token.h"
#include "pells/xml/detail/scan.h"
#include "pells/xml/detail/stream_window.h"

namespace pells {

namespace {

typedef XMLTokenizer::Token Token;

std::size_t tokenLimit = std::size_t{64} * 1024 * 1024;

/// How large a token may be that is not counted exactly.
std::size_t plainLimit = 63 * tokenLimit / 64;

/// What an attribute counts for beside its characters: about what its two strings take when empty.
const std::size_t attributeCost = 64;

/// Takes the place of a string whose characters nobody wants.
struct Discard {
    void reserve(std::size_t) {}
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
/// characters are used once, and a start tag turns into an empty-element tag when its "/" comes.
/// Only a token that looked plain is read again from its start.
class XMLParser final : public XMLTokenizer::XMLParserMixin {
public:
    explicit XMLParser(std::istream& in);

    Token next() override;

    std::uint64_t getPosition() const { return window.getPosition(); }
    void setEnd(std::uint64_t position) { window.setEnd(position); }

    /// Ends the tokens. \throws XMLTokenizer::TooLarge
    [[noreturn]] void refuseSize();

private:
    [[gnu::noinline]] void readInPieces(Token& token, bool ready);
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
    bool readNumber(detail::CharClass digits, unsigned base, char& decoded);
    bool readEntity(char& decoded);

    bool at(char wanted) { return window.more() && *window.next == wanted; }
    bool atAny(unsigned char classes) {
        return window.more() && detail::isOf(classes, *window.next);
    }
    bool expect(char wanted);
    bool expect(const char* wanted);
    bool skipSpace();

    template <class Text>
    void charge(std::size_t size);
    template <class Text>
    void makeRoom(Text& text, char end);
    template <class Text, class End>
    void take(Text& into, End isEnd);

    detail::StreamWindow window;
    /// How much larger the token may become.
    std::size_t room = 0;
    /// No more tokens. Set while one is read, too, so that an exception ends them.
    bool ended = true;
    /// The text just read is the last token: what follows it is no reference.
    bool lastText = false;
};

XMLParser::XMLParser(std::istream& in) : window(in) {
    ended = !(window.attach() && window.more());
}

Token XMLParser::next() {
    const bool ready = !std::exchange(ended, true) && window.attach();
    detail::PlainToken plain;
    const char* behind = ready ? plain.read(window.next, window.limit) : nullptr;
    // What may be too large is counted exactly, in pieces.
    if (behind && static_cast<std::size_t>(behind - window.next) > plainLimit) {
        plain.forget();
        behind = nullptr;
    }
    // Made where the caller wants it, as moving tokens takes as long as reading short ones.
    Token token{plain.type(), plain.value(), {}};
    if (!behind) {
        readInPieces(token, ready);
        return token;
    }
    plain.getAttributes(token.attrs);
    window.takeTo(behind);
    window.release();
    if (window.isBehindEnd())
        window.refuseLength();
    ended = false;
    return token;
}

/// Reads a token that is not plain, or not all at hand.
void XMLParser::readInPieces(Token& token, bool ready) {
    room = tokenLimit;
    const bool found = ready && readToken(token);
    if (ready) {
        window.count();
        window.release();
    }
    if (window.isBehindEnd())
        window.refuseLength();
    ended = !found || lastText;
    if (!found) {
        token = Token();
        token.type = Token::T_EOF;
    }
}

bool XMLParser::readToken(Token& token) {
    while (token.type == Token::T_IGNORE) {
        if (skipSpace())
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
    if (!atAny(detail::CLASS_NAME_START))
        return false;
    take(token.value, detail::EndOfName());
    for (;;) {
        const bool spaced = skipSpace();
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
    if (!atAny(detail::CLASS_NAME_START))
        return false;
    // Few tags come here, and most of those have few attributes.
    if (token.attrs.empty())
        token.attrs.reserve(4);
    charge<std::string>(attributeCost);
    token.attrs.emplace_back();
    take(token.attrs.back().first, detail::EndOfName());
    return readValue(token.attrs.back().second);
}

bool XMLParser::readEndTag(Token& token) {
    ++window.next;
    if (!atAny(detail::CLASS_NAME_START))
        return false;
    take(token.value, detail::EndOfName());
    skipSpace();
    token.type = Token::T_CLOSE;
    return expect('>');
}

/// Reads up to markup, or up to an "&" that begins no reference, where the tokens end.
bool XMLParser::readText(Token& token) {
    makeRoom(token.value, '<');
    do {
        take(token.value, detail::EndOfText());
        if (!at('&'))
            break;
        char decoded = 0;
        if (!readReference(decoded)) {
            lastText = true;
            break;
        }
        charge<std::string>(1);
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
        take(nothing, detail::EndOfComment());
        if (!expect('-'))
            return false;
        if (expect('-'))
            return expect('>');
        if (!atAny(detail::CLASS_COMMENT))
            return false;
        ++window.next;
    }
}

bool XMLParser::skipDeclaration() {
    ++window.next;
    if (!expect("xml") || !skipSpace() || !skipPseudoAttribute("version"))
        return false;
    bool spaced = skipSpace();
    if (spaced && at('e')) {
        if (!skipPseudoAttribute("encoding"))
            return false;
        spaced = skipSpace();
    }
    if (spaced && at('s')) {
        if (!skipPseudoAttribute("standalone"))
            return false;
        skipSpace();
    }
    return expect("?>");
}

bool XMLParser::skipPseudoAttribute(const char* name) {
    Discard nothing;
    return expect(name) && readValue(nothing);
}

template <class Text>
bool XMLParser::readValue(Text& value) {
    skipSpace();
    if (!expect('='))
        return false;
    skipSpace();
    if (!at('"') && !at('\''))
        return false;
    const char quote = *window.next++;
    makeRoom(value, quote);
    for (;;) {
        take(value, detail::EndOfValue{quote});
        if (expect(quote))
            return true;
        char decoded = 0;
        if (!at('&') || !readReference(decoded))
            return false;
        charge<Text>(1);
        value.push_back(decoded);
    }
}

bool XMLParser::readReference(char& decoded) {
    ++window.next;
    if (!expect('#'))
        return readEntity(decoded);
    if (!expect('x'))
        return readNumber(detail::CLASS_DIGIT, 10, decoded);
    return readNumber(detail::CLASS_HEX_DIGIT, 16, decoded);
}

/// A number that 32 bits cannot hold is the largest that they can.
bool XMLParser::readNumber(detail::CharClass digits, unsigned base, char& decoded) {
    if (!atAny(digits))
        return false;
    const std::uint32_t largest = std::numeric_limits<std::uint32_t>::max();
    std::uint32_t number = 0;
    for (; atAny(digits); ++window.next) {
        const unsigned digit = digitValue(*window.next);
        number = number > (largest - digit) / base ? largest : number * base + digit;
    }
    decoded = static_cast<char>(static_cast<unsigned char>(number & 0xFF));
    return expect(';');
}

bool XMLParser::readEntity(char& decoded) {
    if (!atAny(detail::CLASS_NAME_START))
        return false;
    // One more than the longest name that means something.
    char name[5] = {};
    std::size_t size = 0;
    for (; atAny(detail::CLASS_NAME); ++window.next) {
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

/// Skips white space; false when there is none.
bool XMLParser::skipSpace() {
    if (!atAny(detail::CLASS_SPACE))
        return false;
    Discard nothing;
    take(nothing, detail::EndOfSpace());
    return true;
}

/// Counts what a text is about to gain; one that is discarded costs nothing.
template <class Text>
void XMLParser::charge(std::size_t size) {
    if constexpr (std::is_same_v<Text, std::string>) {
        if (size > room)
            refuseSize();
        room -= size;
    }
}

void XMLParser::refuseSize() {
    ended = true;
    throw XMLTokenizer::TooLarge("XML token larger than " + std::to_string(tokenLimit) + " bytes");
}

/// Makes room in an empty text for what goes up to `end`, if that is at hand. Decoding shortens it.
template <class Text>
void XMLParser::makeRoom(Text& text, char end) {
    const std::size_t size = static_cast<std::size_t>(window.limit - window.next);
    const void* const found = size != 0 ? std::memchr(window.next, end, size) : nullptr;
    if (found) {
        const char* const stop = static_cast<const char*>(found);
        text.reserve(std::min(room, static_cast<std::size_t>(stop - window.next)));
    }
}

/// Appends the characters up to one that `ends` them, in one piece if they are at hand in one.
template <class Text, class End>
void XMLParser::take(Text& into, End isEnd) {
    const char* stop = nullptr;
    do {
        stop = scan(window.next, window.limit, isEnd);
        charge<Text>(static_cast<std::size_t>(stop - window.next));
        into.append(window.next, stop);
        window.next = stop;
    } while (stop == window.limit && window.refill());
}

/// Turns into the next token where that is to stay, which saves moving it there.
struct NextToken {
    XMLParser& parser;
    operator Token() const { return parser.next(); }  // NOLINT(google-explicit-constructor)
};

}  // namespace

XMLTokenizer::TooLarge::TooLarge(const std::string& message) : std::runtime_error(message) {}

XMLTokenizer::TooLarge::~TooLarge() = default;

XMLTokenizer::XMLParserMixin::~XMLParserMixin() = default;

XMLTokenizer::XMLTokenizer(std::istream& in) {
    in.unsetf(std::ios_base::skipws);
    parser = std::make_unique<XMLParser>(in);
}

XMLTokenizer::~XMLTokenizer() = default;

std::size_t XMLTokenizer::maximumTokenSize() {
    return tokenLimit;
}

void XMLTokenizer::setMaximumTokenSize(std::size_t bytes) {
    const std::size_t margin = detail::PlainToken::mostAttributes * attributeCost;
    tokenLimit = bytes;
    plainLimit = bytes - std::min(bytes, margin);
}

std::uint64_t XMLTokenizer::getPosition() const {
    return static_cast<const XMLParser&>(*parser).getPosition();
}

XMLTokenizer::Token XMLTokenizer::getToken(std::uint64_t end) {
    XMLParser& grammar = static_cast<XMLParser&>(*parser);
    grammar.setEnd(end);
    const bool held = pending.has_value();
    Token token = held ? std::move(*pending) : grammar.next();
    if (held)
        pending.reset();
    else if (token.type == Token::T_TEXT)
        completeText(token);
    return token;
}

void XMLTokenizer::completeText(Token& text) {
    XMLParser& grammar = static_cast<XMLParser&>(*parser);
    const NextToken next{grammar};
    pending.emplace(next);
    while (pending->type == Token::T_TEXT) {
        if (text.value.size() + pending->value.size() > tokenLimit) {
            pending.reset();
            grammar.refuseSize();
        }
        text.value += pending->value;
        pending.reset();
        pending.emplace(next);
    }
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
