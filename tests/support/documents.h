#pragma once

#include <regex>
#include <sstream>
#include <string>

#include "pells/serial/serializable.h"
#include "pells/xml/tag.h"
#include "support/thrown.h"

namespace pells_test {

inline std::string saved(pells::Serializable& object, int precision = 6) {
    std::ostringstream out;
    out.precision(precision);
    out.exceptions(std::ios_base::badbit);
    pells::OutTag root(out, "root");
    object.save(root);
    return out.str();
}

/// Without the lines and their indentation.
inline std::string compact(const std::string& document) {
    return std::regex_replace(document, std::regex("\n *"), "");
}

/// Reads the element that a document begins with, if it begins with one.
///
/// \throws pells::Serializable::LoadFail for a document that cannot be read.
inline void load(pells::Serializable& object, std::istream& in) {
    pells::XMLTokenizer tokenizer(in);
    const pells::XMLTokenizer::Token token = tokenizer.getToken();
    if (token.type == pells::XMLTokenizer::Token::T_SINGLE) {
        pells::SingleTag root(tokenizer, token);
        object.load(root, nullptr);
    } else if (token.type == pells::XMLTokenizer::Token::T_OPEN) {
        pells::OpenTag root(tokenizer, token);
        object.load(root, nullptr);
    }
}

inline void load(pells::Serializable& object, const std::string& document) {
    std::istringstream in(document);
    load(object, in);
}

/// "" or why a document is refused.
inline std::string failure(pells::Serializable& object, const std::string& document) {
    return thrown<pells::Serializable::LoadFail>([&] { load(object, document); });
}

}  // namespace pells_test
