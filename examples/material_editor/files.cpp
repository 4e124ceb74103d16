#include "files.h"

#include <pells/kit/file/atomic_file.h>
#include <pells/xml/tag.h>
#include <pells/xml/tokenizer.h>

#include <cerrno>
#include <cstring>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace material_editor {

namespace {

std::runtime_error failure(const std::string& operation, const std::string& path,
                           const std::string& reason) {
    return std::runtime_error(operation + " '" + path + "': " + reason);
}

}  // namespace

std::string toXml(const std::string& rootName, pells::Serializable& object) {
    std::ostringstream document;
    document.precision(9);  // enough for every float to come back as it was
    pells::OutTag root(document, rootName);
    object.save(root);
    return document.str();
}

void fromXml(std::istream& in, const std::string& rootName, pells::Serializable& object) {
    typedef pells::XMLTokenizer::Token Token;
    pells::XMLTokenizer tokenizer(in);
    const Token token = tokenizer.getToken();
    const bool isElement = token.type == Token::T_OPEN || token.type == Token::T_SINGLE;
    if (!isElement || token.value != rootName)
        throw std::runtime_error("does not begin with <" + rootName + ">");

    // An element with content and an empty one are read by different tags.
    if (token.type == Token::T_OPEN) {
        pells::OpenTag root(tokenizer, token);
        object.load(root, nullptr);
    } else {
        pells::SingleTag root(tokenizer, token);
        object.load(root, nullptr);
    }
}

void readFile(const std::string& path, const std::string& rootName, pells::Serializable& object) {
    errno = 0;
    std::ifstream file(path);
    // Opening a folder succeeds; only reading it fails.
    if (!file || file.peek() == std::ifstream::traits_type::eof()) {
        throw failure("cannot read", path, errno != 0 ? std::strerror(errno) : "It is empty");
    }
    try {
        fromXml(file, rootName, object);
    } catch (const std::exception& reason) {
        throw std::runtime_error(path + ": " + reason.what());
    }
}

void writeFile(const std::string& path, const std::string& text) {
    try {
        pells::kit::AtomicFile file(path);
        file.write(text.data(), text.size());
        file.commit();
    } catch (const pells::kit::FileError& reason) {
        throw failure("cannot write", path, reason.getReason());
    }
}

}  // namespace material_editor
