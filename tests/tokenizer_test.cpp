#include "pells/xml/tokenizer.h"

#include <gtest/gtest.h>

#include <sstream>

namespace {

using pells::XMLTokenizer;

/// The debug forms of all tokens of a text, T_EOF excluded, a line each.
std::string tokensOf(const std::string& text) {
    std::istringstream in(text);
    XMLTokenizer tokenizer(in);
    std::ostringstream out;
    for (;;) {
        const XMLTokenizer::Token token = tokenizer.getToken();
        if (token.type == XMLTokenizer::Token::T_EOF)
            return out.str();
        out << token << '\n';
    }
}

typedef std::pair<std::string, std::string> Example;

const std::string openT = "Token: 2 (T_OPEN) <t>\n";
const std::string closeT = "Token: 3 (T_CLOSE) </t>\n";

TEST(Tokenizer, ReadsSingleTags) {
    const Example examples[] = {
        {"<?xml version=\"1.0\"?>\n<!-- - -->\r\n<r x='1' y=\"2\"/>", "<r x=\"1\" y=\"2\"/>"},
        {"<?xml\tversion = '1.0' encoding=\"utf-8\"\nstandalone='yes' ?><a/>", "<a/>"},
        {"<?xml version='' standalone=''?><a />", "<a/>"},
        {"<-_9 _- = 'x'/>", "<-_9 _-=\"x\"/>"},
        {"<a x='a&quot;>\"b' y=\"'\n\"/>", "<a x=\"a\">\"b\" y=\"'\n\"/>"},
        {"<a x='1' x='2'/>", "<a x=\"1\" x=\"2\"/>"}};
    for (const Example& each : examples)
        EXPECT_EQ(tokensOf(each.first), "Token: 1 (T_SINGLE) " + each.second + "\n");
}

TEST(Tokenizer, ReadsTextWithReferencesBetweenTags) {
    const Example examples[] = {{"1.5", "1.5"},
                                {"  x y  ", "x y  "},
                                {"ab<!-- c -->cd", "abcd"},
                                {"ab <!----> \n cd", "ab cd"},
                                {"a<?xml version='1'?>b", "ab"},
                                {"<!--->a--><!--->-->b", "b"},
                                {"a &lt; b &amp;&amp; c &gt;&apos;&quot;", "a < b && c >'\""},
                                {"&foo;&LT;&a-9_;", "???"},
                                {"&#65;&#x41;&#x4a;&#x4A;&#233;", "AAJJ\xE9"},
                                {"&#256;&#8364;&#x100000042;", {'\0', '\xAC', 'B'}},
                                {"&#99999999999999999999999999;&#x10000000000000000;", "\xFF\xFF"},
                                {"\xC3\xA4\x01\x7F]]>", "\xC3\xA4\x01\x7F]]>"}};
    for (const Example& each : examples) {
        std::string expected = openT;
        expected.append("Token: 4 (T_TEXT) \"").append(each.second).append("\"\n");
        EXPECT_EQ(tokensOf("<t\n>" + each.first + "</t >"), expected + closeT);
    }
    EXPECT_EQ(tokensOf("<t> \t\r\n</t>"), openT + closeT);
    EXPECT_EQ(tokensOf("<t>ab&amp;&c</t>"), openT + "Token: 4 (T_TEXT) \"ab&\"\n");
}

TEST(Tokenizer, EndsAtWhatIsNotInItsDialect) {
    for (const std::string text : {"<!DOCTYPE x>",
                                   "<![CDATA[x]]>",
                                   "<?php x?>",
                                   "<?xml encoding='x'?>",
                                   "<?xml version='1' standalone='' encoding=''?>",
                                   "<?xml version='1'encoding='x'?>",
                                   "<a b>",
                                   "<a b=c>",
                                   "<a b='1'c='2'>",
                                   "<a b='<'>",
                                   "<a b='&'>",
                                   "<a:b/>",
                                   "<a.b/>",
                                   "<1/>",
                                   "< a/>",
                                   "<a/ >",
                                   "</t a='1'>",
                                   "&#;",
                                   "&#X41;",
                                   "&lt ",
                                   "<!-- a -- b -->",
                                   "<!-- a --->",
                                   "<!-- a control character far inside \x01 -->",
                                   "<!---\v-->"})
        EXPECT_EQ(tokensOf("<t>" + text + "<a/>"), openT) << text;
}

}  // namespace
