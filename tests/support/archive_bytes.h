#pragma once

#include <zlib.h>

#include <cstdio>
#include <string>
#include <utility>
#include <vector>

#include "support/scratch_directory.h"

namespace pells_test {

/// A zlib stream of the bytes.
inline std::string deflated(const std::string& bytes, int level = Z_DEFAULT_COMPRESSION) {
    uLongf size = compressBound(static_cast<uLong>(bytes.size()));
    std::string stream(size, '\0');
    compress2(reinterpret_cast<Bytef*>(&stream[0]), &size,
              reinterpret_cast<const Bytef*>(bytes.data()), static_cast<uLong>(bytes.size()),
              level);
    stream.resize(size);
    return stream;
}

inline std::string hexadecimal(std::size_t number) {
    char digits[20];
    std::snprintf(digits, sizeof digits, "%zx", number);
    return digits;
}

const std::size_t archiveHeaderSize = 21;

/// An archive of some data, which begins at archiveHeaderSize, and a directory as it is given.
inline std::string archiveWithDirectory(const std::string& directory,
                                        const std::string& data = std::string()) {
    char header[archiveHeaderSize + 1];
    std::snprintf(header, sizeof header, "PELLS %08zxv1.0\r\n\x1a",
                  archiveHeaderSize + data.size());
    return header + data + directory;
}

/// Names and contents.
typedef std::vector<std::pair<std::string, std::string>> Members;

inline std::string archiveOf(const Members& members) {
    std::string data;
    std::string directory;
    for (const auto& member : members) {
        const std::string stream = deflated(member.second);
        directory += "O" + hexadecimal(archiveHeaderSize + data.size()) + " L" +
                     hexadecimal(stream.size()) + " |" + member.first + "\r\n";
        data += stream;
    }
    return archiveWithDirectory(directory, data);
}

/// Writes an archive's bytes to a new file in place of the last one; returns its path.
///
/// Some file systems put a file on disk at once when it was emptied and written again, which makes
/// thousands of cases slow.
inline std::string writeArchiveFile(const ScratchDirectory& scratch, const std::string& bytes) {
    std::remove(scratch.path("a.pell").c_str());
    return scratch.write("a.pell", bytes);
}

}  // namespace pells_test
