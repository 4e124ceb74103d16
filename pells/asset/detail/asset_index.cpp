#include "pells/asset/detail/asset_index.h"

#include <boost/filesystem/operations.hpp>
#include <functional>
#include <iterator>

#include "pells/asset/detail/asset_path.h"
#include "pells/log/log.h"

namespace pells::detail {

namespace fs = boost::filesystem;

namespace {

bool endsWith(const std::string& text, const std::string& ending) {
    return text.size() >= ending.size() &&
           text.compare(text.size() - ending.size(), ending.size(), ending) == 0;
}

/// Tells which names of a sorted sequence lie in folders that are not there, so that a large
/// archive without its folders costs one look a folder and none a member.
class MissingFolders {
public:
    explicit MissingFolders(const fs::path& assetRootPath) : root(assetRootPath) {}

    bool contain(const std::string& name) {
        const std::string::size_type slash = name.rfind('/');
        // For a name that may be too long, the file system's answer is another one.
        if (slash == std::string::npos || name.size() > 200)
            return false;
        if (folder.empty() || name.compare(0, slash + 1, folder) != 0) {
            folder = name.substr(0, slash + 1);
            missing = typeOf(root / folder) == fs::file_not_found;
        }
        return missing;
    }

private:
    fs::path root;
    std::string folder;
    bool missing = false;
};

}  // namespace

/// Finds the sources by hash, once they are complete: in a large one the path through the tree
/// would lead through a dozen places that are not in the processor's cache.
class AssetIndex::HashTable {
public:
    explicit HashTable(const Sources& indexedSources) : sources(indexedSources) {
        std::size_t size = 1;
        while (size < sources.size() * 3 / 2)
            size *= 2;
        slots.resize(size);
        for (const Source& entry : sources)
            add(entry);
    }

    const Source* find(const std::string& name) const {
        const std::size_t hash = std::hash<std::string>()(name);
        for (std::size_t step = 0; step < maxSteps; ++step) {
            const Slot& slot = slots[(hash + step) & (slots.size() - 1)];
            if (!slot.entry)
                return nullptr;
            if (slot.hash == hash && slot.entry->name() == name)
                return slot.entry;
        }
        const Iterator found = sources.find(name);
        return found == sources.end() ? nullptr : &*found;
    }

private:
    struct Slot {
        std::size_t hash = 0;
        const Source* entry = nullptr;
    };

    /// Names that were chosen to have the same place stay in the tree.
    static const std::size_t maxSteps = 64;

    void add(const Source& entry) {
        const std::size_t hash = std::hash<std::string>()(entry.name());
        for (std::size_t step = 0; step < maxSteps; ++step) {
            Slot& slot = slots[(hash + step) & (slots.size() - 1)];
            if (!slot.entry) {
                slot.hash = hash;
                slot.entry = &entry;
                return;
            }
        }
    }

    const Sources& sources;
    std::vector<Slot> slots;
};

AssetIndex::AssetIndex(const std::string& root) {
    scanRoot(root);
    if (archives.empty())
        PELLS_LOG("asset.ctor", "Asset manager has no .asset files to check.");
    preferNewerFiles(root);
    hashTable = std::make_unique<HashTable>(sources);
}

AssetIndex::~AssetIndex() = default;

void AssetIndex::scanRoot(const std::string& root) {
    for (fs::directory_iterator entry(root), end; entry != end; ++entry) {
        const std::string path = entry->path().string();
        PELLS_LOG("asset.iter", "Found " << path);
        if (typeOf(path) == fs::directory_file)
            PELLS_LOG("asset.iter", "  which is a directory, skipping");
        else if (!endsWith(path, ".asset"))
            PELLS_LOG("asset.iter", "  which isn't a .asset file, skipping");
        else
            addArchive(path);
    }
}

void AssetIndex::addArchive(const std::string& path) {
    std::unique_ptr<pellistream> archive;
    try {
        archive.reset(new pellistream(path));
    } catch (const pellibuf::BadPellFile& reason) {
        PELLS_LOG("error", "Bad .asset file: " << path << ": " << reason.what());
        return;
    }
    // That of the open file, which may have lost its name since.
    std::int64_t writeTime = 0;
    if (!archive->getWriteTime(writeTime))
        writeTime = fs::last_write_time(path);
    archives.push_back({path, std::move(archive), writeTime});
    addMembers(static_cast<std::uint32_t>(archives.size() - 1));
}

void AssetIndex::addMembers(std::uint32_t archive) {
    const std::int64_t writeTime = archives[archive].writeTime;
    // An archive's names are sorted, too, so most go right behind the one before.
    Iterator place = sources.begin();
    for (const auto& member : archives[archive].stream->getDirectory()) {
        PELLS_LOG("asset.entries", ">>> For this asset file, found entry: " << member.first);
        memberText += member.first.size() + nameOverhead;
        const Source source = {&member, archive};
        const Iterator entry = sources.insert(place, source);
        place = std::next(entry);
        if (archiveOf(*entry).writeTime < writeTime)
            replace(entry, source);
    }
}

/// Replaces an entry by one of the same name.
void AssetIndex::replace(Iterator entry, const Source& source) {
    // Entries of a set are constant, so that nobody changes their order, which this does not.
    const_cast<Source&>(*entry) = source;
}

void AssetIndex::preferNewerFiles(const std::string& root) {
    MissingFolders missingFolders(root);
    for (auto entry = sources.begin(); entry != sources.end(); ++entry) {
        const std::string& name = entry->name();
        if (missingFolders.contain(name) || !isNativeName(name))
            continue;
        const fs::path file = fs::path(root) / name;
        boost::system::error_code error;
        const std::int64_t writeTime = fs::last_write_time(file, error);
        if (!error) {
            if (writeTime > archiveOf(*entry).writeTime) {
                newerFiles[name] = new AssetManager::FileOpener(file.string(), writeTime);
                replace(entry, {entry->member, Source::newerFile});
            }
        } else if (typeOf(file) != fs::file_not_found) {
            const fs::filesystem_error reason("last_write_time", file, error);
            PELLS_LOG("error",
                      "Can't get timestamp for file " << file.string() << ": " << reason.what());
        }
    }
}

const AssetIndex::Source* AssetIndex::find(const std::string& name) const {
    return hashTable->find(name);
}

AssetIndex::Range AssetIndex::below(const std::string& folder) const {
    if (folder.empty())
        return Range(sources.begin(), sources.end());
    // '0' follows '/'.
    return Range(lowerBound(folder + '/'), lowerBound(folder + '0'));
}

bool AssetIndex::hasBelow(const std::string& folder) const {
    const Range range = below(folder);
    return range.first != range.second;
}

const std::string& AssetIndex::pathOf(const Source& source) const {
    return newerFiles.find(source.name())->second->getName();
}

boost::intrusive_ptr<baseiStreamContainer> AssetIndex::open(const Source& source, bool flag) const {
    if (source.isNewerFile())
        return newerFiles.find(source.name())->second->open(flag);
    const Archive& archive = archiveOf(source);
    return AssetManager::MemberOpener(*source.member, archive.writeTime, archive.stream.get())
        .open(flag);
}

}  // namespace pells::detail
