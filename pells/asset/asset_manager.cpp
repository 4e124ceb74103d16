#include "pells/asset/asset_manager.h"

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <ctime>
#include <functional>
#include <limits>
#include <ostream>

#include "pells/asset/asset_path.h"
#include "pells/core/class_name.h"
#include "pells/core/prefs.h"
#include "pells/log/log.h"
#include "pells/platform/debugger.h"
#include "pells/platform/regular_file.h"

namespace pells {

template class RogueSingleton<AssetManager, SingletonFactory<AssetManager>>;
template class Singleton<AssetManager, SingletonFactory<AssetManager>>;

namespace fs = boost::filesystem;

namespace {

bool endsWith(const std::string& text, const std::string& ending) {
    return text.size() >= ending.size() &&
           text.compare(text.size() - ending.size(), ending.size(), ending) == 0;
}

fs::file_type typeOf(const fs::path& path) {
    boost::system::error_code ignored;
    return fs::status(path, ignored).type();
}

/// AssetManager::fixName() that copies only the names that it changes.
const std::string& fixedName(const std::string& name, std::string& converted) {
    if (name.find('\\') == std::string::npos)
        return name;
    return converted = AssetManager::fixName(name);
}

bool canBeRead(const std::string& path) {
    return platform::RegularFile().openToRead(path);
}

/// What exists below the root under an asset's name.
fs::file_type typeOfAsset(const std::string& name) {
    return isNativeName(name) ? typeOf(assetPath(name)) : fs::file_not_found;
}

/// Tells which names of a sorted sequence lie in folders that are not there, so that a large
/// archive without its folders costs one look a folder and none a member.
class MissingFolders {
public:
    explicit MissingFolders(const fs::path& assetRootPath) : root(assetRootPath) {}

    bool hold(const std::string& name) {
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

/// A container on a member of an archive; how many there are is counted.
class MemberContainer : public iExistingStreamContainer {
public:
    explicit MemberContainer(std::istream& archive) : iExistingStreamContainer(archive) { ++alive; }
    MemberContainer(const MemberContainer&) = delete;
    MemberContainer& operator=(const MemberContainer&) = delete;
    ~MemberContainer() override { --alive; }

    static int alive;
};

int MemberContainer::alive = 0;

/// Tells developers of streams that will read from archives that are gone.
void reportContainersLeft() {
#ifndef NDEBUG
    if (MemberContainer::alive == 0)
        return;
    try {
        platform::debuggerOutput("Stream containers outlive the asset manager\n");
    } catch (...) {
        // The application's sink threw, and a destructor asked.
    }
#endif
}

}  // namespace

std::string assetRoot() {
    return Prefs::instance().getString("assetLocation");
}

fs::path assetPath(const std::string& name) {
    return fs::path(assetRoot()) / name;
}

/// Finds the entries of a cache that is complete, by hash: in a large one the path through the tree
/// would lead through a dozen places that are not in the processor's cache.
class AssetManager::CacheIndex {
public:
    explicit CacheIndex(const Cache& indexedCache) : cache(indexedCache) {
        std::size_t size = 1;
        while (size < cache.size() * 3 / 2)
            size *= 2;
        slots.resize(size);
        for (const Source& entry : cache)
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
        const Cache::const_iterator found = cache.find(name);
        return found == cache.end() ? nullptr : &*found;
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

    const Cache& cache;
    std::vector<Slot> slots;
};

/// Begins the lines of one getFileStream().
class AssetManager::OpeningPrefix {
public:
    OpeningPrefix(const AssetManager& openingManager, const std::string& openedName)
        : manager(openingManager), name(openedName) {}

    friend std::ostream& operator<<(std::ostream& out, const OpeningPrefix& prefix) {
        return out << className(typeid(prefix.manager)) << "::getFileStream(" << prefix.name
                   << "): ";
    }

private:
    const AssetManager& manager;
    const std::string& name;
};

/// Begins the lines of one listfiles(), and knows whether any was written.
class AssetManager::ListingPrefix {
public:
    ListingPrefix(const std::string& listedDir, bool listsDirs) : dir(listedDir), dirs(listsDirs) {}

    friend std::ostream& operator<<(std::ostream& out, const ListingPrefix& prefix) {
        prefix.written = true;
        return out << "listfiles(" << prefix.dir << ", " << (prefix.dirs ? "dirs" : "files")
                   << "): ";
    }

    bool wasWritten() const { return written; }

private:
    const std::string& dir;
    bool dirs;
    mutable bool written = false;
};

AssetManager::AssetManager() {
    const std::string root = assetRoot();
    scanRoot(root);
    if (archives.empty())
        PELLS_LOG("asset.ctor", "Asset manager has no .asset files to check.");
    preferNewerFiles(root);
    cacheIndex = std::make_unique<CacheIndex>(cache);
    buildAliases();
}

AssetManager::~AssetManager() {
    reportContainersLeft();
    archives.clear();
}

void AssetManager::scanRoot(const std::string& root) {
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

void AssetManager::addArchive(const std::string& path) {
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
    archiveTimes.push_back(writeTime);
    archives.emplace_back(path, std::move(archive));
    cacheMembers(static_cast<std::uint32_t>(archives.size() - 1));
}

void AssetManager::cacheMembers(std::uint32_t archive) {
    const std::int64_t writeTime = archiveTimes[archive];
    // An archive's names are sorted, too, so most go right behind the one before.
    Cache::const_iterator place = cache.begin();
    for (const auto& member : archives[archive].second->getDirectory()) {
        PELLS_LOG("asset.entries", ">>> For this asset file, found entry: " << member.first);
        memberText += member.first.size() + nameOverhead;
        const Source source = {&member, archive};
        const Cache::const_iterator entry = cache.insert(place, source);
        place = std::next(entry);
        if (archiveTimes[entry->archive] < writeTime)
            setSource(entry, source);
    }
}

/// Replaces an entry by one of the same name.
void AssetManager::setSource(Cache::const_iterator entry, const Source& source) {
    // Entries of a set are constant, so that nobody changes their order, which this does not.
    const_cast<Source&>(*entry) = source;
}

void AssetManager::preferNewerFiles(const std::string& root) {
    MissingFolders missingFolders(root);
    for (auto entry = cache.begin(); entry != cache.end(); ++entry) {
        const std::string& name = entry->name();
        if (missingFolders.hold(name) || !isNativeName(name))
            continue;
        const fs::path file = fs::path(root) / name;
        boost::system::error_code error;
        const std::int64_t writeTime = fs::last_write_time(file, error);
        if (!error) {
            if (writeTime > archiveTimes[entry->archive]) {
                newerFiles[name] = new FileOpener(file.string(), writeTime);
                setSource(entry, {entry->member, newerFile});
            }
        } else if (typeOf(file) != fs::file_not_found) {
            const fs::filesystem_error reason("last_write_time", file, error);
            PELLS_LOG("error",
                      "Can't get timestamp for file " << file.string() << ": " << reason.what());
        }
    }
}

std::string AssetManager::fixName(const std::string& name) {
    std::string fixed = name;
    std::replace(fixed.begin(), fixed.end(), '\\', '/');
    return fixed;
}

AssetManager::CacheRange AssetManager::getSubdirRange(const std::string& dir) const {
    if (dir.empty())
        return CacheRange(cache.begin(), cache.end());
    // '0' follows '/'.
    return CacheRange(cache.lower_bound(dir + '/'), cache.lower_bound(dir + '0'));
}

boost::intrusive_ptr<baseiStreamContainer> AssetManager::getFileStream(const std::string& name,
                                                                       bool flag) {
    std::string converted;
    const std::string& fixed = fixedName(name, converted);
    const OpeningPrefix prefix(*this, fixed);
    if (const Source* const cached = cacheIndex->find(fixed)) {
        PELLS_LOG("asset.open", prefix << "found in cache");
        return openCached(*cached, flag);
    }
    const auto alias = aliases.find(fixed);
    if (alias != aliases.end()) {
        if (const Source* const cached = cacheIndex->find(alias->second)) {
            PELLS_LOG("asset.open", prefix << "not in cache, but alias is: " << alias->second);
            return openCached(*cached, flag);
        }
        PELLS_LOG("asset.open", prefix << "alias not in cache: " << alias->second);
    }
    const std::string& real = alias != aliases.end() ? alias->second : fixed;
    PELLS_LOG("asset.open", prefix << real << " not in cache, trying filesystem");
    const boost::intrusive_ptr<Opener> opener(new FileOpener(assetPath(real).string(), 0));
    return opener->open(flag);
}

boost::intrusive_ptr<baseiStreamContainer> AssetManager::openCached(const Source& source,
                                                                    bool flag) {
    if (source.archive == newerFile)
        return newerFiles.find(source.name())->second->open(flag);
    pellistream* const archive = archives[source.archive].second.get();
    return MemberOpener(*source.member, archiveTimes[source.archive], archive).open(flag);
}

bool AssetManager::isFile(const std::string& name) const {
    std::string converted;
    const std::string& fixed = fixedName(name, converted);
    if (cacheIndex->find(fixed))
        return true;
    const fs::file_type type = typeOfAsset(fixed);
    return type != fs::status_error && type != fs::file_not_found && type != fs::directory_file;
}

bool AssetManager::isDir(const std::string& name) const {
    const std::string fixed = fixName(name);
    const CacheRange range = getSubdirRange(fixed);
    return range.first != range.second || typeOfAsset(fixed) == fs::directory_file;
}

std::vector<std::string> AssetManager::listfiles(const std::string& dir, bool dirs) const {
    return listFolder(dir, dirs, true);
}

/// listfiles(), or its part that comes from archives.
std::vector<std::string> AssetManager::listFolder(const std::string& dir, bool dirs,
                                                  bool onDisk) const {
    const ListingPrefix prefix(dir, dirs);
    const std::string fixed = fixName(dir);
    std::vector<std::string> names;
    listCached(fixed, dirs, prefix, names);
    if (onDisk)
        listFileSystem(fixed, dirs, prefix, names);
    return names;
}

void AssetManager::listCached(const std::string& dir, bool dirs, const ListingPrefix& prefix,
                              std::vector<std::string>& names) const {
    const std::string::size_type start = dir.empty() ? 0 : dir.size() + 1;
    const CacheRange range = getSubdirRange(dir);
    for (Cache::const_iterator entry = range.first; entry != range.second;) {
        const std::string& key = entry->name();
        const std::string::size_type slash = key.find('/', start);
        const bool inSubdir = slash != std::string::npos;
        PELLS_LOG("asset.iter", prefix << "considering " << key);
        if (!dirs && inSubdir) {
            PELLS_LOG("asset.list", prefix << "skipping subdir file: " << key.substr(start));
        } else if (!dirs) {
            names.push_back(key.substr(start));
            PELLS_LOG("asset.list", prefix << "from cache: " << names.back());
        } else if (!inSubdir) {
            PELLS_LOG("asset.list", prefix << "skipping plain file: " << key.substr(start));
        } else {
            const std::string subdir = key.substr(start, slash - start);
            PELLS_LOG("asset.list", prefix << "from cache: " << subdir);
            // What lies in one folder lies side by side.
            if (names.empty() || names.back() != subdir)
                names.push_back(subdir);
        }
        // Without lines to write for each, the entries in a folder are passed over as a whole.
        if (inSubdir && !prefix.wasWritten())
            entry = cache.lower_bound(key.substr(0, slash) + '0');
        else
            ++entry;
    }
}

void AssetManager::listFileSystem(const std::string& dir, bool dirs, const ListingPrefix& prefix,
                                  std::vector<std::string>& names) const {
    if (!isNativeName(dir))
        return;
    const fs::path folder = assetPath(dir);
    const std::string start = dir.empty() ? dir : dir + '/';
    boost::system::error_code error;
    for (fs::directory_iterator entry(folder, error), end; !error && entry != end;
         entry.increment(error)) {
        if ((typeOf(entry->path()) == fs::directory_file) != dirs)
            continue;
        const std::string name = entry->path().filename().string();
        PELLS_LOG("asset.list", prefix << "from filesystem: " << name);
        const std::string key = start + name;
        const CacheRange below = dirs ? getSubdirRange(key) : CacheRange();
        if (dirs ? below.first == below.second : !cacheIndex->find(key))
            names.push_back(name);
    }
    if (error && typeOf(folder) != fs::file_not_found) {
        const fs::filesystem_error reason("directory_iterator", folder, error);
        PELLS_LOG("error", prefix << "Can't list directory in filesystem: " << reason.what());
    }
}

AssetManager::Resolution AssetManager::resolve(const std::string& name) const {
    Resolution found;
    std::string real = fixName(name);
    Cache::const_iterator cached = cache.find(real);
    const auto alias = aliases.find(real);
    if (cached == cache.end() && alias != aliases.end()) {
        real = found.alias = alias->second;
        cached = cache.find(real);
    }
    if (cached != cache.end()) {
        describe(*cached, found);
    } else if (canBeRead(assetPath(real).string())) {
        found.source = Resolution::FILE_SYSTEM;
        found.path = assetPath(real).string();
    }
    for (std::size_t i = 0; cached != cache.end() && i < archives.size(); ++i) {
        const bool serves =
            found.source == Resolution::ARCHIVE_MEMBER && found.path == archives[i].first;
        if (serves || archives[i].second->getDirectory().count(real) == 0)
            continue;
        found.overridden.push_back(archives[i].first);
        if (found.source == Resolution::ARCHIVE_MEMBER &&
            archiveTimes[i] == archiveTimes[cached->archive])
            found.tie = true;
    }
    return found;
}

/// Fills in what an entry of the cache says.
void AssetManager::describe(const Source& source, Resolution& found) const {
    if (source.archive != newerFile) {
        found.source = Resolution::ARCHIVE_MEMBER;
        found.member = source.name();
        found.path = archives[source.archive].first;
        return;
    }
    const std::string& path = newerFiles.find(source.name())->second->getName();
    if (canBeRead(path)) {
        found.source = Resolution::NEWER_FILE;
        found.path = path;
    }
}

AssetManager::Opener::Opener(const std::string& sourceName, std::int64_t sourceTime)
    : name(sourceName), writeTime(sourceTime) {}

AssetManager::Opener::~Opener() = default;

std::int32_t AssetManager::Opener::getTimestamp() const {
    typedef std::numeric_limits<std::int32_t> Limits;
    const std::int64_t atLeast = std::max<std::int64_t>(writeTime, Limits::min());
    return static_cast<std::int32_t>(std::min<std::int64_t>(atLeast, Limits::max()));
}

AssetManager::FileOpener::FileOpener(std::string filePath, std::int64_t sourceTime)
    : Opener(path, sourceTime), path(std::move(filePath)) {}

AssetManager::FileOpener::~FileOpener() = default;

boost::intrusive_ptr<baseiStreamContainer> AssetManager::FileOpener::open(bool /*flag*/) {
    try {
        return boost::intrusive_ptr<baseiStreamContainer>(new iTemporaryStreamContainer(getName()));
    } catch (const iTemporaryStreamContainer::CantOpen&) {
        PELLS_LOG("error", "Couldn't open the specified file from disc: " << getName());
    }
    return nullptr;
}

AssetManager::MemberOpener::MemberOpener(const pellistream::Directory::value_type& entry,
                                         std::int64_t sourceTime, pellistream* openArchive)
    : Opener(entry.first, sourceTime), archive(openArchive), member(&entry) {}

AssetManager::MemberOpener::~MemberOpener() = default;

boost::intrusive_ptr<baseiStreamContainer> AssetManager::MemberOpener::open(bool /*flag*/) {
    archive->open(*member);
    return boost::intrusive_ptr<baseiStreamContainer>(new MemberContainer(*archive));
}

}  // namespace pells
