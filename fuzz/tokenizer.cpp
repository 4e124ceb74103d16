// The tokenizer against the same grammar written as parser rules. The first byte is the size of the
// pieces that the text arrives in; 0 shows single characters.

#include "pells/xml/tokenizer.h"
#include "fuzz/support/fuzz.h"
#include "support/chunked_buffer.h"
#include "support/reference_tokenizer.h"

void fuzzOne(const std::string& input) {
    if (input.empty())
        return;
    const std::string text = input.substr(1);
    pells_test::ChunkedBuffer buffer(text, static_cast<unsigned char>(input[0]));
    std::istream in(&buffer);
    pells::XMLTokenizer tokenizer(in);
    for (const auto& wanted : pells_test::referenceTokens(text)) {
        const auto token = tokenizer.getToken();
        pells_fuzz::require(
            token.type == wanted.type && token.value == wanted.value && token.attrs == wanted.attrs,
            "the tokens are those of the grammar");
    }
}
