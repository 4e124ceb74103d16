#include "pells/asset/detail/archive_file.h"

#include <algorithm>
#include <cstring>
#include <locale>

namespace pells::detail {

/// Reads the bytes behind the get area; fewer than there is room for only at the file's end, or
/// where it cannot be read.
std::size_t ArchiveFileBuffer::fill(char* to, std::size_t room) {
    std::size_t filled = 0;
    while (filled < room) {
        const std::ptrdiff_t got = file.readAt(next, to + filled, room - filled);
        if (got <= 0)
            break;
        next += static_cast<std::uint64_t>(got);
        filled += static_cast<std::size_t>(got);
    }
    return filled;
}

ArchiveFileBuffer::int_type ArchiveFileBuffer::underflow() {
    const std::size_t count = fill(block, sizeof block);
    setg(block, block, block + count);
    return count == 0 ? traits_type::eof() : traits_type::to_int_type(*block);
}

std::streamsize ArchiveFileBuffer::xsgetn(char* to, std::streamsize count) {
    const std::streamsize atHand = std::min<std::streamsize>(count, egptr() - gptr());
    std::memcpy(to, gptr(), static_cast<std::size_t>(atHand));
    gbump(static_cast<int>(atHand));
    return atHand + static_cast<std::streamsize>(
                        fill(to + atHand, static_cast<std::size_t>(count - atHand)));
}

ArchiveFileBuffer::pos_type ArchiveFileBuffer::seekpos(pos_type position,
                                                       std::ios_base::openmode /*which*/) {
    const off_type offset = position;
    if (!file.isOpen() || offset < 0)
        return pos_type(off_type(-1));
    next = static_cast<std::uint64_t>(offset);
    setg(block, block, block);
    return position;
}

ArchiveFile::ArchiveFile(const std::string& path) : std::istream(nullptr) {
    imbue(std::locale::classic());
    rdbuf(&buffer);
    if (!buffer.file.openToRead(path))
        setstate(std::ios_base::failbit);
}

ArchiveFile::~ArchiveFile() = default;

}  // namespace pells::detail
