#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace pells::detail {

/// The descriptor of a regular file; closed with this object. Implementation detail; not installed.
///
/// Nothing but regular files is opened, and opening never waits: a pipe or a device that has the
/// name, even since a moment ago, is refused. Calls that a signal interrupts are made again.
class RegularFile {
public:
    /// What to do with a file that is to be written.
    enum WriteMode { TRUNCATE, APPEND };

    RegularFile() = default;
    RegularFile(const RegularFile&) = delete;
    RegularFile& operator=(const RegularFile&) = delete;
    ~RegularFile();

    /// Opens a file that is there, through symbolic links. False, with the system's errno, when
    /// that cannot be done; a path that holds a zero byte names no file.
    bool openToRead(const std::string& path);

    /// Opens a file, or makes it. A symbolic link of that name is refused: what it leads to belongs
    /// to somebody else. To be appended to, anything but a folder is opened that can be without
    /// waiting.
    bool openToWrite(const std::string& path, WriteMode mode);

    bool isOpen() const { return descriptor >= 0; }

    /// False when what was written did not reach the file.
    bool close();

    /// Reads up to so many bytes from a place in the file, whose own position is neither used nor
    /// moved: a process that shares the descriptor reads what it wants.
    ///
    /// \return the number of bytes read, 0 at the end of the file, -1 for an error.
    std::ptrdiff_t readAt(std::uint64_t offset, char* into, std::size_t room) const;

    /// Writes all bytes, or returns false.
    bool write(const char* bytes, std::size_t count);

    /// Which file it is, and which state of it.
    struct Identity {
        std::uint64_t device;
        std::uint64_t number;
        std::uint64_t size;
        std::int64_t writeTime;      ///< seconds since 1970
        std::int64_t writeFraction;  ///< nanoseconds
        std::int64_t changeTime;     ///< of contents or attributes
        std::int64_t changeFraction;
    };

    /// False when the system does not tell.
    bool identify(Identity& identity) const;

private:
    bool acceptRegular();

    int descriptor = -1;
};

}  // namespace pells::detail
