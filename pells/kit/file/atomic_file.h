#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>

#include "pells/kit/export.h"

namespace pells {
namespace kit {

/// A file could not be read or written. what() is "PATH: REASON", as the system words the reason.
class PELLS_KIT_API FileError : public std::runtime_error {
public:
    /// \param why the reason, in words.
    FileError(const std::string& filePath, const std::string& why);

    /// \param errorNumber a value of errno.
    FileError(const std::string& filePath, int errorNumber);
    FileError(const FileError&) = default;
    FileError& operator=(const FileError&) = default;
    ~FileError() override;

    /// The file, and what was wrong.
    const std::string& getPath() const { return path; }
    const std::string& getReason() const { return reason; }

private:
    std::string path;
    std::string reason;
};

namespace detail {
class TemporaryFile;
}

/// A file that appears under its name complete, or not at all.
///
///     pells::kit::AtomicFile file("scene.xml");
///     file.write(text.data(), text.size());
///     file.commit();
///
/// The bytes go to a temporary file ".pells-….tmp" in the destination's folder; commit() puts them
/// on disk and renames that file. Until then whatever stands under the name stays as it is, and a
/// destructor without a commit() leaves no trace. When commit() returns, the file survives a power
/// cut; when the process is killed or the power fails before, the old file is there or the new one,
/// whole, and perhaps the temporary one.
///
/// A destination that is a symbolic link stays one: the file it leads to is replaced. An existing
/// file hands on its permissions and, where the process may set them, its owner and group; while it
/// is written, nobody but the process's user may read the new one. A new file has the permissions
/// that the process's mask leaves. Other hard links keep the old file.
///
/// The folder is looked up once: changing the working directory does no harm. Any number of these
/// may exist; each is for one thread.
class PELLS_KIT_API AtomicFile {
public:
    /// \throws FileError when the temporary file cannot be made, or when something that is no
    ///         regular file (a folder, a device) has the name.
    explicit AtomicFile(const std::string& path);
    ~AtomicFile();
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    /// Appends bytes. \throws FileError, after which only the destructor may follow.
    void write(const void* bytes, std::size_t count);

    /// Replaces bytes that were written before; the next write() appends again. \throws FileError
    void overwrite(long offset, const void* bytes, std::size_t count);

    /// The number of bytes appended.
    std::uint64_t size() const { return written; }

    /// The name that the file will have, links resolved.
    const std::string& path() const { return destination; }

    /// Gives the file its name. Nothing may be written afterwards.
    ///
    /// \throws FileError when the bytes or the name did not reach the disk; nothing is left behind.
    void commit();

    /// Removes the temporary files that exist. For signal handlers that end the process: calls only
    /// what they may call. Of more than 16 files at a time it knows the first 16.
    static void removeOnSignal();

    /// Whether a file of that name, without a path, is a temporary one: ".pells-", three groups of
    /// four hexadecimal digits with hyphens between them, and ".tmp".
    static bool isTemporaryName(const std::string& name);

private:
    std::string destination;
    std::unique_ptr<detail::TemporaryFile> temporary;
    std::uint64_t written;
};

}  // namespace kit
}  // namespace pells
