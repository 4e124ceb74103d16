// Documents that are cut off, damaged at any byte or nested without end, and streams that fail.

#include "support/chunked_buffer.h"
#include "support/everything.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

#if !defined(_WIN32)
#include <pthread.h>
#endif

namespace {

using boost::intrusive_ptr;
using pells::InTag;
using pells::Serializable;
using namespace pells_test;

const std::string document =
    "<root><f>2.5</f><i>-12</i><s>a &lt; b</s><c r='0.5'/><material><ambdiff>1</ambdiff></material>"
    "<history><stack><stackItem class='CountingStep'><label>one</label></stackItem></stack>"
    "</history><child class='Everything'><i>2</i><ints><int>7</int></ints></child><!-- end -->"
    "<matrices><matrice><matriceItem>1</matriceItem></matrice></matrices></root>";

class DamagedDocument : public pells_test::LibraryTest {
protected:
    DamagedDocument() { pells_test::prefs()["log"] = "-*"; }

    /// Loads from a stream; returns the message of the exception. The object stays usable.
    static std::string outcome(std::istream& in) {
        Everything object;
        std::string message = thrown<std::runtime_error>([&] { pells_test::load(object, in); });
        pells_test::load(object, "<root><u>5</u></root>");
        EXPECT_EQ(object.u, 5u);
        EXPECT_FALSE(pells_test::saved(object).empty());
        return message;
    }
};

TEST_F(DamagedDocument, CutOffAnywhereEndsTooEarlyOrWithTheErrorOfTheStream) {
    Everything whole;
    pells_test::load(whole, document);
    EXPECT_EQ(whole.history.getUndoStackSize(), 1) << "what is cut should be known";
    for (std::size_t size = std::string("<root>").size(); size <= document.size(); ++size) {
        const std::string text = document.substr(0, size);
        for (const char* const wanted : {"Malformed XML: premature EOF", "damaged"}) {
            pells_test::ChunkedBuffer buffer(text, size % 16, true);
            std::istream in(&buffer);
            if (wanted == std::string("damaged"))
                in.exceptions(std::ios_base::badbit);
            EXPECT_EQ(outcome(in), size < document.size() ? wanted : "") << "cut at " << size;
            EXPECT_EQ(in.bad(), size < document.size());
        }
    }
}

TEST_F(DamagedDocument, WithAnyByteChangedFailsOrLoads) {
    for (std::size_t at = 0; at < document.size(); ++at) {
        for (const char other :
             {'<', '&', '"', '\0', '\xFF', static_cast<char>(document[at] ^ 1)}) {
            std::istringstream in(std::string(document).replace(at, 1, 1, other));
            outcome(in);
        }
    }
}

/// Loads elements nested so often, with a number behind them; returns why they are refused.
std::string nestingFailure(Everything& object, const std::string& tag, int depth) {
    std::string text;
    for (int i = 0; i < depth; ++i)
        text += '<' + tag + '>';
    for (int i = 0; i < depth; ++i)
        text += "</" + tag.substr(0, tag.find(' ')) + '>';
    return failure(object, "<root>" + text + "<i>5</i></root>");
}

const char child[] = "child class='Everything'";
const char tooDeep[] = "Malformed XML: nested too deeply";

TEST_F(DamagedDocument, NestedBeyondTheLimitIsRefusedUnlessItIsSkipped) {
    const unsigned before = InTag::maximumDepth();
    InTag::setMaximumDepth(7);
    Everything object;
    EXPECT_EQ(nestingFailure(object, child, 6), "");
    EXPECT_EQ(nestingFailure(object, child, 7), tooDeep);
    InTag::setMaximumDepth(before);
    EXPECT_EQ(nestingFailure(object, "unknown-element", 300000), "");
    EXPECT_EQ(object.i, 5);
}

/// An object so deep, with a text or a colour as its innermost element.
intrusive_ptr<Everything> nested(unsigned depth, bool inVectors) {
    intrusive_ptr<Everything> object(new Everything);
    for (unsigned level = 1; level < depth; ++level) {
        const intrusive_ptr<Everything> outer(new Everything);
        if (inVectors)
            outer->children.push_back(object);
        else
            outer->child = object;
        object = outer;
    }
    return object;
}

// What is saved can be loaded, and what could not be loaded is not saved.
TEST_F(DamagedDocument, IsRefusedAtSavingWhereLoadingWouldRefuseIt) {
    const unsigned before = InTag::maximumDepth();
    int refused = 0;
    for (const bool inVectors : {false, true}) {
        for (unsigned limit = 1; limit < 12; ++limit) {
            InTag::setMaximumDepth(before);
            const intrusive_ptr<Everything> object = nested(4, inVectors);
            const std::string whole = saved(*object);
            InTag::setMaximumDepth(limit);
            Everything copy;
            const bool loads = failure(copy, whole).empty();
            const std::string reason = thrown<Serializable::SaveFail>([&] { saved(*object); });
            EXPECT_EQ(reason.empty(), loads) << limit << ' ' << reason;
            refused += loads ? 0 : 1;
        }
    }
    EXPECT_EQ(refused, 5 + 8) << "the texts of materials are the deepest";
    InTag::setMaximumDepth(before);

    const intrusive_ptr<Everything> circle(new Everything);
    circle->child = circle;
    std::string path = "root";
    for (unsigned depth = 2; depth < before; ++depth)
        path += "/child";
    EXPECT_EQ(thrown<Serializable::SaveFail>([&] { saved(*circle); }),
              "Nested too deeply to be loaded: " + path + "/material/shininess");
    circle->child = nullptr;
}

TEST_F(DamagedDocument, LargerThanTheLimitIsRefusedFromItsRootOn) {
    const std::uint64_t before = InTag::maximumDocumentSize();
    const std::string content = "<words><word>x</word></words></root>";
    InTag::setMaximumDocumentSize(content.size());
    Everything object;
    std::istringstream two("<root>" + content + "<root>" + content);
    pells::XMLTokenizer tokenizer(two);
    for (int i = 0; i < 2; ++i) {
        pells::OpenTag root(tokenizer, tokenizer.getToken());
        object.load(root, nullptr);
    }
    EXPECT_EQ(failure(object, "<root>" + content.substr(0, 7) + ' ' + content.substr(7)),
              "XML document goes on beyond byte 42");
    EXPECT_EQ(object.words.size(), 3u) << "what came before stays";
    InTag::setMaximumDocumentSize(before);
}

#if !defined(_WIN32)

TEST_F(DamagedDocument, NestedInObjectsNeedsNoMoreThanAMegabyteOfStack) {
    const auto loadToTheLimit = [](void* result) -> void* {
        Everything object;
        *static_cast<std::string*>(result) = nestingFailure(object, child, 100000);
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
    EXPECT_EQ(result, tooDeep);
}

#endif

}  // namespace
