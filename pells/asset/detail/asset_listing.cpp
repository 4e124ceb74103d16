#include "pells/asset/detail/asset_listing.h"

#include <boost/filesystem/operations.hpp>
#include <iterator>
#include <ostream>

#include "pells/asset/detail/asset_path.h"
#include "pells/log/log.h"

namespace pells::detail {

namespace fs = boost::filesystem;

/// Begins the lines of one listing, and knows whether any was written.
class AssetListing::Prefix {
public:
    Prefix(const std::string& listedDir, const char* listedKind)
        : dir(listedDir), kind(listedKind) {}

    friend std::ostream& operator<<(std::ostream& out, const Prefix& prefix) {
        prefix.written = true;
        return out << "listfiles(" << prefix.dir << ", " << prefix.kind << "): ";
    }

    void reportEntry(const std::string& key) const {
        PELLS_LOG("asset.iter", *this << "considering " << key);
    }

    void reportOnDisk(const std::string& name) const {
        PELLS_LOG("asset.list", *this << "from filesystem: " << name);
    }

    bool wasWritten() const { return written; }

private:
    const std::string& dir;
    const char* kind;
    mutable bool written = false;
};

AssetListing::AssetListing(const AssetIndex& assetIndex, const std::string& listedDir, bool onDisk)
    : index(assetIndex),
      dir(listedDir),
      folder(AssetManager::fixName(listedDir)),
      start(folder.empty() ? folder : folder + '/') {
    if (onDisk && isNativeName(folder))
        readDisk();
}

void AssetListing::readDisk() {
    diskPath = assetPath(folder);
    for (fs::directory_iterator entry(diskPath, error), end; !error && entry != end;
         entry.increment(error)) {
        boost::system::error_code ignored;
        // The listing itself tells what most entries are.
        const bool isFolder = entry->status(ignored).type() == fs::directory_file;
        (isFolder ? diskFolders : diskFiles).push_back(entry->path().filename().string());
    }
    if (error && typeOf(diskPath) == fs::file_not_found)
        error.clear();
}

AssetListing::Names AssetListing::files() const {
    const Prefix prefix(dir, "files");
    Names names;
    addFilesInArchives(prefix, names);
    addFilesOnDisk(prefix, names);
    reportError(prefix);
    return names;
}

AssetListing::Names AssetListing::folders() const {
    const Prefix prefix(dir, "dirs");
    Names names;
    addFoldersInArchives(prefix, names);
    addFoldersOnDisk(prefix, names);
    reportError(prefix);
    return names;
}

void AssetListing::addFilesInArchives(const Prefix& prefix, Names& names) const {
    const AssetIndex::Range range = index.below(folder);
    for (AssetIndex::Iterator entry = range.first; entry != range.second;) {
        const std::string& key = entry->name();
        prefix.reportEntry(key);
        const std::string::size_type slash = key.find('/', start.size());
        if (slash != std::string::npos) {
            PELLS_LOG("asset.list", prefix << "skipping subdir file: " << key.substr(start.size()));
            entry = behindFolder(entry, slash, prefix);
        } else {
            names.push_back(key.substr(start.size()));
            PELLS_LOG("asset.list", prefix << "from cache: " << names.back());
            ++entry;
        }
    }
}

void AssetListing::addFoldersInArchives(const Prefix& prefix, Names& names) const {
    const AssetIndex::Range range = index.below(folder);
    for (AssetIndex::Iterator entry = range.first; entry != range.second;) {
        const std::string& key = entry->name();
        prefix.reportEntry(key);
        const std::string::size_type slash = key.find('/', start.size());
        if (slash == std::string::npos) {
            PELLS_LOG("asset.list", prefix << "skipping plain file: " << key.substr(start.size()));
            ++entry;
            continue;
        }
        const std::string name = key.substr(start.size(), slash - start.size());
        PELLS_LOG("asset.list", prefix << "from cache: " << name);
        // What lies in one folder lies side by side.
        if (names.empty() || names.back() != name)
            names.push_back(name);
        entry = behindFolder(entry, slash, prefix);
    }
}

/// Goes on behind an entry that lies in a folder: behind all that lies there, unless there are
/// lines to write for each.
AssetIndex::Iterator AssetListing::behindFolder(AssetIndex::Iterator entry,
                                                std::string::size_type slash,
                                                const Prefix& prefix) const {
    if (prefix.wasWritten())
        return std::next(entry);
    return index.lowerBound(entry->name().substr(0, slash) + '0');  // '0' follows '/'
}

void AssetListing::addFilesOnDisk(const Prefix& prefix, Names& names) const {
    for (const std::string& name : diskFiles) {
        prefix.reportOnDisk(name);
        if (!index.find(start + name))
            names.push_back(name);
    }
}

void AssetListing::addFoldersOnDisk(const Prefix& prefix, Names& names) const {
    for (const std::string& name : diskFolders) {
        prefix.reportOnDisk(name);
        if (!index.hasBelow(start + name))
            names.push_back(name);
    }
}

void AssetListing::reportError(const Prefix& prefix) const {
    if (!error)
        return;
    const fs::filesystem_error reason("directory_iterator", diskPath, error);
    PELLS_LOG("error", prefix << "Can't list directory in filesystem: " << reason.what());
}

}  // namespace pells::detail
