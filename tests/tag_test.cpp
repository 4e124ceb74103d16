#include "pells/xml/tag.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <list>
#include <random>

namespace {

using pells::AttrMap;
using pells::OutTag;

typedef std::vector<std::pair<std::string, std::string>> Pairs;

/// The order of the attributes by its definition: chains of a hash table, grown at the front.
Pairs chained(const Pairs& added) {
    std::size_t buckets = 193;
    for (const std::size_t prime : {389u, 769u, 1543u, 3079u})
        buckets = added.size() > buckets ? prime : buckets;
    std::vector<std::list<Pairs::value_type>> table(buckets);
    for (const auto& attr : added) {
        std::uint32_t hash = 0;
        for (const char c : attr.first)
            hash = hash * 5 + static_cast<std::uint32_t>(static_cast<signed char>(c));
        table[hash % buckets].push_front(attr);
    }
    Pairs visited;
    for (const auto& chain : table)
        visited.insert(visited.end(), chain.begin(), chain.end());
    return visited;
}

TEST(Attributes, AreVisitedLikeTheChainsOfAHashTable) {
    std::mt19937 random(20);
    for (const std::size_t count : {0u, 1u, 2u, 16u, 17u, 150u, 193u, 194u, 390u, 2000u}) {
        AttrMap attrs;
        Pairs added;
        while (added.size() < count) {
            std::string name(1 + random() % 4, 'x');
            for (char& c : name)
                c = static_cast<char>(random() % 256);
            const std::string value = std::to_string(random());
            attrs.set(name, value);
            const auto known = std::find_if(added.begin(), added.end(),
                                            [&](const auto& attr) { return attr.first == name; });
            if (known == added.end())
                added.emplace_back(name, value);
            else
                known->second = value;
        }
        EXPECT_EQ(Pairs(attrs.begin(), attrs.end()), chained(added)) << count;
    }
}

TEST(Attributes, OfATokenKeepTheLastOfEqualNames) {
    Pairs list = {{"x", "1"}, {"y", "2"}, {"x", "3"}};
    AttrMap attrs;
    attrs.assign(Pairs(list));
    EXPECT_EQ(Pairs(attrs.begin(), attrs.end()), (Pairs{{"x", "3"}, {"y", "2"}}));

    list.clear();
    for (int i = 0; i < 200000; ++i)
        list.emplace_back("n" + std::to_string(i % 150000), std::to_string(i));
    attrs.assign(std::move(list));
    EXPECT_EQ(attrs.size(), 150000u);
    EXPECT_EQ(*attrs.find("n7"), "150007");
    EXPECT_EQ(*attrs.find("n50000"), "50000");
    EXPECT_EQ(attrs.find("n150000"), nullptr);
    EXPECT_EQ(std::distance(attrs.begin(), attrs.end()), 150000);
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
    root.writeCloseTag(true);
    EXPECT_EQ(out.str(),
              "<root q=\"&lt;&quot;&amp;'>\">\n"
              "    <child a=\"2\" b=\"1b\" g=\"1g\" r=\"1r\"/>\n"
              "        <renamed>a&lt;b &amp;&amp; &quot;c&quot;></renamed>\n"
              "    </renamed>\n"
              "</root>\n");
}

TEST(InTags, HaveTheLastOfEqualAttributesAndCopiesTheTextFromItsStart) {
    std::istringstream in;
    pells::XMLTokenizer tokenizer(in);
    pells::XMLTokenizer::Token token;
    token.attrs = {{"x", "1"}, {"x", "2"}};
    const pells::OpenTag tag(tokenizer, token);
    EXPECT_EQ(tag.getAttr("x"), "2");
    EXPECT_EQ(tag.getAttr("y"), "");
    token.type = pells::XMLTokenizer::Token::T_TEXT;
    token.value = "12 13";
    pells::OpenTag text(tokenizer, token);
    int number = 0;
    text.textStream() >> number;
    pells::OpenTag copy(text);
    copy.textStream() >> number;
    EXPECT_EQ(number, 12);
    text.textStream() >> number;
    EXPECT_EQ(number, 13);
}

}  // namespace
