#include "tools/open_archive.h"

#include "tools/atomic_file.h"

namespace pells_tool {

std::unique_ptr<pells::pellistream> openArchive(const std::string& path) {
    try {
        return std::unique_ptr<pells::pellistream>(new pells::pellistream(path));
    } catch (const pells::pellibuf::BadPellFile& error) {
        throw pells::FileError(path, std::string(error.what()));
    }
}

}  // namespace pells_tool
