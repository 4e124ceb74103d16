#include <io.h>

#include <boost/filesystem/operations.hpp>
#include <cerrno>

#include "pells/kit/file/atomic_file.h"
#include "pells/kit/file/temporary_file.h"

namespace pells {
namespace kit {
namespace detail {

namespace fs = boost::filesystem;

TemporaryFile::TemporaryFile(const std::string& destinationPath) : destination(destinationPath) {
    const fs::path folderPath = fs::path(destination).parent_path();
    do {
        name = ((folderPath.empty() ? fs::path(".") : folderPath) / randomTemporaryName()).string();
        file = std::fopen(name.c_str(), "wbx");
    } while (!file && errno == EEXIST);
    if (!file)
        throw FileError(destination, errno);
}

TemporaryFile::~TemporaryFile() {
    if (file)
        std::fclose(file);
    boost::system::error_code ignored;
    if (!name.empty())
        fs::remove(name, ignored);
}

void TemporaryFile::rename() {
    keepPermissions();
    closeFile();
    boost::system::error_code error;
    fs::rename(name, destination, error);
    if (error)
        throw FileError(destination, error.message());
    name.clear();
}

void TemporaryFile::keepPermissions() {
    boost::system::error_code error;
    const fs::file_status status = fs::status(destination, error);
    if (fs::exists(status))
        fs::permissions(name, status.permissions(), error);
}

void TemporaryFile::closeFile() {
    const bool synced = std::fflush(file) == 0 && ::_commit(::_fileno(file)) == 0;
    const int syncError = errno;
    const bool closed = std::fclose(file) == 0;
    file = nullptr;
    if (!synced || !closed)
        throw FileError(destination, synced ? errno : syncError);
}

void TemporaryFile::removeOnSignal() {}

}  // namespace detail
}  // namespace kit
}  // namespace pells
