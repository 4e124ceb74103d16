#include "tools/atomic_file.h"

#include <boost/filesystem/operations.hpp>
#include <cerrno>
#include <cstring>
#include <system_error>

#if defined(_WIN32)
#include <io.h>
#else
#include <fcntl.h>
#include <unistd.h>
#endif

namespace pells {

namespace fs = boost::filesystem;

namespace {

/// What removeOnSignal() removes; empty when there is nothing. A plain array, because a handler may
/// run between any two instructions.
char temporaryForSignals[4096] = "";

void rememberForSignals(const std::string& path) {
    temporaryForSignals[0] = '\0';
    if (path.empty() || path.size() >= sizeof temporaryForSignals)
        return;
    std::memcpy(temporaryForSignals + 1, path.c_str() + 1, path.size());
    temporaryForSignals[0] = path[0];
}

int syncFile(std::FILE* file) {
#if defined(_WIN32)
    return _commit(_fileno(file));
#else
    return fsync(fileno(file));
#endif
}

/// Makes a rename survive a power cut. There is nothing to be done where a file system cannot.
void syncFolder(const fs::path& folder) {
#if defined(_WIN32)
    static_cast<void>(folder);
#else
    const int descriptor = ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0)
        return;
    static_cast<void>(fsync(descriptor));
    ::close(descriptor);
#endif
}

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

fs::path folderOf(const std::string& path) {
    const fs::path folder = fs::path(path).parent_path();
    return folder.empty() ? fs::path(".") : folder;
}

}  // namespace

FileError::FileError(const std::string& path, const std::string& reason)
    : std::runtime_error(path + ": " + reason) {}

FileError::FileError(const std::string& path, int errorNumber)
    : FileError(path, std::generic_category().message(errorNumber)) {}

AtomicFile::AtomicFile(const std::string& path)
    : destination(resolveDestination(path)), file(nullptr), written(0) {
    const fs::path folder = folderOf(destination);
    temporary = (folder / fs::unique_path(".pells-%%%%-%%%%-%%%%.tmp")).string();
    // "x": a file that has the name already is somebody else's.
    file = std::fopen(temporary.c_str(), "wbx");
    if (!file)
        throw FileError(destination, errno);
    rememberForSignals(temporary);
}

AtomicFile::~AtomicFile() {
    discard();
}

void AtomicFile::write(const void* bytes, std::size_t count) {
    if (count != 0 && std::fwrite(bytes, 1, count, file) != count)
        throw FileError(destination, errno);
    written += count;
}

void AtomicFile::overwrite(long offset, const void* bytes, std::size_t count) {
    if (std::fseek(file, offset, SEEK_SET) != 0 || std::fwrite(bytes, 1, count, file) != count ||
        std::fseek(file, 0, SEEK_END) != 0)
        throw FileError(destination, errno);
}

void AtomicFile::commit() {
    try {
        keepPermissions();
        closeFile();
        boost::system::error_code error;
        fs::rename(temporary, destination, error);
        if (error)
            throw FileError(destination, error.message());
    } catch (...) {
        discard();
        throw;
    }
    rememberForSignals("");
    temporary.clear();
    syncFolder(folderOf(destination));
}

void AtomicFile::keepPermissions() {
    boost::system::error_code error;
    const fs::file_status status = fs::status(destination, error);
    if (!fs::exists(status))
        return;
    fs::permissions(temporary, status.permissions(), error);
    if (error)
        throw FileError(destination, error.message());
}

void AtomicFile::closeFile() {
    const bool synced = std::fflush(file) == 0 && syncFile(file) == 0;
    const int syncError = errno;
    const bool closed = std::fclose(file) == 0;
    file = nullptr;
    if (!synced || !closed)
        throw FileError(destination, synced ? errno : syncError);
}

void AtomicFile::discard() {
    if (file)
        std::fclose(file);
    file = nullptr;
    if (temporary.empty())
        return;
    rememberForSignals("");
    boost::system::error_code ignored;
    fs::remove(temporary, ignored);
    temporary.clear();
}

void AtomicFile::removeOnSignal() {
#if !defined(_WIN32)
    if (temporaryForSignals[0] != '\0')
        ::unlink(temporaryForSignals);
#endif
}

}  // namespace pells
