#pragma once

#include <cstddef>
#include <cstdint>
#include <istream>
#include <streambuf>
#include <string>

#include "pells/platform/detail/regular_file.h"

namespace pells::detail {

/// Reads a regular file at a position of its own, so that processes that share the file after a
/// fork do not move each other's. Implementation detail of archives; not installed.
class ArchiveFileBuffer : public std::streambuf {
public:
    RegularFile file;

protected:
    int_type underflow() override;

    /// Reads straight into the reader's memory.
    std::streamsize xsgetn(char* to, std::streamsize count) override;

    pos_type seekpos(pos_type position, std::ios_base::openmode which) override;

private:
    std::size_t fill(char* to, std::size_t room);

    std::uint64_t next = 0;  ///< the place in the file behind the get area
    /// So small that seeking to a member and reading it costs no more than the member's bytes.
    char block[512];
};

/// The file of an archive as a stream. Numbers in it do not follow the user's country.
class ArchiveFile : public std::istream {
public:
    /// Sets failbit when there is no regular file of that name that may be read.
    explicit ArchiveFile(const std::string& path);
    ~ArchiveFile() override;

    const RegularFile& getFile() const { return buffer.file; }

private:
    ArchiveFileBuffer buffer;
};

}  // namespace pells::detail
