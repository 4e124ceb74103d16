// Documents that are cut off or damaged at any byte, and streams that fail there.

#include <gtest/gtest.h>

#include <sstream>

#include "support/everything.h"
#include "support/test_prefs.h"

namespace {

const char document[] =
    "<root><f>2.5</f><i>-12</i><s>a &lt; b</s><c r='0.5'/><material><ambdiff>1</ambdiff></material>"
    "<history><steps><step class='CountingStep'><label>one</label></step></steps></history>"
    "<child class='Everything'><i>2</i><ints><int>7</int></ints></child><!-- end -->"
    "<matrices><matrix><matrix>1</matrix></matrix></matrices></root>";

/// Gives a text up to some character and then throws.
class ThrowingBuffer : public std::streambuf {
public:
    explicit ThrowingBuffer(std::string readable) : text(std::move(readable)) {
        setg(&text[0], &text[0], &text[0] + text.size());
    }

protected:
    int_type underflow() override { throw std::runtime_error("broken"); }

private:
    std::string text;
};

class DamagedDocument : public pells_test::LibraryTest {
protected:
    DamagedDocument() { pells_test::prefs()["log"] = "-*"; }

    /// Loads from a stream; returns the message of the exception. The object stays usable.
    static std::string outcome(std::istream& in) {
        pells_test::Everything object;
        std::string message;
        try {
            pells::XMLTokenizer tokenizer(in);
            const auto token = tokenizer.getToken();
            if (token.type == pells::XMLTokenizer::Token::T_OPEN) {
                pells::OpenTag root(tokenizer, token);
                object.load(root, nullptr);
            }
        } catch (const std::runtime_error& failure) {
            message = failure.what();
        }
        pells_test::load(object, "<root><u>5</u></root>");
        EXPECT_EQ(object.u, 5u);
        EXPECT_FALSE(pells_test::saved(object).empty());
        return message;
    }

    static std::string outcome(const std::string& text) {
        std::istringstream in(text);
        return outcome(in);
    }
};

TEST_F(DamagedDocument, CutOffAnywhereEndsTooEarly) {
    const std::string whole = document;
    EXPECT_EQ(outcome(whole), "");
    for (std::size_t size = std::string("<root>").size(); size < whole.size(); ++size)
        EXPECT_EQ(outcome(whole.substr(0, size)), "Malformed XML: premature EOF") << size;
}

TEST_F(DamagedDocument, WithAnyByteChangedFailsOrLoads) {
    const std::string whole = document;
    for (std::size_t at = 0; at < whole.size(); ++at) {
        for (const char other :
             {'<', '>', '&', '"', '\0', '\xFF', static_cast<char>(whole[at] ^ 1)})
            outcome(whole.substr(0, at) + other + whole.substr(at + 1));
    }
}

TEST_F(DamagedDocument, FromAStreamThatThrowsEndsThereOrThrows) {
    const std::string whole = document;
    for (std::size_t size = std::string("<root>").size(); size < whole.size(); ++size) {
        ThrowingBuffer quiet(whole.substr(0, size));
        std::istream silent(&quiet);
        EXPECT_EQ(outcome(silent), "Malformed XML: premature EOF") << size;

        ThrowingBuffer loud(whole.substr(0, size));
        std::istream throwing(&loud);
        throwing.exceptions(std::ios_base::badbit);
        EXPECT_EQ(outcome(throwing), "broken") << size;
    }
}

}  // namespace
