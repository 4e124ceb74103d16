#include "pells/asset/detail/folder_walk.h"

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <limits>

#include "pells/asset/detail/asset_index.h"
#include "pells/asset/detail/asset_path.h"
#include "pells/log/log.h"

namespace pells::detail {

namespace fs = boost::filesystem;

namespace {

/// Deeper folders are not searched: the tree takes memory in proportion to depth times length of
/// the names, and walking it takes stack.
const std::size_t maxDepth = 256;

constexpr std::uint64_t fixedText = std::uint64_t{1} << 20;
constexpr std::uint64_t pathsPerByte = 4;

/// Whether a folder can be one that the walk has come through: a link, or a name that an
/// archive has made up.
bool mayLeadBack(const fs::path& path, const std::string& name) {
    boost::system::error_code ignored;
    return name.empty() || name == "." ||
           fs::symlink_status(path, ignored).type() != fs::directory_file;
}

}  // namespace

FolderWalk::FolderWalk(std::uint64_t memberText, std::size_t aliasLimit)
    : limit(aliasLimit),
      textLeft(inProportion(128)),
      namesLeft(inProportion(512)),
      linkedFoldersLeft(aliasLimit / 50 + 1000),
      pathsLeft(pathsPerByte * memberText + inProportion(pathsPerByte)) {
    chain.push_back(Folder{assetPath(""), true, false, false, false});
}

bool FolderWalk::enter(const std::string& path, const std::string& name, bool inArchives,
                       bool linked) {
    if (chain.size() > maxDepth) {
        reportDepth(path);
        return false;
    }
    const Folder& parent = chain.back();
    Folder child = {parent.real / name, false, parent.behindLink, parent.linked || linked,
                    parent.outside || name == ".."};
    child.onDisk = parent.onDisk && !child.outside && isNativeName(name) &&
                   typeOf(child.real) != fs::file_not_found;
    if (child.onDisk) {
        child.behindLink = child.behindLink || mayLeadBack(child.real, name);
        child.onDisk = !child.behindLink || (!isEntered(child.real) && chargeLinkedFolder());
    }
    if (!child.onDisk && (!inArchives || !chargePath(path)))
        return false;
    chain.push_back(child);
    return true;
}

bool FolderWalk::isEntered(const fs::path& path) const {
    return std::any_of(chain.begin(), chain.end(), [&path](const Folder& folder) {
        boost::system::error_code ignored;
        return folder.onDisk && fs::equivalent(folder.real, path, ignored);
    });
}

/// Links of the file system that cross may offer each folder under any number of names without
/// ever leading in a circle.
bool FolderWalk::chargeLinkedFolder() {
    if (linkedFoldersLeft == 0)
        return false;
    --linkedFoldersLeft;
    if (linkedFoldersLeft == 0)
        PELLS_LOG("error", "Too many folders behind links of the file system to look for aliases");
    return true;
}

/// Charges a folder that only archives have: one long name of a member goes through many
/// folders, whose paths are each nearly as long.
bool FolderWalk::chargePath(const std::string& path) {
    const std::uint64_t cost = path.size() + AssetIndex::nameOverhead;
    if (cost <= pathsLeft) {
        pathsLeft -= cost;
        return true;
    }
    if (pathsLeft != 0)
        PELLS_LOG("error",
                  "Paths of folders in archives are too long to look for aliases in all of them");
    pathsLeft = 0;
    return false;
}

void FolderWalk::reportDepth(const std::string& path) {
    if (!depthReported)
        PELLS_LOG("error", "Folder is nested too deeply to look for aliases: " << path);
    depthReported = true;
}

bool FolderWalk::spend(std::uint64_t& left, std::uint64_t cost) {
    if (cost >= left)
        return exhaust(left);
    left -= cost;
    return true;
}

bool FolderWalk::exhaust(std::uint64_t& left) {
    if (!excessReported)
        PELLS_LOG("error", "Too many aliases for the limit of " << limit << ", some are dropped");
    excessReported = true;
    left = 0;
    return false;
}

/// A multiple of the limit, for its kind of text.
std::uint64_t FolderWalk::inProportion(std::uint64_t bytesPerAlias) const {
    const std::uint64_t most = std::numeric_limits<std::uint32_t>::max();
    return std::min<std::uint64_t>(limit, most) * bytesPerAlias + fixedText;
}

}  // namespace pells::detail
