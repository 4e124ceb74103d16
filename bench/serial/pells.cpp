#include <stdexcept>

#include "bench/serial/contestants.h"
#include "pells/xml/tag.h"

namespace bench {

void saveByPells(Table& table, std::ostream& out) {
    pells::OutTag root(out, "imagedefs");
    table.save(root);
}

void loadByPells(Table& table, std::istream& in) {
    pells::XMLTokenizer tokenizer(in);
    const pells::XMLTokenizer::Token token = tokenizer.getToken();
    if (token.value != "imagedefs")
        throw std::runtime_error("no table of pictures");
    pells::OpenTag root(tokenizer, token);
    table.load(root, nullptr);
}

}  // namespace bench
