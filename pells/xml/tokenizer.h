#pragma once

#include <cstddef>
#include <cstdint>
#include <iosfwd>
#include <limits>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// Turns a stream of XML text into a flat sequence of tokens.
///
/// The tokenizer knows nothing of nesting: `</a>` without an `<a>` is a token like any other, and a
/// document may have several roots. It reads this part of XML 1.0 (https://www.w3.org/TR/xml/),
/// byte by byte and without regard to an encoding:
///
///  - Tags. Names consist of the letters A-Z and a-z, digits, "_" and "-", and do not begin with a
///    digit. White space (tab, line feed, carriage return, space) may follow a name but not precede
///    it. Attribute values stand in double quotes or apostrophes; they may hold ">", line feeds
///    and the other quote, not "<". An attribute that occurs twice is listed twice.
///  - Character data: everything outside markup, control characters and bytes above 0x7F included.
///    White space at the start of a run of character data is dropped, all other is kept.
///  - References, in character data and attribute values: `&amp;`, `&lt;`, `&gt;`, `&apos;` and
///    `&quot;`; any other name gives a question mark. `&#233;` and `&#xE9;` (with a small x) give
///    one byte, the low eight bits of the number: `&#256;` is a zero byte, `&#8364;` is 0xAC, and a
///    number too large for 32 bits is 0xFF.
///  - Comments, and declarations such as `<?xml version="1.0" encoding="utf-8"?>`, at any place
///    where a tag may stand. They are skipped, and do not end a run of character data. Comments may
///    not hold two hyphens in a row, nor control characters other than white space. After the
///    opening `<!--` a hyphen takes the next character with it, so that `<!--->` does not end.
///
/// The tokens end for good, with T_EOF, at the first place that is none of this: the end of the
/// stream, but also a document type declaration, a CDATA section, another processing instruction, a
/// name with ":" or ".", an unquoted attribute value or an "&" that begins no reference. Malformed
/// text is no error to the tokenizer: code that knows the nesting sees that elements are still
/// open.
///
/// Input is read in one pass, straight from the stream's buffer, and holds no more memory than the
/// longest token, see maximumTokenSize(): comments and white space of any length cost none. One
/// thread.
class PELLS_API XMLTokenizer {
public:
    /// One token, copied by value.
    struct PELLS_API Token {
        /// What a token is. The numbers are those of log lines.
        enum TokenType : int {
            T_IGNORE = 0,  ///< never handed out
            T_SINGLE = 1,  ///< an empty-element tag, `<a x="1"/>`
            T_OPEN = 2,    ///< a start tag, `<a x="1">`
            T_CLOSE = 3,   ///< an end tag, `</a>`
            T_TEXT = 4,    ///< character data
            T_EOF = 5      ///< end of input, or of what can be recognised
        };
        /// A name and a decoded value.
        typedef std::pair<std::string, std::string> Attribute;

        /// What the rest means.
        TokenType type = T_IGNORE;
        /// The element's name, or the decoded character data; empty for T_EOF.
        std::string value;
        /// Names and decoded values in document order, for T_SINGLE and T_OPEN; otherwise empty.
        std::vector<Attribute> attrs;
    };

    /// A token is larger than maximumTokenSize(), or goes on where getToken() was told to stop.
    class PELLS_API TooLarge : public std::runtime_error {
    public:
        /// \param message says which limit was passed.
        explicit TooLarge(const std::string& message);
        TooLarge(const TooLarge&) = default;
        TooLarge& operator=(const TooLarge&) = default;
        ~TooLarge() override;
    };

    class XMLParserMixin;

    /// Begins to read a stream, which must outlive the tokenizer.
    ///
    /// Clears the stream's `skipws` flag, for good, and looks at the first character, which may
    /// block. Throws what getToken() throws.
    explicit XMLTokenizer(std::istream& in);
    virtual ~XMLTokenizer();
    XMLTokenizer(const XMLTokenizer&) = delete;
    XMLTokenizer& operator=(const XMLTokenizer&) = delete;

    /// Reads the next token; after T_EOF every further call returns T_EOF, and leaves the stream
    /// alone.
    ///
    /// Adjacent pieces of character data come as one T_TEXT, so the tag that ends them is read with
    /// them and handed out by the next call. Otherwise the stream stands right behind the token's
    /// last character, and others may read on from there (the tokenizer, too, goes on from where
    /// they left it). After T_EOF for malformed text its position lies somewhere behind the last
    /// good token.
    ///
    /// The stream is used as `in >> character` would: at its end eofbit and failbit are set, and a
    /// stream that is not good ends the tokens. What its buffer throws sets badbit and ends the
    /// tokens; it goes on to the caller when the stream's exceptions() ask for badbit, as those of
    /// archive streams do. After an exception the tokens have ended, too.
    ///
    /// \param end how far tokens may reach, counted as getPosition() counts.
    /// \throws TooLarge for a token that is larger than maximumTokenSize(), or reaches further than
    ///         `end`. Comments and white space before it count for `end` only.
    Token getToken(std::uint64_t end = std::numeric_limits<std::uint64_t>::max());

    /// How many bytes of the stream the tokens so far have taken, with what lies between them.
    std::uint64_t getPosition() const;

    /// How large a token may be, in bytes: the characters of its name, its text and its attributes
    /// after decoding, and 64 for each attribute. 64 MiB unless it was set.
    static std::size_t maximumTokenSize();

    /// Takes effect with the next token.
    static void setMaximumTokenSize(std::size_t bytes);

private:
    void completeText(Token& text);

    std::unique_ptr<XMLParserMixin> parser;
    std::optional<Token> pending;
};

/// The grammar behind a tokenizer: what it can be asked for.
class PELLS_API XMLTokenizer::XMLParserMixin {
public:
    /// The next piece of markup or character data. Unlike the tokenizer's, T_TEXT may follow
    /// T_TEXT: comments, declarations and white space behind them come between.
    virtual Token next() = 0;
    virtual ~XMLParserMixin();
};

/// Writes a token for the log: `Token: 2 (T_OPEN) <a x="1">`. Nothing is escaped.
PELLS_API std::ostream& operator<<(std::ostream& out, const XMLTokenizer::Token& token);

}  // namespace pells
