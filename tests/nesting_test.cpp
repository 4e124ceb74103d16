#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <streambuf>

#include "pells/serial/member_field.h"
#include "support/test_prefs.h"

#if !defined(_WIN32)
#include <pthread.h>
#endif

namespace {

using boost::intrusive_ptr;
using pells::ClassDesc;
using pells::Field;
using pells::makeField;
using pells::OpenTag;
using pells::Serializable;
using pells::XMLTokenizer;

/// Delivers a document of nested elements without holding it.
class NestedDocument : public std::streambuf {
public:
    NestedDocument(std::string open, std::string close, std::size_t count)
        : pieces{"<root>", std::move(open), std::move(close), "<x>5</x></root>"},
          left{1, count, count, 1} {}

protected:
    int_type underflow() override {
        while (at != 4 && left[at] == 0)
            ++at;
        if (at == 4)
            return traits_type::eof();
        --left[at];
        setg(&pieces[at][0], &pieces[at][0], &pieces[at][0] + pieces[at].size());
        return traits_type::to_int_type(*gptr());
    }

private:
    std::string pieces[4];
    std::size_t left[4];
    std::size_t at = 0;
};

struct Node : Serializable {
    int x = 0;
    std::vector<Node> nodes;

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name,
                             ClassDesc(makeField("nodes", &Node::nodes), makeField("x", &Node::x)));
    }
};

void load(Serializable& object, NestedDocument& document) {
    std::istream in(&document);
    XMLTokenizer tokenizer(in);
    OpenTag root(tokenizer, tokenizer.getToken());
    object.load(root, nullptr);
}

class NestingTest : public pells_test::LibraryTest {};

TEST_F(NestingTest, SkipsUnrecognisedElementsAtAnyDepth) {
    NestedDocument document("<unknown-element>", "</unknown-element>", 300000);
    Node node;
    load(node, document);
    EXPECT_EQ(node.x, 5);
}

class LimitTest : public NestingTest {
protected:
    ~LimitTest() override { pells::InTag::setMaximumDepth(before); }

    const unsigned before = pells::InTag::maximumDepth();
};

TEST_F(LimitTest, RefusesObjectsBeyondIt) {
    pells::InTag::setMaximumDepth(7);
    const std::string open = "<nodes><node>";
    const std::string close = "</node></nodes>";
    // The root, three times two elements of the sequence, and the number in the root.
    NestedDocument fits(open, close, 3);
    Node node;
    load(node, fits);
    ASSERT_EQ(node.nodes.size(), 1u);
    EXPECT_EQ(node.nodes[0].nodes.at(0).nodes.size(), 1u);

    NestedDocument tooDeep(open, close, 1000000);
    try {
        load(node, tooDeep);
        FAIL() << "the document was accepted";
    } catch (const Serializable::LoadFail& fail) {
        EXPECT_STREQ(fail.what(), "Malformed XML: nested too deeply");
    }
    EXPECT_EQ(node.nodes.size(), 2u);
}

#if !defined(_WIN32)

void* loadToTheLimit(void* result) {
    NestedDocument document("<nodes><node>", "</node></nodes>", 1000000);
    Node node;
    try {
        load(node, document);
    } catch (const Serializable::LoadFail& fail) {
        *static_cast<std::string*>(result) = fail.what();
    }
    return nullptr;
}

TEST_F(NestingTest, NeedsNoMoreThanAMegabyteOfStack) {
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    ASSERT_EQ(pthread_attr_setstacksize(&attributes, 1u << 20), 0);
    std::string result;
    pthread_t thread;
    ASSERT_EQ(pthread_create(&thread, &attributes, loadToTheLimit, &result), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
    EXPECT_EQ(result, "Malformed XML: nested too deeply");
}

#endif

}  // namespace
