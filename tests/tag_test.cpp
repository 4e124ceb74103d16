#include "pells/xml/tag.h"

#include <gtest/gtest.h>

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
    AttrMap attrs;
    Pairs added;
    for (const std::size_t count : {1u, 17u, 193u, 194u, 2000u}) {
        while (added.size() < count) {
            const std::string start(1, static_cast<char>(random()));
            added.emplace_back(start + std::to_string(added.size()), "first");
            attrs.set(added.back().first, "first");
        }
        added[0].second = std::to_string(count);
        attrs.set(added[0].first, added[0].second);
        EXPECT_EQ(Pairs(attrs.begin(), attrs.end()), chained(added)) << count;
    }
}

TEST(Attributes, OfATokenKeepTheLastOfEqualNames) {
    for (const int names : {2, 150000}) {
        Pairs list;
        for (int i = 0; i <= names; ++i)
            list.emplace_back("n" + std::to_string(i % names), std::to_string(i));
        AttrMap attrs;
        attrs.assign(std::move(list));
        EXPECT_EQ(attrs.size(), static_cast<std::size_t>(names));
        EXPECT_EQ(*attrs.find("n0"), std::to_string(names));
        EXPECT_EQ(*attrs.find("n1"), "1");
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

}  // namespace
