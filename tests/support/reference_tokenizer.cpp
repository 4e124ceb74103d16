#include "support/reference_tokenizer.h"

#include <boost/spirit/include/classic_chset.hpp>
#include <boost/spirit/include/classic_core.hpp>
#include <cstdlib>

namespace pells_test {

namespace classic = boost::spirit::classic;
using pells::XMLTokenizer;

namespace {

typedef classic::chset<unsigned char> CharSet;
typedef XMLTokenizer::Token Token;

/// Spirit calls an action with the character or the range that matched; `function` wants a string.
template <class Function>
class Action {
public:
    explicit Action(Function f) : function(f) {}
    void operator()(unsigned char c) const { function(std::string(1, static_cast<char>(c))); }
    template <class Position>
    void operator()(const Position& first, const Position& last) const {
        function(std::string(first, last));
    }

private:
    Function function;
};

template <class Function>
Action<Function> action(Function function) {
    return Action<Function>(function);
}

char namedEntity(const std::string& name) {
    return name == "amp"    ? '&'
           : name == "lt"   ? '<'
           : name == "gt"   ? '>'
           : name == "apos" ? '\''
           : name == "quot" ? '"'
                            : '?';
}

char numberedEntity(const std::string& digits, int base) {
    return static_cast<char>(
        static_cast<unsigned char>(std::strtoul(digits.c_str(), nullptr, base)));
}

}  // namespace

/// "!" means optional in this parser library.
template <class Position>
class ReferenceTokenizer::Grammar {
public:
    Grammar();

    /// The tokens from a position to the end; the last one is T_EOF.
    std::vector<Token> tokens(Position position, const Position& end);

private:
    typedef classic::rule<classic::scanner<Position>> Rule;

    Token next(Position& position, const Position& end);

    void defineValues();
    void defineMarkup();
    void defineIgnorable();

    auto appendTo(std::string& buffer) {
        return action([&buffer](const std::string& matched) { buffer += matched; });
    }
    auto appendEntityTo(std::string& buffer) {
        return action([this, &buffer](const std::string&) { buffer += entity; });
    }
    auto clear() {
        return action([this](const std::string&) {
            token.attrs.clear();
            name = attributeName = attributeValue = std::string();
        });
    }
    auto addAttribute() {
        return action([this](const std::string&) {
            token.attrs.emplace_back(attributeName, attributeValue);
            attributeName = attributeValue = std::string();
        });
    }
    auto setToken(Token::TokenType type) {
        return action([this, type](const std::string&) {
            token.type = type;
            token.value = name;
            name.clear();
        });
    }

    Token token;
    std::string name;
    std::string attributeName;
    std::string attributeValue;
    char entity = 0;

    Rule space, equals, identifier, comment, misc;
    Rule entityRef, charRef, reference, attValue, attribute;
    Rule startTag, emptyTag, endTag, charData;
    Rule versionInfo, encodingDecl, standaloneDecl, declaration, ignorable, markup, any;
};

template <class Position>
ReferenceTokenizer::Grammar<Position>::Grammar() {
    defineValues();
    defineMarkup();
    defineIgnorable();
    any = ignorable | markup;
}

template <class Position>
void ReferenceTokenizer::Grammar<Position>::defineValues() {
    using namespace classic;
    const CharSet nameStart("A-Za-z_-");  // a "-" at the end stands for itself
    const CharSet nameChar("A-Za-z0-9_-");
    const CharSet inDoubleQuotes(~CharSet("<&\""));
    const CharSet inApostrophes(~CharSet("<&'"));

    space = +CharSet("\t\n\r ");
    equals = !space >> '=' >> !space;
    identifier = nameStart >> *nameChar;
    entityRef =
        '&' >> identifier[action([this](const std::string& n) { entity = namedEntity(n); })] >> ';';
    charRef =
        (str_p("&#") >>
         (+CharSet(
             "0-9"))[action([this](const std::string& d) { entity = numberedEntity(d, 10); })] >>
         ';') |
        (str_p("&#x") >> (+CharSet("0-9a-fA-F"))[action(
                             [this](const std::string& d) { entity = numberedEntity(d, 16); })] >>
         ';');
    reference = entityRef | charRef;
    attValue =
        ('"' >>
         *(inDoubleQuotes[appendTo(attributeValue)] | reference[appendEntityTo(attributeValue)]) >>
         '"') |
        ('\'' >>
         *(inApostrophes[appendTo(attributeValue)] | reference[appendEntityTo(attributeValue)]) >>
         '\'');
}

template <class Position>
void ReferenceTokenizer::Grammar<Position>::defineMarkup() {
    using namespace classic;
    const CharSet textChar(~CharSet("<&"));

    attribute = identifier[appendTo(attributeName)] >> equals >> attValue;
    startTag = ch_p('<')[clear()] >> identifier[appendTo(name)] >>
               *(space >> attribute[addAttribute()]) >> !space >> '>';
    emptyTag = ch_p('<')[clear()] >> identifier[appendTo(name)] >>
               *(space >> attribute[addAttribute()]) >> !space >> "/>";
    endTag = str_p("</") >> identifier[appendTo(name)] >> !space >> '>';
    charData = +((+textChar)[appendTo(name)] | reference[appendEntityTo(name)]);
    markup = startTag[setToken(Token::T_OPEN)] | endTag[setToken(Token::T_CLOSE)] |
             emptyTag[setToken(Token::T_SINGLE)] | charData[setToken(Token::T_TEXT)];
}

template <class Position>
void ReferenceTokenizer::Grammar<Position>::defineIgnorable() {
    using namespace classic;
    const CharSet commentChar(CharSet("\t\n\r ") | range<unsigned char>(0x21, 0xFF));

    comment = str_p("<!--") >> *((commentChar - '-') | ('-' >> (commentChar - '-'))) >> "-->";
    misc = comment | space;
    versionInfo = space >> "version" >> equals >> attValue;
    encodingDecl = space >> "encoding" >> equals >> attValue;
    standaloneDecl = space >> "standalone" >> equals >> attValue;
    declaration =
        str_p("<?xml") >> versionInfo >> !encodingDecl >> !standaloneDecl >> !space >> "?>";
    ignorable = declaration | misc;
}

template <class Position>
Token ReferenceTokenizer::Grammar<Position>::next(Position& position, const Position& end) {
    do {
        token = Token();
        const classic::parse_info<Position> result = classic::parse(position, end, any);
        if (!result.hit) {
            // Attributes of a tag that broke off are nobody's.
            token = Token();
            token.type = Token::T_EOF;
            return token;
        }
        position = result.stop;
    } while (token.type == Token::T_IGNORE);
    return token;
}

template <class Position>
std::vector<Token> ReferenceTokenizer::Grammar<Position>::tokens(Position position,
                                                                 const Position& end) {
    name = attributeName = attributeValue = std::string();
    std::vector<Token> found;
    do {
        Token read = next(position, end);
        const bool continues =
            read.type == Token::T_TEXT && !found.empty() && found.back().type == Token::T_TEXT;
        if (continues)
            found.back().value += read.value;
        else
            found.push_back(std::move(read));
    } while (found.back().type != Token::T_EOF);
    return found;
}

ReferenceTokenizer::ReferenceTokenizer()
    : inMemory(std::make_unique<Grammar<InMemory>>()),
      inStream(std::make_unique<Grammar<InStream>>()) {}

ReferenceTokenizer::~ReferenceTokenizer() = default;

std::vector<Token> ReferenceTokenizer::tokens(const std::string& text) {
    const InMemory first = reinterpret_cast<InMemory>(text.data());
    return inMemory->tokens(first, first + text.size());
}

std::vector<Token> ReferenceTokenizer::tokens(std::istream& in) {
    in.unsetf(std::ios_base::skipws);
    const std::istream_iterator<unsigned char> first(in);
    return inStream->tokens(InStream(first), InStream(std::istream_iterator<unsigned char>()));
}

}  // namespace pells_test
