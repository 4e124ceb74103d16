#pragma once

#include <istream>
#include <memory>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// Turns a stream of XML text into a flat sequence of tokens.
class PELLS_API XMLTokenizer {
public:
    /// One token, copied by value.
    struct PELLS_API Token {
        enum TokenType {
            T_IGNORE = 0,  ///< never handed out
            T_SINGLE = 1,  ///< an empty-element tag
            T_OPEN = 2,    ///< a start tag
            T_CLOSE = 3,   ///< an end tag
            T_TEXT = 4,    ///< character data
            T_EOF = 5      ///< end of input, or of what can be recognised
        };
        typedef std::pair<std::string, std::string> Attribute;

        TokenType type = T_IGNORE;
        std::string value;
        std::vector<Attribute> attrs;
    };

    class XMLParserMixin;

    explicit XMLTokenizer(std::istream& in);
    virtual ~XMLTokenizer();
    XMLTokenizer(const XMLTokenizer&) = delete;
    XMLTokenizer& operator=(const XMLTokenizer&) = delete;

    Token getToken();

private:
    std::unique_ptr<XMLParserMixin> parser;
    Token pending;
};

PELLS_API std::ostream& operator<<(std::ostream& out, const XMLTokenizer::Token& token);

}  // namespace pells
