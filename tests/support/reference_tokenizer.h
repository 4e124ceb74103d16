#pragma once

#include <memory>
#include <string>
#include <vector>

#include "pells/xml/tokenizer.h"

namespace pells_test {

/// The tokenizer's grammar written as rules of a parser library: slow, and plain to read. What it
/// takes a text for is what the tokenizer must take it for.
class ReferenceTokenizer {
public:
    ReferenceTokenizer();
    ~ReferenceTokenizer();

    /// The tokens of a text; the last one is T_EOF.
    std::vector<pells::XMLTokenizer::Token> tokens(const std::string& text);

private:
    class Grammar;
    std::unique_ptr<Grammar> grammar;
};

}  // namespace pells_test
