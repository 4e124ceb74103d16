#include "pells/asset/detail/alias_tree.h"

#include <boost/make_shared.hpp>
#include <memory>
#include <set>
#include <vector>

#include "pells/asset/detail/asset_listing.h"
#include "pells/core/no_destructor.h"
#include "pells/core/strings.h"
#include "pells/log/log.h"

namespace pells::detail {

namespace {

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
struct AliasTree::Folder {
    std::string path;
    std::string name;
    /// Stands between the path and the name of a child.
    std::string separator;
    std::vector<std::string> files;
    std::vector<boost::shared_ptr<Folder>> subdirs;
    /// The link names that stand for a file or a child folder, by its name.
    std::map<std::string, std::set<std::string>> links;

    std::string pathOf(const std::string& child) const { return path + separator + child; }

    const std::set<std::string>& linksTo(const std::string& child) const {
        static const NoDestructor<std::set<std::string>> none;
        const auto found = links.find(child);
        return found == links.end() ? *none : found->second;
    }
};

AliasTree::AliasTree(const AssetIndex& assetIndex, AssetManager& linkFileManager)
    : index(assetIndex), manager(linkFileManager) {}

AliasTree::Aliases AliasTree::build(std::size_t limit) {
    FolderWalk walk(index.getMemberText(), limit);
    addAliases(readFolder("", "", "", walk), "", false, walk);
    return std::move(aliases);
}

boost::shared_ptr<AliasTree::Folder> AliasTree::readFolder(const std::string& path,
                                                           const std::string& name,
                                                           const std::string& separator,
                                                           FolderWalk& walk) {
    PELLS_LOG("asset.alias", "Making new DirNode for '" << path << "'");
    auto folder = boost::make_shared<Folder>();
    folder->path = path;
    folder->name = name;
    folder->separator = separator;
    auto listing = std::make_unique<AssetListing>(index, path, walk.isOnDisk());
    folder->files = listing->files();
    readLinks(*folder, walk);
    const AssetListing::Names children = listing->folders();
    listing.reset();  // the names of all folders above would add up
    for (const std::string& child : children) {
        const std::string childPath = folder->pathOf(child);
        // The folder of a name that begins with "/" would be the root once more.
        if (child == "CVS" || child == ".svn" || childPath == path)
            continue;
        const bool linked = !folder->linksTo(child).empty();
        if (!walk.enter(childPath, child, index.hasBelow(childPath), linked))
            continue;
        const auto subdir = readFolder(childPath, child, "/", walk);
        // Only folders that links are in or stand for lead to aliases.
        if (walk.isLinked() || !subdir->links.empty() || !subdir->subdirs.empty())
            folder->subdirs.push_back(subdir);
        walk.leave();
    }
    return folder;
}

void AliasTree::readLinks(Folder& folder, FolderWalk& walk) {
    const std::string linkFile = folder.pathOf(".symlinks");
    if (walk.isOutside() && !index.find(linkFile))
        return;
    const auto container = manager.getFileStream(linkFile, false);
    if (!container)
        return;
    PELLS_LOG("asset.alias", "Found " << linkFile);
    std::string line;
    std::vector<std::string> pieces;
    bool cut = false;
    while (readLine(container->getStream(), line) && walk.chargeLine(line.size())) {
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
        folder.links[pieces[1]].insert(pieces[0]);
    }
    PELLS_LOG("asset.alias", "End   " << linkFile);
}

/// \param linked the names that begin with the prefix have come through a link; without one they
///        are the assets' own.
void AliasTree::addAliases(const boost::shared_ptr<Folder>& folder, const std::string& prefix,
                           bool linked, FolderWalk& walk) {
    if (linked && !walk.chargeName(prefix.size()))
        return;
    const std::string start = prefix + folder->separator;
    for (const std::string& file : folder->files) {
        if (linked && !addAlias(start + file, folder->pathOf(file), walk))
            return;
        for (const std::string& link : folder->linksTo(file)) {
            if (!addAlias(start + link, folder->pathOf(file), walk))
                return;
        }
    }
    for (const auto& subdir : folder->subdirs) {
        addAliases(subdir, start + subdir->name, linked, walk);
        for (const std::string& link : folder->linksTo(subdir->name))
            addAliases(subdir, start + link, true, walk);
    }
}

/// False when there are too many aliases.
bool AliasTree::addAlias(const std::string& from, const std::string& to, FolderWalk& walk) {
    if (!walk.chargeName(from.size() + to.size()))
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

}  // namespace pells::detail
