// What the tokenizer does to its stream.

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "pells/xml/tokenizer.h"
#include "support/chunked_buffer.h"
#include "support/thrown.h"

namespace {

using pells::XMLTokenizer;
using pells_test::ChunkedBuffer;
typedef XMLTokenizer::Token Token;

const std::size_t pieceSizes[] = {0, 1, 2, 3, 7, 16, 1000};

TEST(TokenizerStream, StandsRightBehindEachToken) {
    // Each line is taken by one call; character data comes with the tag that ends it.
    const std::string lines[] = {"<?xml version='1.0'?><root a='1'>",
                                 " <b/>",
                                 "text &amp;<!---->x</b>",
                                 "",
                                 "<c\n>",
                                 "\n</root >"};
    for (const std::size_t size : pieceSizes) {
        std::string text;
        for (const std::string& line : lines)
            text += line;
        text += "trailer";
        ChunkedBuffer buffer(text, size);
        std::istream in(&buffer);
        XMLTokenizer tokenizer(in);
        EXPECT_EQ(buffer.taken(), 0U);
        std::size_t position = 0;
        for (const std::string& line : lines) {
            const Token token = tokenizer.getToken();
            position += line.size();
            EXPECT_EQ(buffer.taken(), position) << token << " in pieces of " << size;
        }
        EXPECT_TRUE(in.good());
        std::string rest;
        EXPECT_TRUE(in >> rest);
        EXPECT_EQ(rest, "trailer");
    }
}

TEST(TokenizerStream, IsSharedWithOtherReaders) {
    std::istringstream in("  <data size='4'>\n <<&\n</data>");
    XMLTokenizer tokenizer(in);
    EXPECT_FALSE(in.flags() & std::ios_base::skipws);
    EXPECT_EQ(tokenizer.getToken().attrs.size(), 1U);
    char bytes[5] = {};
    in.read(bytes, 5);
    EXPECT_EQ(std::string(bytes, 5), "\n <<&");
    EXPECT_EQ(tokenizer.getToken().value, "data");
    EXPECT_TRUE(in.good()) << "the end is not met before it is asked for";
    EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
    EXPECT_EQ(in.rdstate(), std::ios_base::eofbit | std::ios_base::failbit);
}

TEST(TokenizerStream, EndOfTokensIsFinal) {
    std::istringstream in("<a b='1' !><c/>");
    XMLTokenizer tokenizer(in);
    for (int call = 0; call < 3; ++call) {
        const Token token = tokenizer.getToken();
        EXPECT_EQ(token.type, Token::T_EOF);
        EXPECT_EQ(token.value, "");
        EXPECT_TRUE(token.attrs.empty());
        in.clear();
        in.str("<c/>");
    }
}

TEST(TokenizerStream, StreamThatIsNotGoodEndsTheTokens) {
    std::istringstream failed("<a/>");
    failed.setstate(std::ios_base::failbit);
    XMLTokenizer fromTheStart(failed);
    failed.clear();
    EXPECT_EQ(fromTheStart.getToken().type, Token::T_EOF);

    std::istringstream ended("<a/><b/>");
    XMLTokenizer between(ended);
    between.getToken();
    ended.setstate(std::ios_base::eofbit);
    EXPECT_EQ(between.getToken().type, Token::T_EOF);
    EXPECT_TRUE(ended.fail());

    std::istringstream empty;
    const XMLTokenizer none(empty);
    EXPECT_TRUE(empty.eof()) << "the first character is asked for at once";

    std::istream without(nullptr);
    EXPECT_EQ(XMLTokenizer(without).getToken().type, Token::T_EOF);

    std::istringstream strict("<a/>x");
    strict.exceptions(std::ios_base::failbit);
    XMLTokenizer thrower(strict);
    EXPECT_EQ(thrower.getToken().value, "a");
    EXPECT_THROW(thrower.getToken(), std::ios_base::failure);
    EXPECT_EQ(thrower.getToken().type, Token::T_EOF);
}

TEST(TokenizerStream, DamageGoesToTheCallerOrEndsTheTokens) {
    for (const std::string end :
         {"", " ", "<", "<a", "<a ", "<a b", "<a b='c", "<a b='c'", "</a", "<a/", "text",
          "text<!-- ", "text &am", "&#6", "<!-", "<!-- -", "<?xml", "<?xml version='1.0"}) {
        const std::string text = "<first/>" + end;
        for (const std::size_t size : pieceSizes) {
            SCOPED_TRACE(end + " in pieces of " + std::to_string(size));
            ChunkedBuffer throwing(text, size, true);
            std::istream loud(&throwing);
            loud.exceptions(std::ios_base::badbit);
            XMLTokenizer tokenizer(loud);
            EXPECT_EQ(tokenizer.getToken().value, "first");
            EXPECT_EQ(pells_test::thrown<std::runtime_error>([&] { tokenizer.getToken(); }),
                      "damaged");
            EXPECT_TRUE(loud.bad());
            loud.clear();
            EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);

            ChunkedBuffer quiet(text, size, true);
            std::istream in(&quiet);
            XMLTokenizer ending(in);
            ending.getToken();
            while (ending.getToken().type == Token::T_TEXT) {
            }
            EXPECT_TRUE(in.bad());
            EXPECT_EQ(ending.getToken().type, Token::T_EOF);
        }
    }
    // At the first character, nothing leaks.
    const std::string nothing;
    ChunkedBuffer buffer(nothing, 1, true);
    std::istream in(&buffer);
    in.exceptions(std::ios_base::badbit);
    EXPECT_THROW(XMLTokenizer tokenizer(in), std::runtime_error);
}

TEST(Tokens, AreLogged) {
    std::ostringstream out;
    out << std::hex << std::showbase;
    Token token;
    token.value = "v";
    token.attrs = {{"a", "1"}, {"b", "\"<"}};
    for (const int type : {0, 1, 2, 3, 4, 5, 6, 16, -1}) {
        token.type = static_cast<Token::TokenType>(type);
        out << token << '\n';
    }
    EXPECT_EQ(out.str(),
              "Token: 0 (T_IGNORE) v\nToken: 1 (T_SINGLE) <v a=\"1\" b=\"\"<\"/>\n"
              "Token: 2 (T_OPEN) <v a=\"1\" b=\"\"<\">\nToken: 3 (T_CLOSE) </v>\n"
              "Token: 4 (T_TEXT) \"v\"\nToken: 5 (T_EOF) v\nToken: 6 (**bad**) v\n"
              "Token: 16 (**bad**) v\nToken: -1 (**bad**) v\n");
}

}  // namespace
