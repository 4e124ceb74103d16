// The tree of asset folders that exists while an asset manager is constructed, and the aliases that
// its ".symlinks" files declare.

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <boost/make_shared.hpp>
#include <limits>
#include <set>

#include "pells/asset/asset_manager.h"
#include "pells/asset/asset_path.h"
#include "pells/core/no_destructor.h"
#include "pells/core/strings.h"
#include "pells/log/log.h"

namespace pells {

namespace fs = boost::filesystem;

namespace {

std::size_t aliasLimit = 1000000;

/// Deeper folders are not searched: the tree takes memory in proportion to depth times length of
/// the names, and walking it takes stack.
const std::size_t maxDepth = 256;

/// A longer line declares no name that could exist.
const std::size_t maxLineLength = 65536;

/// Reads a line as getline() does, but long ones in pieces.
bool readLine(std::istream& in, std::string& line) {
    line.clear();
    char c = 0;
    bool any = false;
    while (line.size() < maxLineLength && in.get(c)) {
        any = true;
        if (c == '\n')
            break;
        line += c;
    }
    return any;
}

}  // namespace

/// One folder of the asset name space.
struct AssetManager::DirNode {
    std::string path;
    std::string name;
    /// Stands between the path and the name of a child.
    std::string separator;
    std::vector<std::string> files;
    std::vector<boost::shared_ptr<DirNode>> subdirs;
    /// The link names that stand for a file or a child folder, by its name.
    std::map<std::string, std::set<std::string>> links;

    std::string pathOf(const std::string& child) const { return path + separator + child; }

    const std::set<std::string>& linksTo(const std::string& child) const {
        static const NoDestructor<std::set<std::string>> none;
        const auto found = links.find(child);
        return found == links.end() ? *none : found->second;
    }
};

/// What a walk over the folders remembers: the folders that it is in, and how much more it may do.
class AssetManager::FolderWalk {
public:
    /// \param memberText see AssetManager::memberText.
    explicit FolderWalk(std::uint64_t memberText)
        : pathsLeft(pathsPerByte * memberText + inProportion(pathsPerByte)) {
        chain.push_back(Folder{assetPath(""), true, false, false, false});
    }

    /// Goes into a child of the current folder; false when that is not to be searched.
    ///
    /// \param path       asset name of the child.
    /// \param inArchives archives have members in it.
    /// \param linked     a link stands for it.
    bool enter(const std::string& path, const std::string& name, bool inArchives, bool linked) {
        if (chain.size() > maxDepth) {
            reportDepth(path);
            return false;
        }
        const Folder& parent = chain.back();
        Folder child = {parent.real / name, false, parent.behindLink, parent.linked || linked,
                        parent.outside || name == ".."};
        child.onDisk = parent.onDisk && !child.outside && isNativeName(name) && exists(child.real);
        if (child.onDisk) {
            child.behindLink = child.behindLink || mayLeadBack(child.real, name);
            child.onDisk = !child.behindLink || (!isEntered(child.real) && payForLinkedFolder());
        }
        if (!child.onDisk && (!inArchives || !payForPath(path)))
            return false;
        chain.push_back(child);
        return true;
    }

    void leave() { chain.pop_back(); }

    /// Whether the real folder is to be listed, too.
    bool isOnDisk() const { return chain.back().onDisk; }

    /// Whether the name of the current folder goes through "..", as only an archive's members can:
    /// they must not make the walk read the folders around the root.
    bool isOutside() const { return chain.back().outside; }

    /// Whether a link stands for the current folder or for one that it is in.
    bool isLinked() const { return chain.back().linked; }

    /// Pays for a line of a ".symlinks" file; false when there has been too much text.
    bool payForLine(std::size_t length) { return pay(textLeft, 128 + length); }

    /// Pays for a name that goes through a link; false when there have been too many.
    bool payForName(std::size_t length) { return pay(namesLeft, 16 + length); }

    /// Whether one more alias may be added; if not, there will be no more at all.
    bool mayGrow(std::size_t aliasCount) { return aliasCount < limit || pay(namesLeft, namesLeft); }

private:
    struct Folder {
        fs::path real;
        bool onDisk;
        bool behindLink;
        bool linked;
        bool outside;
    };

    static bool exists(const fs::path& path) {
        boost::system::error_code ignored;
        return fs::status(path, ignored).type() != fs::file_not_found;
    }

    /// Whether a folder can be one that the walk has come through: a link, or a name that an
    /// archive has made up.
    static bool mayLeadBack(const fs::path& path, const std::string& name) {
        boost::system::error_code ignored;
        return name.empty() || name == "." ||
               fs::symlink_status(path, ignored).type() != fs::directory_file;
    }

    bool isEntered(const fs::path& path) const {
        return std::any_of(chain.begin(), chain.end(), [&path](const Folder& folder) {
            boost::system::error_code ignored;
            return folder.onDisk && fs::equivalent(folder.real, path, ignored);
        });
    }

    /// Links of the file system that cross may offer each folder under any number of names without
    /// ever leading in a circle.
    bool payForLinkedFolder() {
        if (linkedFoldersLeft == 0)
            return false;
        --linkedFoldersLeft;
        if (linkedFoldersLeft == 0)
            PELLS_LOG("error",
                      "Too many folders behind links of the file system to look for aliases");
        return true;
    }

    /// Pays for a folder that only archives have: one long name of a member goes through many
    /// folders, whose paths are each nearly as long.
    bool payForPath(const std::string& path) {
        const std::uint64_t price = path.size() + nameOverhead;
        if (price <= pathsLeft) {
            pathsLeft -= price;
            return true;
        }
        if (pathsLeft != 0)
            PELLS_LOG(
                "error",
                "Paths of folders in archives are too long to look for aliases in all of them");
        pathsLeft = 0;
        return false;
    }

    void reportDepth(const std::string& path) {
        if (!depthReported)
            PELLS_LOG("error", "Folder is nested too deeply to look for aliases: " << path);
        depthReported = true;
    }

    bool pay(std::uint64_t& left, std::uint64_t price) {
        if (price >= left)
            return exhaust(left);
        left -= price;
        return true;
    }

    bool exhaust(std::uint64_t& left) {
        if (!excessReported)
            PELLS_LOG("error",
                      "Too many aliases for the limit of " << limit << ", some are dropped");
        excessReported = true;
        left = 0;
        return false;
    }

    /// A multiple of the limit, for its kind of text.
    std::uint64_t inProportion(std::uint64_t bytesPerAlias) const {
        const std::uint64_t most = std::numeric_limits<std::uint32_t>::max();
        return std::min<std::uint64_t>(limit, most) * bytesPerAlias + fixedText;
    }

    static constexpr std::uint64_t fixedText = std::uint64_t{1} << 20;
    static constexpr std::uint64_t pathsPerByte = 4;

    std::vector<Folder> chain;
    const std::size_t limit = aliasLimit;
    std::uint64_t textLeft = inProportion(128);
    std::uint64_t namesLeft = inProportion(512);
    std::uint64_t linkedFoldersLeft = limit / 50 + 1000;
    std::uint64_t pathsLeft;
    bool depthReported = false;
    bool excessReported = false;
};

std::size_t AssetManager::getAliasLimit() {
    return aliasLimit;
}

void AssetManager::setAliasLimit(std::size_t names) {
    aliasLimit = names;
}

void AssetManager::buildAliases() {
    FolderWalk walk(memberText);
    buildAliasMap(buildDirTree("", "", "", walk), "", false, walk);
}

boost::shared_ptr<AssetManager::DirNode> AssetManager::buildDirTree(const std::string& path,
                                                                    const std::string& name,
                                                                    const std::string& separator,
                                                                    FolderWalk& walk) {
    PELLS_LOG("asset.alias", "Making new DirNode for '" << path << "'");
    auto node = boost::make_shared<DirNode>();
    node->path = path;
    node->name = name;
    node->separator = separator;
    node->files = listFolder(path, false, walk.isOnDisk());
    readLinks(*node, walk);
    for (const std::string& child : listFolder(path, true, walk.isOnDisk())) {
        const std::string childPath = node->pathOf(child);
        // The folder of a name that begins with "/" would be the root once more.
        if (child == "CVS" || child == ".svn" || childPath == path)
            continue;
        const CacheRange below = getSubdirRange(childPath);
        const bool linked = !node->linksTo(child).empty();
        if (!walk.enter(childPath, child, below.first != below.second, linked))
            continue;
        const auto subdir = buildDirTree(childPath, child, "/", walk);
        // Only folders that links are in or stand for lead to aliases.
        if (walk.isLinked() || !subdir->links.empty() || !subdir->subdirs.empty())
            node->subdirs.push_back(subdir);
        walk.leave();
    }
    return node;
}

void AssetManager::readLinks(DirNode& node, FolderWalk& walk) {
    const std::string linkFile = node.pathOf(".symlinks");
    if (walk.isOutside() && cache.count(linkFile) == 0)
        return;
    const auto container = getFileStream(linkFile, false);
    if (!container)
        return;
    PELLS_LOG("asset.alias", "Found " << linkFile);
    std::string line;
    std::vector<std::string> pieces;
    bool cut = false;
    while (readLine(container->getStream(), line) && walk.payForLine(line.size())) {
        const bool isPiece = cut || line.size() >= maxLineLength;
        cut = line.size() >= maxLineLength;
        if (!line.empty() && line.back() == '\r')
            line.pop_back();
        if (!line.empty() && line.front() == '#')
            continue;
        if (isPiece || string_split(line, ">", pieces) != 2) {
            PELLS_LOG("asset.alias", "  ??: '" << line << "'");
            continue;
        }
        PELLS_LOG("asset.alias", "  '" << pieces[0] << "' ==> '" << pieces[1] << "'");
        node.links[pieces[1]].insert(pieces[0]);
    }
    PELLS_LOG("asset.alias", "End   " << linkFile);
}

/// \param linked the names that begin with the prefix have come through a link; without one they
///        are the assets' own.
void AssetManager::buildAliasMap(const boost::shared_ptr<DirNode>& node, const std::string& prefix,
                                 bool linked, FolderWalk& walk) {
    if (linked && !walk.payForName(prefix.size()))
        return;
    const std::string start = prefix + node->separator;
    for (const std::string& file : node->files) {
        if (linked && !addAlias(start + file, node->pathOf(file), walk))
            return;
        for (const std::string& link : node->linksTo(file)) {
            if (!addAlias(start + link, node->pathOf(file), walk))
                return;
        }
    }
    for (const auto& subdir : node->subdirs) {
        buildAliasMap(subdir, start + subdir->name, linked, walk);
        for (const std::string& link : node->linksTo(subdir->name))
            buildAliasMap(subdir, start + link, true, walk);
    }
}

/// False when there are too many aliases.
bool AssetManager::addAlias(const std::string& from, const std::string& to, FolderWalk& walk) {
    if (!walk.payForName(from.size() + to.size()))
        return false;
    if (from == to)
        return true;
    const auto place = aliases.lower_bound(from);
    const bool known = place != aliases.end() && place->first == from;
    if (!known && !walk.mayGrow(aliases.size()))
        return false;
    PELLS_LOG("asset.alias", "Mapping '" << from << "' to '" << to << "'");
    if (known)
        place->second = to;
    else
        aliases.emplace_hint(place, from, to);
    return true;
}

}  // namespace pells
