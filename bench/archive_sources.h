#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

/// The library and its peers as readers of archives.
namespace bench {

/// An open archive whose members are read by name, one at a time.
class ArchiveSource {
public:
    virtual ~ArchiveSource() = default;

    /// Goes to the first byte of a member; false when there is none of that name.
    virtual bool select(const std::string& name) = 0;

    /// The next bytes of the selected member; 0 at its end.
    virtual std::size_t read(char* into, std::size_t room) = 0;
};

/// A kind of archive and how to open one.
struct ArchiveReader {
    std::string contestant;
    bool readsZip;  ///< or this library's archives
    std::unique_ptr<ArchiveSource> (*open)(const std::string& path);
};

/// The library first, then its peers.
const std::vector<ArchiveReader>& archiveReaders();

/// Reads a whole member, to where its reader reports the end and has seen the checksum.
///
/// \param piece bytes that are asked for at a time.
/// \param into  at least a piece larger than the member.
/// \return the bytes of the member.
std::size_t readMember(ArchiveSource& source, const std::string& name, std::size_t piece,
                       std::vector<char>& into);

}  // namespace bench
