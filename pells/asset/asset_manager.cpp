#include "pells/asset/asset_manager.h"

#include <algorithm>
#include <limits>
#include <ostream>
#include <utility>

#include "pells/asset/detail/alias_tree.h"
#include "pells/asset/detail/asset_index.h"
#include "pells/asset/detail/asset_listing.h"
#include "pells/asset/detail/asset_path.h"
#include "pells/core/class_name.h"
#include "pells/log/log.h"
#include "pells/platform/debugger.h"
#include "pells/platform/detail/regular_file.h"

namespace pells {

template class RogueSingleton<AssetManager, SingletonFactory<AssetManager>>;
template class Singleton<AssetManager, SingletonFactory<AssetManager>>;

namespace fs = boost::filesystem;

namespace {

std::size_t aliasLimit = 1000000;

/// AssetManager::fixName() that copies only the names that it changes.
const std::string& fixedName(const std::string& name, std::string& converted) {
    if (name.find('\\') == std::string::npos)
        return name;
    return converted = AssetManager::fixName(name);
}

bool canBeRead(const std::string& path) {
    return detail::RegularFile().openToRead(path);
}

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

using detail::AssetIndex;

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

AssetManager::AssetManager() : index(std::make_unique<AssetIndex>(detail::assetRoot())) {
    aliases = detail::AliasTree(*index, *this).build(aliasLimit);
}

AssetManager::~AssetManager() {
    reportContainersLeft();
}

std::string AssetManager::fixName(const std::string& name) {
    std::string fixed = name;
    std::replace(fixed.begin(), fixed.end(), '\\', '/');
    return fixed;
}

boost::intrusive_ptr<baseiStreamContainer> AssetManager::getFileStream(const std::string& name,
                                                                       bool flag) {
    std::string converted;
    const std::string& fixed = fixedName(name, converted);
    const OpeningPrefix prefix(*this, fixed);
    if (const AssetIndex::Source* const cached = index->find(fixed)) {
        PELLS_LOG("asset.open", prefix << "found in cache");
        return index->open(*cached, flag);
    }
    const auto alias = aliases.find(fixed);
    if (alias != aliases.end()) {
        if (const AssetIndex::Source* const cached = index->find(alias->second)) {
            PELLS_LOG("asset.open", prefix << "not in cache, but alias is: " << alias->second);
            return index->open(*cached, flag);
        }
        PELLS_LOG("asset.open", prefix << "alias not in cache: " << alias->second);
    }
    const std::string& real = alias != aliases.end() ? alias->second : fixed;
    PELLS_LOG("asset.open", prefix << real << " not in cache, trying filesystem");
    const boost::intrusive_ptr<Opener> opener(new FileOpener(detail::assetPath(real).string(), 0));
    return opener->open(flag);
}

bool AssetManager::isFile(const std::string& name) const {
    std::string converted;
    const std::string& fixed = fixedName(name, converted);
    if (index->find(fixed))
        return true;
    const fs::file_type type = detail::typeOfAsset(fixed);
    return type != fs::status_error && type != fs::file_not_found && type != fs::directory_file;
}

bool AssetManager::isDir(const std::string& name) const {
    const std::string fixed = fixName(name);
    return index->hasBelow(fixed) || detail::typeOfAsset(fixed) == fs::directory_file;
}

std::vector<std::string> AssetManager::listfiles(const std::string& dir, bool dirs) const {
    const detail::AssetListing listing(*index, dir, true);
    return dirs ? listing.folders() : listing.files();
}

AssetManager::Resolution AssetManager::resolve(const std::string& name) const {
    Resolution found;
    std::string real = fixName(name);
    const AssetIndex::Source* source = index->find(real);
    const auto alias = aliases.find(real);
    if (!source && alias != aliases.end()) {
        real = found.alias = alias->second;
        source = index->find(real);
    }
    if (source) {
        describe(*source, found);
        describeOverridden(*source, found);
    } else if (canBeRead(detail::assetPath(real).string())) {
        found.source = Resolution::FILE_SYSTEM;
        found.path = detail::assetPath(real).string();
    }
    return found;
}

/// Fills in where an indexed asset is taken from.
void AssetManager::describe(const detail::AssetSource& source, Resolution& found) const {
    if (!source.isNewerFile()) {
        found.source = Resolution::ARCHIVE_MEMBER;
        found.member = source.name();
        found.path = index->archiveOf(source).path;
    } else if (canBeRead(index->pathOf(source))) {
        found.source = Resolution::NEWER_FILE;
        found.path = index->pathOf(source);
    }
}

/// Fills in which archives hold the name without serving it.
void AssetManager::describeOverridden(const detail::AssetSource& source, Resolution& found) const {
    const AssetIndex::Archive* const serving =
        source.isNewerFile() ? nullptr : &index->archiveOf(source);
    for (const AssetIndex::Archive& each : index->getArchives()) {
        if (&each == serving || each.stream->getDirectory().count(source.name()) == 0)
            continue;
        found.overridden.push_back(each.path);
        found.tie = found.tie || (serving && each.writeTime == serving->writeTime);
    }
}

std::size_t AssetManager::getAliasLimit() {
    return aliasLimit;
}

void AssetManager::setAliasLimit(std::size_t names) {
    aliasLimit = names;
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
