#include "pells/serial/member_field.h"
#include "support/documents.h"
#include "support/test_prefs.h"

#if !defined(_WIN32)
#include <pthread.h>
#endif

using namespace pells;

namespace {

struct Node : Serializable {
    int x = 0;
    std::vector<Node> nodes;

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name,
                             ClassDesc(makeField("nodes", &Node::nodes), makeField("x", &Node::x)));
    }
};

/// Loads elements nested so often, with the number behind them; returns why they are refused.
std::string nestingFailure(Node& node, const std::string& open, const std::string& close,
                           int depth) {
    std::string document = "<root>";
    for (int i = 0; i < depth; ++i)
        document += open;
    for (int i = 0; i < depth; ++i)
        document += close;
    return pells_test::failure(node, document + "<x>5</x></root>");
}

std::string nodesFailure(Node& node, int depth) {
    return nestingFailure(node, "<nodes><node>", "</node></nodes>", depth);
}

class NestingTest : public pells_test::LibraryTest {
protected:
    ~NestingTest() override { InTag::setMaximumDepth(before); }

    const unsigned before = InTag::maximumDepth();
    Node node;
};

TEST_F(NestingTest, SkipsUnrecognisedElementsAtAnyDepth) {
    EXPECT_EQ(nestingFailure(node, "<unknown-element>", "</unknown-element>", 300000), "");
    EXPECT_EQ(node.x, 5);
}

TEST_F(NestingTest, RefusesObjectsBeyondTheLimit) {
    InTag::setMaximumDepth(7);
    // The root, three times two elements of the sequence, and the number in the root.
    EXPECT_EQ(nodesFailure(node, 3), "");
    ASSERT_EQ(node.nodes.size(), 1u);
    EXPECT_EQ(node.nodes[0].nodes.at(0).nodes.size(), 1u);
    EXPECT_EQ(nodesFailure(node, 100000), "Malformed XML: nested too deeply");
    EXPECT_EQ(node.nodes.size(), 2u);
}

#if !defined(_WIN32)

TEST_F(NestingTest, NeedsNoMoreThanAMegabyteOfStack) {
    const auto loadToTheLimit = [](void* result) -> void* {
        Node nested;
        *static_cast<std::string*>(result) = nodesFailure(nested, 100000);
        return nullptr;
    };
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
