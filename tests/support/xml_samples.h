#pragma once

#include <cstdint>
#include <random>
#include <string>

#include "support/mutated.h"

namespace pells_test {

/// Makes XML texts, the same ones on every machine.
class XmlGenerator {
public:
    explicit XmlGenerator(std::uint32_t seed) : random(seed) {}

    /// A text made by the rules of a symbol. 'D': a document that the tokenizer reads to its end;
    /// 'G': fragments of markup in any order.
    std::string text(char symbol, int depth = 0);

    /// A document that was damaged in a few places.
    std::string damaged() {
        return mutated(text('D'), "<>&;#x-!?/='\" \n[]:.a0\x01\x7F\xFF", random);
    }

    std::string bytes();

private:
    std::size_t below(std::size_t bound) { return random() % bound; }

    std::mt19937 random;
};

}  // namespace pells_test
