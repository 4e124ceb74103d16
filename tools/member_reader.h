#pragma once

#include <zlib.h>

#include <cstddef>
#include <cstdint>
#include <fstream>
#include <string>
#include <vector>

#include "pells/asset/pell_archive.h"

namespace pells_tool {

/// Reads a member of an archive and tells whether that is all of it, which the library's stream
/// does not: there a member just ends where its stored bytes do.
class MemberReader {
public:
    /// \param entry of the archive's directory. \throws pells::FileError here and below.
    MemberReader(const std::string& archivePath,
                 const pells::pellistream::Directory::value_type& entry);
    ~MemberReader();
    MemberReader(const MemberReader&) = delete;
    MemberReader& operator=(const MemberReader&) = delete;

    /// Stores up to so many bytes and returns how many; 0 at the end of a member that is whole.
    std::size_t read(char* into, std::size_t room);

private:
    void refill();
    [[noreturn]] void fail(const std::string& what) const;

    std::string path;
    std::string name;
    std::ifstream file;
    std::uint32_t remaining;
    std::vector<char> input;
    z_stream inflater;
    bool ended;
};

}  // namespace pells_tool
