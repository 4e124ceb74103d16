#include "support/reference_tokenizer.h"

#include <boost/spirit/include/classic_chset.hpp>
#include <boost/spirit/include/classic_core.hpp>
#include <boost/spirit/include/classic_multi_pass.hpp>
#include <cstdlib>
#include <iterator>
#include <map>
#include <utility>

namespace pells_test {

namespace {

namespace classic = boost::spirit::classic;
typedef pells::XMLTokenizer::Token Token;

char namedEntity(const std::string& name) {
    static const std::map<std::string, char> entities = {
        {"amp", '&'}, {"lt", '<'}, {"gt", '>'}, {"apos", '\''}, {"quot", '"'}};
    const auto known = entities.find(name);
    return known == entities.end() ? '?' : known->second;
}

/// "!" means optional in this parser library, and a function in brackets gets what has matched.
template <class Position>
class Grammar {
public:
    Grammar();

    /// The tokens from a position to the end.
    std::vector<Token> tokens(Position position, const Position& end);

private:
    typedef classic::chset<unsigned char> CharSet;
    typedef classic::rule<classic::scanner<Position>> Rule;

    static auto appendTo(std::string& buffer) {
        return [&buffer](auto first, auto last) { buffer.append(first, last); };
    }
    auto appendEntityTo(std::string& buffer) {
        return [this, &buffer](auto, auto) { buffer += entity; };
    }
    auto setNumber(int base) {
        return [this, base](auto first, auto last) {
            const std::string digits(first, last);
            const std::uint64_t number = std::strtoull(digits.c_str(), nullptr, base);
            const std::uint64_t largest = std::numeric_limits<std::uint32_t>::max();
            entity = static_cast<char>(static_cast<unsigned char>(std::min(number, largest)));
        };
    }
    auto setToken(Token::TokenType type) {
        return [this, type](auto, auto) {
            token.type = type;
            token.value = std::exchange(name, {});
        };
    }

    Token token;
    std::string name;
    Token::Attribute scratch;
    char entity = 0;
    Rule space, equals, identifier, reference, value, attribute;
    Rule tag, endTag, text, markup, comment, declaration, any;
};

template <class Position>
Grammar<Position>::Grammar() {
    using namespace classic;
    const CharSet inDoubleQuotes(~CharSet("<&\""));
    const CharSet inApostrophes(~CharSet("<&'"));
    const auto setNamed = [this](auto first, auto last) {
        entity = namedEntity(std::string(first, last));
    };
    const auto appendChar = appendTo(scratch.second);
    const auto appendEntity = appendEntityTo(scratch.second);

    space = +CharSet("\t\n\r ");
    equals = !space >> '=' >> !space;
    identifier = CharSet("A-Za-z_-") >> *CharSet("A-Za-z0-9_-");  // a "-" at the end is itself
    reference = ('&' >> identifier[setNamed] >> ';') |
                ("&#" >> (+CharSet("0-9"))[setNumber(10)] >> ';') |
                ("&#x" >> (+CharSet("0-9a-fA-F"))[setNumber(16)] >> ';');
    value = ('"' >> *((+inDoubleQuotes)[appendChar] | reference[appendEntity]) >> '"') |
            ('\'' >> *((+inApostrophes)[appendChar] | reference[appendEntity]) >> '\'');

    const auto clear = [this](auto, auto) {
        token.attrs.clear();
        name.clear();
        scratch = {};
    };
    const auto addAttribute = [this](auto, auto) {
        token.attrs.push_back(std::exchange(scratch, {}));
    };

    attribute = identifier[appendTo(scratch.first)] >> equals >> value;
    tag = str_p("<")[clear] >> identifier[appendTo(name)] >> *(space >> attribute[addAttribute]) >>
          !space;
    endTag = "</" >> identifier[appendTo(name)] >> !space >> '>';
    text = +((+~CharSet("<&"))[appendTo(name)] | reference[appendEntityTo(name)]);
    markup = (tag >> '>')[setToken(Token::T_OPEN)] | endTag[setToken(Token::T_CLOSE)] |
             (tag >> "/>")[setToken(Token::T_SINGLE)] | text[setToken(Token::T_TEXT)];

    const CharSet noHyphen(CharSet("\t\n\r ") | range<unsigned char>(0x21, '-' - 1) |
                           range<unsigned char>('-' + 1, 0xFF));
    const auto assignment = [this](const char* wanted) {
        return space >> wanted >> equals >> value;
    };

    comment = "<!--" >> *(noHyphen | ('-' >> noHyphen)) >> "-->";
    declaration = "<?xml" >> assignment("version") >> !assignment("encoding") >>
                  !assignment("standalone") >> !space >> "?>";
    any = declaration | comment | space | markup;
}

template <class Position>
std::vector<Token> Grammar<Position>::tokens(Position position, const Position& end) {
    name.clear();
    std::vector<Token> found;
    for (bool hit = true; hit;) {
        token = Token();
        const classic::parse_info<Position> result = classic::parse(position, end, any);
        position = result.stop;
        hit = result.hit;
        if (token.type == Token::T_TEXT && !found.empty() && found.back().type == Token::T_TEXT)
            found.back().value += token.value;
        else if (hit && token.type != Token::T_IGNORE)
            found.push_back(token);
    }
    found.emplace_back().type = Token::T_EOF;
    return found;
}

}  // namespace

std::vector<Token> referenceTokens(const std::string& text) {
    typedef const unsigned char* Position;
    static Grammar<Position> grammar;
    const Position first = reinterpret_cast<Position>(text.data());
    return grammar.tokens(first, first + text.size());
}

std::vector<Token> referenceTokens(std::istream& in) {
    typedef std::istream_iterator<unsigned char> Character;
    typedef classic::multi_pass<Character> Position;
    static Grammar<Position> grammar;
    in.unsetf(std::ios_base::skipws);
    return grammar.tokens(Position(Character(in)), Position(Character()));
}

}  // namespace pells_test
