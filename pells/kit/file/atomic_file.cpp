#include "pells/kit/file/atomic_file.h"

#include <boost/filesystem/operations.hpp>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <random>
#include <system_error>

#include "pells/kit/file/temporary_file.h"

namespace pells {
namespace kit {

namespace fs = boost::filesystem;

namespace {

/// Each "x" stands for a digit.
const char temporaryPattern[] = ".pells-xxxx-xxxx-xxxx.tmp";
const char hexDigits[] = "0123456789abcdef";

/// The file that a path names, symbolic links resolved.
std::string resolveDestination(const std::string& path) {
    boost::system::error_code error;
    const fs::file_status status = fs::status(path, error);
    if (fs::exists(status) && !fs::is_regular_file(status))
        throw FileError(path, fs::is_directory(status) ? "Is a directory" : "Not a regular file");
    if (!fs::is_symlink(fs::symlink_status(path, error)))
        return path;
    const fs::path target = fs::canonical(path, error);
    if (error)
        throw FileError(path, error.message());
    return target.string();
}

}  // namespace

FileError::FileError(const std::string& filePath, const std::string& why)
    : std::runtime_error(filePath + ": " + why), path(filePath), reason(why) {}

FileError::FileError(const std::string& filePath, int errorNumber)
    : FileError(filePath, std::generic_category().message(errorNumber)) {}

FileError::~FileError() = default;

AtomicFile::AtomicFile(const std::string& path)
    : destination(resolveDestination(path)),
      temporary(new detail::TemporaryFile(destination)),
      written(0) {}

AtomicFile::~AtomicFile() = default;

void AtomicFile::write(const void* bytes, std::size_t count) {
    if (count != 0 && std::fwrite(bytes, 1, count, temporary->stream()) != count)
        throw FileError(destination, errno);
    written += count;
}

void AtomicFile::overwrite(long offset, const void* bytes, std::size_t count) {
    std::FILE* const file = temporary->stream();
    if (std::fseek(file, offset, SEEK_SET) != 0 || std::fwrite(bytes, 1, count, file) != count ||
        std::fseek(file, 0, SEEK_END) != 0)
        throw FileError(destination, errno);
}

void AtomicFile::commit() {
    // Gone at the end of the call, whatever comes of it.
    const std::unique_ptr<detail::TemporaryFile> complete = std::move(temporary);
    complete->rename();
}

void AtomicFile::removeOnSignal() {
    detail::TemporaryFile::removeOnSignal();
}

bool AtomicFile::isTemporaryName(const std::string& name) {
    if (name.size() != sizeof temporaryPattern - 1)
        return false;
    for (std::size_t i = 0; i < name.size(); ++i) {
        const bool isDigit = std::strchr(hexDigits, name[i]) != nullptr && name[i] != '\0';
        if (temporaryPattern[i] == 'x' ? !isDigit : name[i] != temporaryPattern[i])
            return false;
    }
    return true;
}

std::string detail::randomTemporaryName() {
    std::random_device random;
    std::string name = temporaryPattern;
    for (char& each : name) {
        if (each == 'x')
            each = hexDigits[random() % 16];
    }
    return name;
}

}  // namespace kit
}  // namespace pells
