#pragma once

#include <boost/spirit/include/classic_multi_pass.hpp>
#include <istream>
#include <iterator>
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

    /// The tokens of a stream, read character by character with as much memory as the longest one.
    std::vector<pells::XMLTokenizer::Token> tokens(std::istream& in);

private:
    template <class Position>
    class Grammar;

    typedef const unsigned char* InMemory;
    typedef boost::spirit::classic::multi_pass<std::istream_iterator<unsigned char>> InStream;

    std::unique_ptr<Grammar<InMemory>> inMemory;
    std::unique_ptr<Grammar<InStream>> inStream;
};

}  // namespace pells_test
