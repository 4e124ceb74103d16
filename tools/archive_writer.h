#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <iosfwd>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>

#include "tools/atomic_file.h"

namespace pells {

/// Writes one pell archive, member by member.
///
///     pells::ArchiveWriter archive("Data/walls.asset");
///     archive.add("readme.txt", "hello\n");
///     archive.addFolder("work/walls");
///     archive.finish();
///
/// Members are compressed as they come: memory does not depend on their size. The file appears
/// under its name at finish(), complete; without finish(), or after a failure, the old file stays
/// and nothing else is left behind.
///
/// The same members, added in the same order, give the same bytes with the same version of zlib: no
/// times are kept, the level of compression is fixed, the directory is in byte-wise order of the
/// names. addFolder() adds in that order too, whatever order the file system lists.
///
/// A member's name is what AssetManager is asked for: "/" between levels, case-sensitive. Any bytes
/// may stand in it but carriage return and line feed, which end a directory entry, and the
/// backslash, which is read as "/" when an asset is asked for, so that the member could never be
/// reached. It is not empty, and no two members share one.
///
/// The file: "PELLS ", the offset of the directory in eight hexadecimal digits, "v1.0", CR, LF,
/// 0x1A; then the members, each a zlib stream (RFC 1950); then one line per member,
/// "O<offset> L<stored length> |<name>", CR, LF. Numbers have 32 bits.
class ArchiveWriter {
public:
    /// The archive cannot hold what was added. what() is "ARCHIVE: member 'NAME': REASON".
    class Refused : public std::runtime_error {
    public:
        using std::runtime_error::runtime_error;
    };

    /// The largest archive: every offset and length fits the 32 bits that the directory has.
    static constexpr std::uint64_t maximumSize = 0xFFFFFFFFU;

    /// \param path      the archive that finish() makes or replaces.
    /// \param sizeLimit the most bytes it may have, at most maximumSize.
    /// \throws FileError when its folder cannot be written.
    explicit ArchiveWriter(const std::string& path, std::uint64_t sizeLimit = maximumSize);
    ~ArchiveWriter();
    ArchiveWriter(const ArchiveWriter&) = delete;
    ArchiveWriter& operator=(const ArchiveWriter&) = delete;

    /// Adds a member from memory.
    ///
    /// \throws Refused for its name, before anything is written, so that more may be added; or when
    ///         the archive would grow beyond its limit.
    /// \throws FileError when writing fails.
    ///
    /// After an exception other than for the name, only the destructor may follow: everything else
    /// throws std::logic_error. This holds for all four ways to add.
    void add(const std::string& name, const std::string& bytes);

    /// Adds a member from a stream, read from where it stands to its end.
    ///
    /// \throws Refused also when the stream fails. What the stream itself throws passes through.
    void add(const std::string& name, std::istream& in);

    /// Adds the bytes of a file. \throws FileError also when the file cannot be read, or changes
    /// its length while it is.
    void addFile(const std::string& name, const std::string& path);

    /// Adds every file below a folder, hidden ones too, under its path relative to the folder.
    ///
    /// A symbolic link to a regular file below the folder is stored as a copy of that file. What
    /// cannot be stored ends the call with an exception instead of being left out: a link that
    /// leads out of the folder, to a folder (name that in ".symlinks") or nowhere; a device, pipe
    /// or socket; and an archive that is itself being written below the folder. What is swapped
    /// for a link or a pipe after the folder was listed is an error, too: nothing outside the
    /// folder is ever read. Folders without files leave no trace, since an archive has only files;
    /// temporary files of an AtomicFile, which may belong to another process, are left out.
    ///
    /// \throws Refused, FileError as addFile() does.
    void addFolder(const std::string& folder);

    /// Completes the archive and gives it its name. Nothing may be added afterwards.
    ///
    /// \throws Refused when the directory passes the limit; FileError when writing fails.
    void finish();

private:
    class Deflater;

    struct Entry {
        std::uint64_t offset;
        std::uint64_t length;
    };

    /// Stores up to the given number of bytes and returns how many; 0 at the end.
    typedef std::function<std::size_t(char*, std::size_t)> Source;

    void addFrom(const std::string& name, const Source& source);
    void beginMember(const std::string& name);
    void endMember();
    void checkName(const std::string& name) const;
    void checkFile(const std::string& name, const std::string& obstacle) const;
    void checkUsable() const;
    void write(const char* bytes, std::size_t count);
    void writeDirectory();
    [[noreturn]] void refuse(const std::string& name, const std::string& reason) const;
    [[noreturn]] void refuseSize() const;

    AtomicFile file;
    std::uint64_t limit;
    std::unique_ptr<Deflater> deflater;
    std::map<std::string, Entry> directory;
    std::string current;  ///< the member being written; not empty also after it failed
    bool finished;
};

}  // namespace pells
