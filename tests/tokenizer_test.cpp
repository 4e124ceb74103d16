#include "pells/xml/tokenizer.h"

#include <gtest/gtest.h>

#include <sstream>

#include "support/chunked_buffer.h"

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
    in.clear();
    in.str("<more/>");
    EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF) << "the end is final";
    return out.str();
}

const std::string openT = "Token: 2 (T_OPEN) <t>\n";

TEST(Tokenizer, ReadsTagsAndTextWithReferences) {
    const std::string single = "1 (T_SINGLE) ";
    const std::string text = "4 (T_TEXT) ";
    const std::pair<std::string, std::string> examples[] = {
        {"<?xml\tversion = '1.0' encoding=\"utf-8\"\nstandalone='yes' ?><a />", single + "<a/>"},
        {"<-_9 x='a&quot;>\"b' x = \"'\n\"/>", single + "<-_9 x=\"a\">\"b\" x=\"'\n\"/>"},
        {"  x y  ", text + "\"x y  \""},
        {"ab <!----> \n cd<?xml version='1'?>e", text + "\"ab cde\""},
        {"a &lt; b &amp;&amp; c &gt;&apos;&quot;", text + "\"a < b && c >'\"\""},
        {"&foo;&LT;&quot-9_;", text + "\"???\""},
        {"&#65;&#x41;&#x4a;&#x4A;&#233;&#8364;", text + "\"AAJJ\xE9\xAC\""},
        {"&#256;&#xFFFFFF42;&#4294967105;", text + '"' + '\0' + "BA\""},
        {"&#x100000042;&#4294967296;\x01\x7F]]>", text + "\"\xFF\xFF\x01\x7F]]>\""}};
    for (const auto& each : examples)
        EXPECT_EQ(tokensOf("<t\n>" + each.first + "</t >"),
                  openT + "Token: " + each.second + "\nToken: 3 (T_CLOSE) </t>\n");
    EXPECT_EQ(tokensOf("<t> \t\r\n</t>"), openT + "Token: 3 (T_CLOSE) </t>\n");
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
    EXPECT_EQ(tokensOf("<?xml version=''standalone=''?><a/>"), "");
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
    for (const std::size_t size : {0u, 1u, 2u, 3u, 7u, 16u, 1000u}) {
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

/// The number of tokens that a text gives, then why there are no more.
std::string countTokens(const std::string& text, std::size_t blockSize, std::uint64_t end) {
    ChunkedBuffer buffer(text, blockSize);
    std::istream in(&buffer);
    XMLTokenizer tokenizer(in);
    int count = 0;
    try {
        while (tokenizer.getToken(end).type != Token::T_EOF)
            ++count;
    } catch (const XMLTokenizer::TooLarge& reason) {
        EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
        return std::to_string(count) + ' ' + reason.what();
    }
    return std::to_string(count);
}

TEST(TokenizerLimits, HoldForTheTokenAndForTheDocumentHoweverTheyCome) {
    const std::size_t before = XMLTokenizer::maximumTokenSize();
    XMLTokenizer::setMaximumTokenSize(100);
    const std::string most(100, 'x');
    const std::string tooLarge = "XML token larger than 100 bytes";
    const std::pair<std::string, std::string> cases[] = {
        {"<a>" + most + "</a>", "3"},
        {"<a>" + most + "x</a>", "1 " + tooLarge},
        {"<a>" + most + "<!-- " + most + "-->&amp;</a>", "1 " + tooLarge},
        {"<a>&amp;" + most.substr(1) + "<!---->&amp;", "1 " + tooLarge},
        {"<" + most + "/><" + most + "x/>", "1 " + tooLarge},
        {"</" + most + "></" + most + "x>", "1 " + tooLarge},
        {"<b a='" + most.substr(66) + "'/>", "1"},
        {"<b a='" + most.substr(65) + "'/>", "0 " + tooLarge},
        {"<b a='" + most.substr(66) + "&amp;'/>", "0 " + tooLarge},
        {"<b a='' c=''/>", "0 " + tooLarge},
        {"<!--" + most + most + "--><a/>", "1"}};
    for (const auto& each : cases) {
        for (const std::size_t size : {1u, 7u, 1000u})
            EXPECT_EQ(countTokens(each.first, size, 1000), each.second) << each.first;
    }
    XMLTokenizer::setMaximumTokenSize(before);

    const std::string text = "<a>text<b/></a>";
    const std::string comment = "<!--" + std::string(10000, 'x') + "-->";
    const std::string behind = " XML document goes on beyond byte ";
    for (const std::size_t size : {1u, 7u, 100000u}) {
        EXPECT_EQ(countTokens(text, size, text.size()), "4");
        EXPECT_EQ(countTokens(text, size, text.size() - 1), "3" + behind + "14");
        EXPECT_EQ(countTokens("<a>" + comment + "<b/>", size, 100), "1" + behind + "100");
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
