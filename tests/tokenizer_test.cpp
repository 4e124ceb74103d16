#include "pells/xml/tokenizer.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "support/chunked_buffer.h"
#include "support/thrown.h"

namespace {

using pells::XMLTokenizer;
using pells_test::ChunkedBuffer;
typedef XMLTokenizer::Token Token;

/// The debug forms of all tokens of a text, T_EOF excluded, a line each.
std::string tokensOf(const std::string& text) {
    std::istringstream in(text);
    XMLTokenizer tokenizer(in);
    std::ostringstream out;
    for (Token token = tokenizer.getToken(); token.type != Token::T_EOF;
         token = tokenizer.getToken())
        out << token << '\n';
    return out.str();
}

typedef std::pair<std::string, std::string> Example;

const std::string openT = "Token: 2 (T_OPEN) <t>\n";
const std::string closeT = "Token: 3 (T_CLOSE) </t>\n";

TEST(Tokenizer, ReadsSingleTags) {
    const Example examples[] = {
        {"<?xml version=\"1.0\"?>\n<!-- - -->\r\n<r x='1' y=\"2\"/>", "<r x=\"1\" y=\"2\"/>"},
        {"<?xml\tversion = '1.0' encoding=\"utf-8\"\nstandalone='yes' ?><a />", "<a/>"},
        {"<-_9 x='a&quot;>\"b' x = \"'\n\"/>", "<-_9 x=\"a\">\"b\" x=\"'\n\"/>"}};
    for (const Example& each : examples)
        EXPECT_EQ(tokensOf(each.first), "Token: 1 (T_SINGLE) " + each.second + "\n");
}

TEST(Tokenizer, ReadsTextWithReferencesBetweenTags) {
    const Example examples[] = {{"  x y  ", "x y  "},
                                {"ab <!----> \n cd<?xml version='1'?>e", "ab cde"},
                                {"<!--->a--><!--->-->b", "b"},
                                {"a &lt; b &amp;&amp; c &gt;&apos;&quot;", "a < b && c >'\""},
                                {"&foo;&LT;&quot-9_;", "???"},
                                {"&#65;&#x41;&#x4a;&#x4A;&#233;", "AAJJ\xE9"},
                                {"&#256;&#8364;&#x100000042;", {'\0', '\xAC', 'B'}},
                                {"&#99999999999999999999999999;", "\xFF"},
                                {"\xC3\xA4\x01\x7F]]>", "\xC3\xA4\x01\x7F]]>"}};
    for (const Example& each : examples) {
        const std::string text = "Token: 4 (T_TEXT) \"" + each.second + "\"\n";
        EXPECT_EQ(tokensOf("<t\n>" + each.first + "</t >"), openT + text + closeT);
    }
    EXPECT_EQ(tokensOf("<t> \t\r\n</t>"), openT + closeT);
    EXPECT_EQ(tokensOf("<t>ab&amp;&c</t>"), openT + "Token: 4 (T_TEXT) \"ab&\"\n");
}

TEST(Tokenizer, EndsAtWhatIsNotInItsDialect) {
    const char* const texts[] = {"<!DOCTYPE x>",   "<![CDATA[x]]>", "<?xml encoding='x'?>",
                                 "<a b>",          "<a b=c>",       "<a b='<'>",
                                 "<a b='1'c='2'>", "<a:b/>",        "<a.b/>",
                                 "<1/>",           "< a/>",         "&#X41;",
                                 "<!-- a -- b -->"};
    for (const std::string text : texts)
        EXPECT_EQ(tokensOf("<t>" + text + "<a/>"), openT) << text;
}

TEST(TokenizerStream, StandsRightBehindEachTokenForOtherReaders) {
    // Each line is taken by one call; character data comes with the tag that ends it.
    const std::string lines[] = {"<?xml version='1.0'?><root a='1'>", " <b/>",
                                 "text&amp;<!----></b>", "", "<data\n>"};
    const std::string bytes = "\n <<&\n";
    std::string text;
    for (const std::string& line : lines)
        text += line;
    text += bytes + "</data>";
    for (const std::size_t size : {0, 1, 2, 3, 7, 16, 1000}) {
        ChunkedBuffer buffer(text, size);
        std::istream in(&buffer);
        XMLTokenizer tokenizer(in);
        EXPECT_FALSE(in.flags() & std::ios_base::skipws);
        std::size_t position = 0;
        for (const std::string& line : lines) {
            EXPECT_EQ(buffer.taken(), position) << "in pieces of " << size;
            const Token token = tokenizer.getToken();
            position += line.size();
            EXPECT_EQ(buffer.taken(), position) << token << " in pieces of " << size;
        }
        std::string read(bytes.size(), ' ');
        in.read(&read[0], static_cast<std::streamsize>(read.size()));
        EXPECT_EQ(read, bytes);
        EXPECT_EQ(tokenizer.getToken().value, "data");
        EXPECT_TRUE(in.good()) << "the end is not met before it is asked for";
        EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
        EXPECT_EQ(in.rdstate(), std::ios_base::eofbit | std::ios_base::failbit);
    }
}

TEST(TokenizerStream, EndOfTokensIsFinal) {
    std::istringstream in("<a b='1' !><c/>");
    XMLTokenizer tokenizer(in);
    for (int call = 0; call < 3; ++call) {
        const Token token = tokenizer.getToken();
        EXPECT_EQ(token.type, Token::T_EOF);
        EXPECT_TRUE(token.value.empty() && token.attrs.empty());
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
         {"", " ", "<", "<a b='c", "</a", "text<!-- ", "text &am", "<?xml"}) {
        const std::string text = "<first/>" + end;
        for (const bool loud : {false, true}) {
            SCOPED_TRACE(end + (loud ? " loudly" : " quietly"));
            ChunkedBuffer buffer(text, 3, true);
            std::istream in(&buffer);
            in.exceptions(loud ? std::ios_base::badbit : std::ios_base::goodbit);
            XMLTokenizer tokenizer(in);
            EXPECT_EQ(tokenizer.getToken().value, "first");
            const auto readOn = [&tokenizer] {
                while (tokenizer.getToken().type == Token::T_TEXT) {
                }
            };
            EXPECT_EQ(pells_test::thrown<std::runtime_error>(readOn), loud ? "damaged" : "");
            EXPECT_TRUE(in.bad());
            in.clear();
            EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
        }
    }
}

TEST(Tokens, AreLoggedWhateverTheirTypeAndTheStream) {
    std::ostringstream out;
    out << std::hex << std::showbase;
    Token token;
    token.value = "v";
    for (const int type : {0, 5, 16, -1}) {
        token.type = static_cast<Token::TokenType>(type);
        out << token << '\n';
    }
    EXPECT_EQ(out.str(),
              "Token: 0 (T_IGNORE) v\nToken: 5 (T_EOF) v\nToken: 16 (**bad**) v\n"
              "Token: -1 (**bad**) v\n");
}

}  // namespace
