#include "tools/material_file.h"

#include <boost/filesystem/operations.hpp>
#include <cerrno>
#include <fstream>

#include "pells/material/material.h"
#include "pells/xml/tag.h"
#include "pells/xml/tokenizer.h"
#include "tools/asset_root.h"
#include "tools/atomic_file.h"

namespace pells_tool {

namespace {

namespace fs = boost::filesystem;

/// Devices may never end. Pipes do, and shells make them of `<(command)`.
void checkKind(const std::string& path) {
    boost::system::error_code reason;
    const fs::file_type type = fs::status(path, reason).type();
    if (type == fs::file_not_found || type == fs::status_error)
        throw pells::FileError(path, reason.message());
    if (type == fs::directory_file)
        throw pells::FileError(path, EISDIR);
    if (type != fs::regular_file && type != fs::fifo_file)
        throw pells::FileError(path, std::string("Not a regular file"));
}

void load(pells::Material& material, std::istream& in) {
    typedef pells::XMLTokenizer::Token Token;
    pells::XMLTokenizer tokenizer(in);
    const Token token = tokenizer.getToken();
    if (token.type == Token::T_OPEN) {
        pells::OpenTag root(tokenizer, token);
        material.load(root, nullptr);
    } else if (token.type == Token::T_SINGLE) {
        pells::SingleTag root(tokenizer, token);
        material.load(root, nullptr);
    } else {
        throw std::runtime_error("It does not begin with an XML element");
    }
}

}  // namespace

pells::Material readMaterial(const std::string& path) {
    checkKind(path);
    errno = 0;
    std::ifstream file(path, std::ios_base::binary);
    if (!file)
        throw pells::FileError(path, errno);
    pells::Material material;
    try {
        load(material, file);
    } catch (const std::exception& error) {
        throw pells::FileError(path, inWords(error.what()));
    }
    return material;
}

}  // namespace pells_tool
