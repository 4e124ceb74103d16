#include "tools/open_archive.h"

#include <boost/filesystem/operations.hpp>
#include <fstream>
#include <locale>

#include "tools/atomic_file.h"
#include "tools/folder_files.h"

namespace pells_tool {

std::unique_ptr<pells::pellistream> openArchive(const std::string& path) {
    std::string reason = whyNotReadable(path);
    if (!reason.empty())
        throw pells::FileError(path, reason);
    std::unique_ptr<pells::pellistream> archive;
    try {
        archive.reset(new pells::pellistream(path));
    } catch (const pells::pellibuf::BadPellFile& error) {
        throw pells::FileError(path, std::string(error.what()));
    }
    reason = whereDirectoryIsMissing(path);
    if (archive->getDirectory().empty() && !reason.empty())
        throw pells::FileError(path, reason);
    return archive;
}

std::string whyNotReadable(const std::string& path) {
    try {
        const pells::SourceFile file(path);
    } catch (const pells::FileError& error) {
        return error.getReason();
    }
    return "";
}

std::string whereDirectoryIsMissing(const std::string& path) {
    std::ifstream file(path, std::ios_base::binary);
    file.imbue(std::locale::classic());
    char stamp[6] = "";
    std::uint32_t offset = 0;
    if (!file.read(stamp, sizeof stamp) || std::string(stamp, sizeof stamp) != "PELLS ")
        return "";
    file >> std::hex >> offset;
    // The rest of the header is "v1.0", carriage return, line feed and 0x1A, or longer.
    file.ignore(64, '\x1a');
    const std::uint64_t headerEnd = file ? static_cast<std::uint64_t>(file.tellg()) : 0;
    const std::uint64_t size = sizeOfFile(path);
    // An archive without members ends right behind its header.
    if (offset < size || (offset == size && size == headerEnd))
        return "";
    return "The directory should begin at byte " + std::to_string(offset) +
           ", but the file has only " + std::to_string(size);
}

std::uint64_t sizeOfFile(const std::string& path) {
    boost::system::error_code ignored;
    const boost::uintmax_t size = boost::filesystem::file_size(path, ignored);
    return ignored ? 0 : size;
}

}  // namespace pells_tool
