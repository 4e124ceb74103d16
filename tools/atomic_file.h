#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <stdexcept>
#include <string>

namespace pells {

/// A file could not be read or written. what() is "PATH: REASON", as the system words the reason.
class FileError : public std::runtime_error {
public:
    FileError(const std::string& path, const std::string& reason);

    /// \param errorNumber a value of errno.
    FileError(const std::string& path, int errorNumber);
};

/// A file that appears under its name complete, or not at all.
///
/// The bytes go to a temporary file in the destination's folder; commit() puts them on disk and
/// renames that file. Until then whatever stood under the name stays as it is, and a destructor
/// without a commit() leaves no trace. A destination that is a symbolic link stays one: the file it
/// points at is replaced. An existing file hands its permissions on.
class AtomicFile {
public:
    /// \throws FileError when the temporary file cannot be made, or when something that is no
    ///         regular file (a folder, a device) has the name.
    explicit AtomicFile(const std::string& path);
    ~AtomicFile();
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    /// Appends bytes. \throws FileError
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

    /// Removes the temporary file of an AtomicFile that is alive, if there is one. For signal
    /// handlers that end the process: calls only what they may call, and knows the newest one only.
    static void removeOnSignal();

private:
    void keepPermissions();
    void closeFile();
    void discard();

    std::string destination;
    std::string temporary;
    std::FILE* file;
    std::uint64_t written;
};

}  // namespace pells
