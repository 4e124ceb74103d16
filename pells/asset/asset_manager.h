#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "pells/asset/pell_archive.h"
#include "pells/asset/stream_container.h"
#include "pells/core/singleton.h"

namespace pells {

namespace detail {
class AssetIndex;
struct AssetSource;
}  // namespace detail

class AssetManager;
extern template class PELLS_API RogueSingleton<AssetManager, SingletonFactory<AssetManager>>;
extern template class PELLS_API Singleton<AssetManager, SingletonFactory<AssetManager>>;

/// One name space over the plain files below a folder and the members of the archives in it.
///
/// The folder, the asset root, is the preference "assetLocation". An asset's name is a path
/// relative to it, with "/" between levels, compared byte for byte; "\" in a name that is asked for
/// is read as "/". The manager scans the root once, when it is made by the first instance():
///
/// - Every file there whose name ends in ".asset" is opened as a pell archive and stays open. One
///   that is no good archive is skipped with a line under "error".
/// - Of several archives that hold a name, the one written last serves it. On equal times, which
///   are whole seconds, the one that the scan met first does, and the order of the scan is the file
///   system's: copying archives can change who wins.
/// - A plain file that was written later than the archive is served instead of the member. Whatever
///   has that name counts for one, a folder too, which cannot be opened then.
/// - Files named ".symlinks" declare aliases, see below. Every folder is asked for one, so each
///   folder without one leaves a line under "error" when that tag is on; that is normal.
///
/// Archives and files that come later are only found as plain files. A member whose stored name
/// holds a "\" is never found.
///
/// Aliases. A line "LINK>TARGET" of a folder's ".symlinks" file (an archive member or a plain file)
/// gives the file or child folder TARGET of that folder a second name there, LINK; below a folder,
/// everything gets one. Lines that begin with "#" are comments; other lines are reported under
/// "asset.alias". Nothing is trimmed, so "a > b" names "a " and " b". Folders named "CVS" and
/// ".svn", folders that links of the file system lead back to, folders that ".." in the name of a
/// member would lead to, and folders more than 256 levels down are not searched, and there is a
/// limit on the number of aliases.
///
/// The constructor throws boost::filesystem::filesystem_error when the root cannot be listed and
/// what reading a damaged ".symlinks" member throws; the next instance() tries again. One thread
/// only.
class PELLS_API AssetManager : public Singleton<AssetManager, SingletonFactory<AssetManager>> {
public:
    class Opener;
    class FileOpener;
    class MemberOpener;
    struct Resolution;

    /// Closes the archives; stream containers on their members must be gone. A debug build of the
    /// library tells the debugger if they are not.
    ~AssetManager() override;

    /// The name with every "\" replaced by "/" and nothing else changed.
    static std::string fixName(const std::string& name);

    /// Opens an asset: an archive member or a newer plain file by its name or its alias, else the
    /// plain file of that name below the root.
    ///
    /// \param flag handed to the opener, which ignores it.
    /// \return the container to read from, or null when there is no such asset.
    /// \throws what reading throws, later: pellibuf::BadPellFile and ZlibWrapper::ZlibError leave
    ///         the operations of the stream.
    ///
    /// All members of one archive share one stream, which opening a member positions anew. This
    /// goes wrong, both containers read the second member:
    ///
    ///     auto first = manager.getFileStream("fonts/large.txt", true);
    ///     auto second = manager.getFileStream("fonts/small.txt", true);
    ///     load(first->getStream());
    ///     load(second->getStream());
    ///
    /// Read as far as needed before asking for the next asset:
    ///
    ///     auto first = manager.getFileStream("fonts/large.txt", true);
    ///     load(first->getStream());
    ///     auto second = manager.getFileStream("fonts/small.txt", true);
    ///     load(second->getStream());
    boost::intrusive_ptr<baseiStreamContainer> getFileStream(const std::string& name, bool flag);

    /// Whether an archive has a member of that name or the root anything but a folder, including a
    /// pipe, which getFileStream() refuses. Aliases do not count.
    bool isFile(const std::string& name) const;

    /// Whether an archive has members below that name or the root such a folder. Aliases do not
    /// count.
    bool isDir(const std::string& name) const;

    /// The names of the files (`dirs` false) or the folders (`dirs` true) directly inside a folder,
    /// each once and in no particular order. Aliases do not count.
    ///
    /// \param dir the folder's asset name, "" for the root. Members are not found below a name that
    ///            ends in "/", although isDir() may be true for it.
    ///
    /// Members of archives and what is on disk are listed alike, the archives themselves included.
    /// A folder that exists nowhere has no names; one that cannot be listed is reported under
    /// "error", and the names known so far are returned.
    std::vector<std::string> listfiles(const std::string& dir, bool dirs) const;

    /// Where getFileStream() would take a name from: NOWHERE also for a file that may not be read.
    /// Leaves nothing open and logs nothing.
    Resolution resolve(const std::string& name) const;

    /// The largest number of aliases, 1,000,000 unless it was set. Where the ".symlinks" files
    /// declare more, the rest is dropped with one line under "error". The text of those files and
    /// of the names is limited in proportion, and so is the number of folders that are searched
    /// behind links of the file system: 1,000 and a fiftieth of this.
    static std::size_t getAliasLimit();

    /// Takes effect when the next manager is made.
    static void setAliasLimit(std::size_t names);

private:
    friend class SingletonFactory<AssetManager>;

    class OpeningPrefix;

    AssetManager();

    void describe(const detail::AssetSource& source, Resolution& found) const;
    void describeOverridden(const detail::AssetSource& source, Resolution& found) const;

    std::unique_ptr<detail::AssetIndex> index;
    std::map<std::string, std::string> aliases;
};

/// Where one asset lies and how it is opened.
class PELLS_API AssetManager::Opener : public smart_base {
public:
    ~Opener() override;

    /// The path of a file, or the name of a member in its archive.
    const std::string& getName() const { return name; }

    /// When the file or the archive was last written, in seconds since 1970. 0 for files that were
    /// not looked at.
    std::int64_t getWriteTime() const { return writeTime; }

    /// The same in 32 bits: times beyond them are the first or the last one that they can tell.
    std::int32_t getTimestamp() const;

    /// Opens the asset; null when that cannot be done. The flag means nothing here.
    virtual boost::intrusive_ptr<baseiStreamContainer> open(bool flag) = 0;

protected:
    /// \param sourceName outlives the opener; may be a member of the derived class.
    /// \param sourceTime see getWriteTime().
    Opener(const std::string& sourceName, std::int64_t sourceTime);

private:
    const std::string& name;
    std::int64_t writeTime;
};

/// Opens a plain file. One that cannot be opened leaves a line under "error".
class PELLS_API AssetManager::FileOpener : public AssetManager::Opener {
public:
    /// \param filePath   in the file system, not an asset's name.
    /// \param sourceTime see getWriteTime().
    FileOpener(std::string filePath, std::int64_t sourceTime);
    ~FileOpener() override;

    boost::intrusive_ptr<baseiStreamContainer> open(bool flag) override;

private:
    const std::string path;
};

/// Selects a member of an archive, which outlives the opener and its containers.
class PELLS_API AssetManager::MemberOpener : public AssetManager::Opener {
public:
    /// \param entry       of the archive's directory, where it stays.
    /// \param sourceTime  see getWriteTime().
    /// \param openArchive not owned; outlives the opener.
    MemberOpener(const pellistream::Directory::value_type& entry, std::int64_t sourceTime,
                 pellistream* openArchive);
    ~MemberOpener() override;

    /// The archive that holds the member.
    const pellistream* getArchive() const { return archive; }

    boost::intrusive_ptr<baseiStreamContainer> open(bool flag) override;

private:
    pellistream* archive;
    const pellistream::Directory::value_type* member;
};

/// The answer of AssetManager::resolve().
struct PELLS_API AssetManager::Resolution {
    /// What kind of place serves the name.
    enum Source {
        NOWHERE,         ///< getFileStream() would return null
        ARCHIVE_MEMBER,  ///< a member of an archive
        NEWER_FILE,  ///< a plain file that was newer than the archives when the root was scanned
        FILE_SYSTEM  ///< a plain file that no archive holds
    };

    /// Where the asset lies.
    Source source = NOWHERE;
    /// The archive or the plain file; empty for NOWHERE.
    std::string path;
    /// The name in the archive; empty for plain files.
    std::string member;
    /// The name that an alias stands for; empty when the name is none.
    std::string alias;
    /// The archives that hold the name, too, but do not serve it, in the order of the scan.
    std::vector<std::string> overridden;
    /// One of those archives has the same write time, and the order of the scan decided.
    bool tie = false;
};

}  // namespace pells
