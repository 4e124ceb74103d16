#pragma once

#include <cstdint>
#include <random>
#include <string>
#include <vector>

namespace pells_test {

/// Makes XML texts, the same ones on every machine.
class XmlGenerator {
public:
    explicit XmlGenerator(std::uint32_t seed) : random(seed) {}

    /// A document that the tokenizer reads to its end.
    std::string document();

    /// The text after a few characters or pieces were lost, doubled, swapped or put in.
    std::string mutated(std::string text);

    /// Fragments of markup in any order.
    std::string fragments();

    std::string bytes();

private:
    unsigned below(unsigned bound) { return static_cast<unsigned>(random() % bound); }
    bool chance(unsigned percent) { return below(100) < percent; }
    std::string name();
    std::string space(unsigned least);
    std::string quoted();
    std::string reference();
    std::string text();
    std::string declaration();
    std::string comment();
    void addContent(std::string& out, unsigned depth);
    void addElement(std::string& out, unsigned depth);

    std::mt19937 random;
};

/// XML files of this machine, up to so many bytes in all; none is very large.
std::vector<std::string> xmlFilesOfThisMachine(std::size_t totalBytes);

/// A real document without what lies outside the tokenizer's dialect: the document type, processing
/// instructions, CDATA marks, and ":" and "." in names.
std::string inDialect(const std::string& document);

}  // namespace pells_test
