#include "pells/asset/detail/known_archive.h"

#include <ctime>
#include <map>
#include <utility>

#include "pells/asset/detail/archive_file.h"
#include "pells/asset/pell_archive.h"

namespace pells::detail {

namespace {

typedef RegularFile::Identity Identity;

bool operator==(const Identity& a, const Identity& b) {
    return a.device == b.device && a.number == b.number && a.size == b.size &&
           a.writeTime == b.writeTime && a.writeFraction == b.writeFraction &&
           a.changeTime == b.changeTime && a.changeFraction == b.changeFraction;
}

/// Whether a file that changes from now on gets other times: the clocks of file systems may tick
/// once in two seconds.
bool isSettled(const Identity& identity) {
    const std::int64_t now = std::time(nullptr);
    return identity.changeTime < now - 2 && identity.writeTime < now - 2;
}

/// An archive that shows one member, whose place is known.
class KnownArchive : public pellistream {
public:
    KnownArchive(std::unique_ptr<ArchiveFile> file, Directory known)
        : pellistream(new Member(std::move(file), std::move(known))) {}

private:
    struct Member : Buffer {
        Member(std::unique_ptr<ArchiveFile> file, Directory known)
            : Buffer(std::move(file), std::move(known)) {}
    };
};

/// The archives that were opened, with their directories reduced to the member that was asked for.
class KnownFiles {
public:
    typedef pellistream::Directory Directory;

    /// The directory of a file, or null when it is not known in this state.
    const Directory* find(const std::string& key, const Identity& identity) const {
        const auto known = files.find(key);
        const bool isSame = known != files.end() && known->second.identity == identity;
        return isSame && isSettled(identity) ? &known->second.directory : nullptr;
    }

    void add(const std::string& key, const Identity& identity, Directory directory) {
        if (files.size() >= mostFiles)
            files.clear();
        files[key] = File{identity, std::move(directory)};
    }

private:
    struct File {
        Identity identity;
        Directory directory;
    };

    static const std::size_t mostFiles = 1024;

    std::map<std::string, File> files;
};

}  // namespace

std::unique_ptr<std::istream> openKnownMember(const std::string& path, const std::string& member) {
    static KnownFiles files;
    const std::string key = path + '\0' + member;
    auto file = std::make_unique<ArchiveFile>(path);
    Identity identity{};
    const bool isIdentified = file->getFile().identify(identity);
    std::unique_ptr<pellistream> archive;
    if (const auto* const known = isIdentified ? files.find(key, identity) : nullptr) {
        archive = std::make_unique<KnownArchive>(std::move(file), *known);
    } else {
        archive = std::make_unique<pellistream>(path);
        const auto entry = archive->getDirectory().find(member);
        const bool found = entry != archive->getDirectory().end();
        if (isIdentified && isSettled(identity))
            files.add(key, identity,
                      found ? KnownFiles::Directory{*entry} : KnownFiles::Directory());
    }
    // Without such a member the stream is empty.
    static_cast<void>(archive->open(member));
    return archive;
}

}  // namespace pells::detail
