#pragma once

#include <istream>
#include <string>
#include <vector>

#include "pells/xml/tokenizer.h"

namespace pells_test {

/// The tokens of a text by the tokenizer's grammar written as rules of a parser library: slow, and
/// plain to read. What it takes a text for is what the tokenizer must take it for.
///
/// \return the tokens; the last one is T_EOF.
std::vector<pells::XMLTokenizer::Token> referenceTokens(const std::string& text);

/// The tokens of a stream, read character by character with as much memory as the longest one.
std::vector<pells::XMLTokenizer::Token> referenceTokens(std::istream& in);

}  // namespace pells_test
