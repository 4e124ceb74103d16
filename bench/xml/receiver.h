#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>
#include <functional>

#include "pells/xml/tokenizer.h"

namespace bench {

typedef pells::XMLTokenizer::Token Token;

/// Gets tokens, each as its own, and lets go of them.
class Receiver {
public:
    /// \param digests whether to compute a digest of all tokens, to compare contestants by.
    explicit Receiver(bool digests = false) : digesting(digests) {}

    /// \return false for the token that tells of the end.
    bool take(Token token) {
        benchmark::DoNotOptimize(token.value.data());
        benchmark::DoNotOptimize(token.attrs.data());
        const bool found = token.type != Token::T_EOF;
        if (digesting && found)
            addToDigest(token);
        return found;
    }

    std::size_t digest() const { return sum; }

private:
    void addToDigest(const Token& token) {
        add(static_cast<std::size_t>(token.type));
        add(std::hash<std::string>()(token.value));
        for (const auto& [name, value] : token.attrs) {
            add(std::hash<std::string>()(name));
            add(std::hash<std::string>()(value));
        }
    }
    void add(std::size_t piece) { sum = (sum ^ piece) * 0x100000001B3; }

    bool digesting;
    std::size_t sum = 0;
};

}  // namespace bench
