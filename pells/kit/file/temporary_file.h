#pragma once

#include <cstddef>
#include <cstdio>
#include <string>

namespace pells {
namespace kit {
namespace detail {

/// A new file in a folder, which is removed unless it gets the name that it is made for.
/// Implementation detail of AtomicFile, one source file a system; not installed.
class TemporaryFile {
public:
    /// \param destinationPath where no link, or a regular file, stands.
    /// \throws FileError, here and below, with the destination as the path.
    explicit TemporaryFile(const std::string& destinationPath);
    ~TemporaryFile();
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    /// Open for writing until rename().
    std::FILE* stream() const { return file; }

    /// Puts all bytes on disk, gives the file the old one's permissions and its name, and puts that
    /// on disk, too.
    void rename();

    /// See AtomicFile::removeOnSignal().
    static void removeOnSignal();

private:
    void keepPermissions();
    void closeFile();

    const std::string destination;
    std::string destinationName;
    std::string name;
    int folder = -1;  ///< where a system has descriptors of folders
    std::FILE* file = nullptr;
    std::size_t slot = 0;
};

/// A name that AtomicFile::isTemporaryName() tells.
std::string randomTemporaryName();

}  // namespace detail
}  // namespace kit
}  // namespace pells
