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

struct Example {
    const char* name;
    std::string text;
    std::string tokens;
};

class TokenizerExample : public ::testing::TestWithParam<Example> {};

TEST_P(TokenizerExample, GivesItsTokens) {
    EXPECT_EQ(tokensOf(GetParam().text), GetParam().tokens);
}

const std::string openT = "Token: 2 (T_OPEN) <t>\n";
const std::string closeT = "Token: 3 (T_CLOSE) </t>\n";

Example text(const char* name, const std::string& written, const std::string& read) {
    return {name, "<t>" + written + "</t>",
            openT + (read.empty() ? "" : "Token: 4 (T_TEXT) \"" + read + "\"\n") + closeT};
}

Example single(const char* name, const std::string& written, const std::string& read) {
    return {name, written, "Token: 1 (T_SINGLE) " + read + "\n"};
}

Example nothing(const char* name, const std::string& written) {
    return {name, "<t>" + written + "<a/>", openT};
}

INSTANTIATE_TEST_SUITE_P(
    Xml, TokenizerExample,
    ::testing::Values(
        text("Text", "1.5", "1.5"),
        single("Prolog", "<?xml version=\"1.0\"?>\n<!-- - -->\r\n<root x='1' y=\"2\"/>",
               "<root x=\"1\" y=\"2\"/>"),
        single("FullDeclaration",
               "<?xml\tversion = '1.0' encoding=\"utf-8\"\nstandalone='yes' ?><a/>", "<a/>"),
        single("StandaloneWithoutEncoding", "<?xml version='' standalone=''?><a />", "<a/>"),
        single("OddNames", "<-_9 _- = 'x'/>", "<-_9 _-=\"x\"/>"),
        single("QuotesInValues", "<a x='a&quot;>\"b' y=\"'\n\"/>", "<a x=\"a\">\"b\" y=\"'\n\"/>"),
        single("RepeatedAttribute", "<a x='1' x='2'/>", "<a x=\"1\" x=\"2\"/>"),
        Example{"SpaceBehindNames", "<t\n></t >", openT + closeT},
        text("LeadingSpaceGoes", "  x y  ", "x y  "), text("OnlySpace", " \t\r\n", ""),
        text("CommentsJoinText", "ab<!-- c -->cd", "abcd"),
        text("SpaceBehindCommentsGoes", "ab <!----> \n cd", "ab cd"),
        text("DeclarationsJoinText", "a<?xml version='1'?>b", "ab"),
        text("HyphenTakesTheBracket", "<!--->a--><!--->-->b", "b"),
        text("Entities", "a &lt; b &amp;&amp; c &gt;&apos;&quot;", "a < b && c >'\""),
        text("UnknownEntities", "&foo;&LT;&a-9_;", "???"),
        text("Numbers", "&#65;&#x41;&#x4a;&#x4A;&#233;", "AAJJ\xE9"),
        text("LowByteOfNumbers", "&#256;&#8364;&#x100000042;",
             std::string(1, '\0') + "\xAC"
                                    "B"),
        text("HugeNumbers", "&#99999999999999999999999999;&#x10000000000000000;", "\xFF\xFF"),
        text("BytesPassThrough", "\xC3\xA4\x01\x7F]]>", "\xC3\xA4\x01\x7F]]>"),
        Example{"TextUpToABareAmpersand", "<t>ab&amp;&c</t>",
                openT + "Token: 4 (T_TEXT) \"ab&\"\n"},
        nothing("Doctype", "<!DOCTYPE x>"), nothing("Cdata", "<![CDATA[x]]>"),
        nothing("Instruction", "<?php x?>"), nothing("NoVersion", "<?xml encoding='x'?>"),
        nothing("PseudoAttributesSwapped", "<?xml version='1' standalone='' encoding=''?>"),
        nothing("NoSpaceInDeclaration", "<?xml version='1'encoding='x'?>"),
        nothing("NoValue", "<a b>"), nothing("UnquotedValue", "<a b=c>"),
        nothing("NoSpaceBetweenAttributes", "<a b='1'c='2'>"), nothing("LessInValue", "<a b='<'>"),
        nothing("AmpersandInValue", "<a b='&'>"), nothing("Namespace", "<a:b/>"),
        nothing("Dot", "<a.b/>"), nothing("Digit", "<1/>"), nothing("SpaceBeforeName", "< a/>"),
        nothing("SpaceInEmptyTag", "<a/ >"), nothing("AttributeOfEndTag", "</t a='1'>"),
        nothing("NoDigits", "&#;"), nothing("CapitalX", "&#X41;"), nothing("NoSemicolon", "&lt "),
        nothing("TwoHyphens", "<!-- a -- b -->"), nothing("ThreeHyphens", "<!-- a --->"),
        nothing("ControlInComment", "<!-- a control character far inside \x01 -->"),
        nothing("ControlBehindHyphen", "<!---\v-->")),
    [](const auto& each) { return std::string(each.param.name); });

}  // namespace
