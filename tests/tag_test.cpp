#include "pells/xml/tag.h"

#include <gtest/gtest.h>

#include <sstream>
#include <utility>
#include <vector>

namespace {

using pells::AttrMap;
using pells::OutTag;

typedef std::vector<std::pair<std::string, std::string>> Pairs;

TEST(Attributes, AreVisitedByTheRestOfTheirHashTheLastAddedFirst) {
    AttrMap attrs;
    for (const char* const name : {"x", "name", "\xE9", "Qe"})
        attrs.set(name, "");
    EXPECT_EQ(Pairs(attrs.begin(), attrs.end()),
              (Pairs{{"name", ""}, {"\xE9", ""}, {"Qe", ""}, {"x", ""}}));
    attrs.set("x", "new");
    attrs.set("a", "");
    EXPECT_EQ(Pairs(attrs.begin(), attrs.end()),
              (Pairs{{"name", ""}, {"\xE9", ""}, {"a", ""}, {"Qe", ""}, {"x", "new"}}));
}

TEST(Attributes, OfATokenKeepTheLastOfEqualNames) {
    const std::pair<int, const char*> firstVisited[] = {
        {2, "n0"}, {193, "n95"}, {194, "n100"}, {150000, "n0"}};
    for (const auto& each : firstVisited) {
        const int names = each.first;
        Pairs list;
        for (int i = 0; i <= names; ++i)
            list.emplace_back("n" + std::to_string(i % names), std::to_string(i));
        AttrMap attrs;
        attrs.assign(std::move(list));
        EXPECT_EQ(attrs.size(), static_cast<std::size_t>(names));
        EXPECT_EQ(*attrs.find("n0"), std::to_string(names));
        EXPECT_EQ(*attrs.find("n1"), "1");
        EXPECT_EQ(attrs.begin()->first, each.second);
    }
}

TEST(OutTags, WriteLinesOfTheirDepth) {
    std::ostringstream out;
    OutTag root(out, "root");
    root.setAttr("q", "<\"&'>");
    root.writeOpenTag(true);
    OutTag child(root, "child");
    for (const char* name : {"r", "g", "b", "a"})
        child.setAttr(name, std::string("1") + name);
    child.beginAttrs()->second = "2";
    child.writeSingleTag();
    child.clearAttrs();
    child.setTag("renamed");
    OutTag grandchild(child);
    grandchild.writeOpenTag(false);
    grandchild.writeText("a<b && \"c\">");
    grandchild.writeCloseTag(false);
    child.writeCloseTag(true);
    EXPECT_EQ(out.str(),
              "<root q=\"&lt;&quot;&amp;'>\">\n"
              "    <child a=\"2\" b=\"1b\" g=\"1g\" r=\"1r\"/>\n"
              "        <renamed>a&lt;b &amp;&amp; &quot;c&quot;></renamed>\n"
              "    </renamed>\n");
}

TEST(Attributes, AreCopiedWithTheirIndex) {
    AttrMap attrs;
    for (int i = 0; i < 100; ++i)
        attrs.set("n" + std::to_string(i), "old");
    const AttrMap copy(attrs);
    attrs.set("n99", "new");
    EXPECT_EQ(*copy.find("n99"), "old");
    AttrMap assigned;
    assigned = attrs;
    EXPECT_EQ(*assigned.find("n99"), "new");
    EXPECT_EQ(Pairs(assigned.begin(), assigned.end()), Pairs(attrs.begin(), attrs.end()));
}

TEST(Tags, AreCopiedAndMadeOfTokensThatStay) {
    typedef pells::XMLTokenizer::Token Token;
    std::istringstream in("<root a='1'/>");
    pells::XMLTokenizer tokenizer(in);
    const Token root = tokenizer.getToken();
    pells::SingleTag single(tokenizer, root);
    const pells::SingleTag copy(single);
    EXPECT_EQ(copy.getAttr("a"), "1");
    Token child;
    child.type = Token::T_OPEN;
    child.value = "child";
    EXPECT_EQ(pells::OpenTag(single, child).getName(), "child");
    EXPECT_EQ(pells::SingleTag(single, child).getName(), "child");
    child.type = Token::T_TEXT;
    pells::OpenTag text(single, std::move(child));
    EXPECT_EQ(text.getText(), "child");
    EXPECT_EQ(text.getName(), "");
    int scanned = 7;
    EXPECT_FALSE(pells::OpenTag(text).textStream() >> scanned);
}

struct BareTag : OutTag {
    using OutTag::OutTag;
    using OutTag::writeTagAndAttrs;
};

TEST(Tags, WriteAttributesOfAnyLength) {
    std::ostringstream out;
    BareTag tag(out, "a");
    const std::string longValue(2000, 'x');
    tag.setAttr("n", longValue);
    tag.writeTagAndAttrs();
    EXPECT_EQ(out.str(), "a n=\"" + longValue + '"');
}

}  // namespace
