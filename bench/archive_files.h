#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// Archives of this library and zip files with the same members, for the programs that compare
/// them.
namespace bench {

/// What a member holds, compressed once for both kinds of archive.
struct Content {
    explicit Content(std::string uncompressed);

    std::string bytes;
    std::string stream;  ///< a zlib stream; without its first two and last four bytes bare deflate
    std::uint32_t crc;
};

std::string textBytes(std::size_t size);     ///< words, some of them common
std::string textureBytes(std::size_t size);  ///< pixels of three bytes, smooth but for some grain
std::string noiseBytes(std::size_t size);    ///< what deflate can only store

struct Member {
    std::string name;
    const Content* content;
};

/// Names of three levels, a hundred to a folder, in ascending order.
///
/// \param top the folder that all of them lie in.
std::vector<std::string> memberNames(std::size_t count, const std::string& top = "textures");

/// Members that all have one content, which stays the caller's.
std::vector<Member> membersOf(const std::vector<std::string>& names, const Content& content);

/// Writes an archive that lists the members in the order given.
///
/// The tools' writer sorts the names and compresses each member by itself, which takes seconds for
/// the largest archives here.
void writePell(const std::string& path, const std::vector<Member>& members);

/// Writes the same members, with the same compressed bytes, as a zip file.
void writeZip(const std::string& path, const std::vector<Member>& members);

}  // namespace bench
