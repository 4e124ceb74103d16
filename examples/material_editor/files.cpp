#include "files.h"

#include <pells/xml/tag.h>
#include <pells/xml/tokenizer.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace material_editor {

namespace fs = std::filesystem;

namespace {

std::runtime_error failure(const std::string& operation, const std::string& path,
                           const std::string& reason) {
    return std::runtime_error(operation + " '" + path + "': " + reason);
}

/// A file that nobody else has, beside another one; gone with this object unless it is renamed.
class NewFile {
public:
    explicit NewFile(const fs::path& neighbour) {
        // "x" makes fopen() fail where the file exists.
        for (int number = 1; !file; ++number) {
            path = neighbour.string() + ".new" + std::to_string(number);
            file = std::fopen(path.string().c_str(), "wx");
            if (!file && errno != EEXIST)
                throw std::runtime_error(std::strerror(errno));
        }
    }
    NewFile(const NewFile&) = delete;
    NewFile& operator=(const NewFile&) = delete;
    ~NewFile() {
        if (file)
            std::fclose(file);
        std::error_code ignored;
        if (!path.empty())
            fs::remove(path, ignored);
    }

    void write(const std::string& text) {
        const bool written = std::fwrite(text.data(), 1, text.size(), file) == text.size();
        // Closing writes what is still buffered, so it may be what finds the disk full.
        const bool closed = std::fclose(file) == 0;
        const int reason = errno;
        file = nullptr;
        if (!written || !closed)
            throw std::runtime_error(std::strerror(reason));
    }

    void renameTo(const fs::path& target) {
        std::error_code reason;
        fs::rename(path, target, reason);
        if (reason)
            throw std::runtime_error(reason.message());
        path.clear();
    }

private:
    fs::path path;
    std::FILE* file = nullptr;
};

/// The file that a path leads to, through symbolic links. It need not exist.
fs::path targetOf(const std::string& path) {
    std::error_code reason;
    fs::path target = fs::weakly_canonical(path, reason);
    if (reason)
        throw std::runtime_error(reason.message());
    // A folder could not be replaced, but a device such as /dev/null would be gone.
    const fs::file_status status = fs::status(target, reason);
    if (fs::exists(status) && !fs::is_regular_file(status))
        throw std::runtime_error("Not a regular file");
    return target;
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
        const fs::path target = targetOf(path);
        NewFile file(target);
        file.write(text);
        file.renameTo(target);
    } catch (const std::exception& reason) {
        throw failure("cannot write", path, reason.what());
    }
}

}  // namespace material_editor
