// The tokenizer against the same grammar written as parser rules, token by token.

#include <gtest/gtest.h>

#include <istream>

#include "pells/xml/tokenizer.h"
#include "support/chunked_buffer.h"
#include "support/reference_tokenizer.h"
#include "support/xml_samples.h"

namespace {

using pells::XMLTokenizer;
using pells_test::XmlGenerator;
typedef XMLTokenizer::Token Token;

std::string describe(const Token& token) {
    std::string text = std::to_string(token.type) + ' ' + ::testing::PrintToString(token.value);
    for (const Token::Attribute& attr : token.attrs)
        text += ' ' + ::testing::PrintToString(attr);
    return text;
}

class TokenizerReference : public ::testing::Test {
protected:
    /// Reads a text through buffers that show it whole and in pieces.
    void compare(const std::string& text) {
        expected = reference.tokens(text);
        tokens += expected.size();
        for (const std::size_t size : {text.size() + 1, std::size_t(0), std::size_t(1),
                                       std::size_t(2), std::size_t(3), std::size_t(7)}) {
            pells_test::ChunkedBuffer buffer(text, size);
            std::istream in(&buffer);
            XMLTokenizer tokenizer(in);
            for (const Token& wanted : expected) {
                const Token token = tokenizer.getToken();
                if (token.type != wanted.type || token.value != wanted.value ||
                    token.attrs != wanted.attrs)
                    FAIL() << "pieces of " << size << " of " << ::testing::PrintToString(text)
                           << "\nexpected " << describe(wanted) << "\ngot      " << describe(token);
            }
        }
    }

    pells_test::ReferenceTokenizer reference;
    std::vector<Token> expected;
    std::size_t tokens = 0;
};

TEST_F(TokenizerReference, AgreesOnWellFormedDocuments) {
    XmlGenerator generator(1);
    for (int left = 30000; left > 0 && !HasFailure(); --left) {
        const std::string text = generator.text('D');
        compare(text + "<end/>");
        ASSERT_EQ(expected.rbegin()[1].value, "end") << "outside the dialect: " << text;
    }
}

TEST_F(TokenizerReference, AgreesOnDamagedDocuments) {
    XmlGenerator generator(2);
    for (int left = 50000; left > 0 && !HasFailure(); --left)
        compare(generator.damaged());
}

TEST_F(TokenizerReference, AgreesOnFragments) {
    XmlGenerator generator(3);
    for (int left = 100000; left > 0 && !HasFailure(); --left)
        compare(generator.text('G'));
    EXPECT_GT(tokens, 200000U) << "most texts must get somewhere";
}

TEST_F(TokenizerReference, AgreesOnBytes) {
    XmlGenerator generator(4);
    for (int left = 50000; left > 0 && !HasFailure(); --left)
        compare(generator.bytes());
}

}  // namespace
