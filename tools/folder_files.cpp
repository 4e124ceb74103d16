#include "tools/folder_files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <boost/filesystem/path.hpp>
#include <cerrno>

#include "tools/atomic_file.h"

namespace pells {

namespace fs = boost::filesystem;

namespace {

std::string withoutTrailingSlashes(std::string path) {
    while (path.size() > 1 && path.back() == '/')
        path.pop_back();
    return path;
}

bool liesBelow(const fs::path& path, const fs::path& folder) {
    const auto difference = std::mismatch(folder.begin(), folder.end(), path.begin(), path.end());
    return difference.first == folder.end();
}

/// What is known of something that is no folder.
FolderFiles::File inspect(const fs::path& path, const std::string& name,
                          const std::string& realRoot) {
    boost::system::error_code error;
    const fs::file_type type = fs::symlink_status(path, error).type();
    if (type == fs::regular_file)
        return {"", name};
    if (type != fs::symlink_file)
        return {"is no regular file", ""};
    const fs::path target = fs::canonical(path, error);
    if (error)
        return {"is a symbolic link that leads nowhere", ""};
    if (!liesBelow(target, realRoot))
        return {"is a symbolic link out of the folder", ""};
    if (fs::is_directory(target, error))
        return {"is a symbolic link to a folder; declare it in a .symlinks file instead", ""};
    if (!fs::is_regular_file(target, error))
        return {"is a symbolic link to no regular file", ""};
    return {"", target.lexically_relative(realRoot).generic_string()};
}

}  // namespace

SourceFile::SourceFile(const std::string& path)
    : SourceFile(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC), path) {}

SourceFile::SourceFile(int openDescriptor, const std::string& path)
    : name(path), descriptor(openDescriptor) {
    if (descriptor < 0)
        throw FileError(name, errno);
    try {
        checkKind();
    } catch (...) {
        ::close(descriptor);
        throw;
    }
}

SourceFile::~SourceFile() {
    ::close(descriptor);
}

void SourceFile::checkKind() {
    struct stat status;
    if (::fstat(descriptor, &status) != 0)
        throw FileError(name, errno);
    if (S_ISDIR(status.st_mode))
        throw FileError(name, EISDIR);
    if (!S_ISREG(status.st_mode))
        throw FileError(name, std::string("Not a regular file"));
    left = static_cast<std::uint64_t>(status.st_size);
}

std::size_t SourceFile::read(char* into, std::size_t room) {
    ssize_t got = 0;
    do {
        got = ::read(descriptor, into, room);
    } while (got < 0 && errno == EINTR);
    if (got < 0)
        throw FileError(name, errno);
    const std::size_t count = static_cast<std::size_t>(got);
    if (count > left || (count == 0 && left != 0))
        throw FileError(name, std::string("It changed while it was read"));
    left -= count;
    return count;
}

FolderFiles::FolderFiles(const std::string& folder) : root(withoutTrailingSlashes(folder)) {
    boost::system::error_code error;
    realRoot = fs::canonical(root, error).string();
    if (error)
        throw FileError(folder, error.message());
    const int descriptor = ::open(root.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0)
        throw FileError(folder, errno);
    chain.emplace_back("", descriptor);
    // Deep folders take no stack.
    std::vector<std::string> folders = {""};
    while (!folders.empty()) {
        const std::string prefix = std::move(folders.back());
        folders.pop_back();
        list(prefix, folders);
    }
}

FolderFiles::~FolderFiles() {
    closeFolders(0);
}

bool FolderFiles::contains(const std::string& path) const {
    boost::system::error_code error;
    const fs::path real = fs::canonical(path, error);
    return !error && liesBelow(real, realRoot);
}

/// Adds the files of a folder, and the folders in it to those that are to be listed.
///
/// \param prefix of the names in it: "" for the root, else its own name and "/".
void FolderFiles::list(const std::string& prefix, std::vector<std::string>& folders) {
    const std::string path = (root == "/" ? "" : root) + '/' + prefix;
    boost::system::error_code error;
    for (fs::directory_iterator entry(path, error), end; !error && entry != end;
         entry.increment(error)) {
        const std::string own = entry->path().filename().string();
        boost::system::error_code ignored;
        if (fs::is_directory(fs::symlink_status(entry->path(), ignored)))
            folders.push_back(prefix + own + '/');
        else if (!AtomicFile::isTemporaryName(own))
            files[prefix + own] = inspect(entry->path(), prefix + own, realRoot);
    }
    if (error)
        throw FileError(withoutTrailingSlashes(path), error.message());
}

SourceFile FolderFiles::open(const std::string& name, const File& file) {
    const std::string path = (root == "/" ? "" : root) + '/' + name;
    const std::string& target = file.target;
    const std::string::size_type slash = target.rfind('/');
    const std::string own = slash == std::string::npos ? target : target.substr(slash + 1);
    const int folder = folderOf(target, path);
    return SourceFile(
        ::openat(folder, own.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC | O_NOFOLLOW),
        path);
}

/// The descriptor of the folder that a name lies in. Files come in order, so most of the way to it
/// is open already.
int FolderFiles::folderOf(const std::string& name, const std::string& path) {
    std::size_t depth = 1;
    std::string::size_type begin = 0;
    for (std::string::size_type end; (end = name.find('/', begin)) != std::string::npos;
         begin = end + 1, ++depth) {
        const std::string component = name.substr(begin, end - begin);
        if (depth < chain.size() && chain[depth].first == component)
            continue;
        closeFolders(depth);
        const int descriptor = ::openat(chain.back().second, component.c_str(),
                                        O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NOFOLLOW);
        if (descriptor < 0)
            throw FileError(path, errno);
        chain.emplace_back(component, descriptor);
    }
    return chain[depth - 1].second;
}

void FolderFiles::closeFolders(std::size_t kept) {
    for (; chain.size() > kept; chain.pop_back())
        ::close(chain.back().second);
}

}  // namespace pells
