// The tokenizer against the same grammar written as parser rules, token by token.

#include <gtest/gtest.h>

#include <map>
#include <random>

#include "pells/xml/tokenizer.h"
#include "support/chunked_buffer.h"
#include "support/mutated.h"
#include "support/reference_tokenizer.h"

namespace {

using pells::XMLTokenizer;
typedef XMLTokenizer::Token Token;

std::string describe(const Token& token) {
    std::string text = std::to_string(token.type) + ' ' + ::testing::PrintToString(token.value);
    for (const Token::Attribute& attr : token.attrs)
        text += ' ' + ::testing::PrintToString(attr);
    return text;
}

/// The alternatives of each symbol, which texts name behind a "$"; the first one leads to an end.
const std::map<char, std::vector<std::string>> rules = {
    {'D', {"", "$M", "$M$M$D", "$T$M$D", "$R$T$S$M$D"}},
    {'M',
     {"<$N/>", "<$N$A$S>", "<$N$A$A$A$A/>", "</$N$S>", "<!--$c-->", "<!--$c -x$c-->$T",
      "<?xml version$Q$S?>", "<?xml version$Q encoding$Q standalone$Q?>",
      "<?xml\nversion$Q standalone$Q?>"}},
    {'N', {"a", "-b", "c_1-2", "xml", "a-name-that-is-longer-than-sixteen-bytes"}},
    {'A', {"", " $N$Q", "\n$N$Q$A", " a$Q$S b$Q$A"}},
    {'Q', {"=''", "$S=$S\"$T'\"", "=\"$T$R$T\"", "='$T$R\"$T'"}},
    {'T', {"", "x", ">", "]]>", "\x01", "\xC3\xA4", "\xFF ", "- ;$T", "text of twenty bytes$T"}},
    {'R',
     {"&amp;", "&lt;", "&gt;", "&apos;", "&quot;", "&$N;", "&#65;", "&#x4aD;",
      "&#x10000000000000041;"}},
    {'S', {"", " ", "\t", "\r\n", "\n                    "}},
    {'c', {"", "<&", " >\n$c", "comments of twenty bytes$c"}},
};

/// Makes the same texts on every machine.
class XmlGenerator {
public:
    /// A text made by the rules of a symbol.
    std::string text(char symbol, int depth = 0) {
        const std::vector<std::string>& alternatives = rules.at(symbol);
        const std::string& chosen = alternatives[depth > 20 ? 0 : random() % alternatives.size()];
        std::string made;
        for (std::size_t at = 0; at < chosen.size(); ++at)
            made += chosen[at] == '$' ? text(chosen[++at], depth + 1) : chosen.substr(at, 1);
        return made;
    }

    std::string damaged() {
        const std::string interesting = "<>&;#x-!?/='\" \n[]:.a0\x01\x7F\xFF";
        return pells_test::mutated(text('D'), interesting, random);
    }

private:
    std::mt19937 random{1};
};

class TokenizerReference : public ::testing::Test {
protected:
    /// Reads a text through buffers that show it whole and in pieces.
    void compare(const std::string& text) {
        expected = pells_test::referenceTokens(text);
        const std::size_t sizes[] = {text.size() + 1, 0, 1, 2, 3, 7};
        for (const std::size_t size : sizes) {
            pells_test::ChunkedBuffer buffer(text, size);
            std::istream in(&buffer);
            XMLTokenizer tokenizer(in);
            for (const Token& wanted : expected) {
                const Token token = tokenizer.getToken();
                if (describe(token) != describe(wanted))
                    FAIL() << "pieces of " << size << " of " << ::testing::PrintToString(text)
                           << "\nexpected " << describe(wanted) << "\ngot      " << describe(token);
            }
        }
    }

    XmlGenerator generator;
    std::vector<Token> expected;
};

TEST_F(TokenizerReference, AgreesOnWellFormedDocuments) {
    for (int left = 20000; left > 0 && !HasFailure(); --left) {
        const std::string text = generator.text('D');
        compare(text + "<end/>");
        ASSERT_TRUE(expected.size() > 1 && expected.rbegin()[1].value == "end")
            << "outside the dialect: " << text;
    }
}

TEST_F(TokenizerReference, AgreesOnDamagedDocuments) {
    for (int left = 30000; left > 0 && !HasFailure(); --left)
        compare(generator.damaged());
}

}  // namespace
