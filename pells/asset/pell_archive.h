#pragma once

#include <boost/iterator/transform_iterator.hpp>
#include <cstdint>
#include <ios>
#include <istream>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "pells/asset/zlib_wrapper.h"
#include "pells/core/export.h"
#include "pells/log/stream_buffers.h"

/// \file
/// Reading pell archives: one file that holds many named members, each a zlib stream (RFC 1950).
///
/// Everything but the members' data is 8-bit text:
///
///     "PELLS " OFFSET "v1.0" CR LF 0x1A    OFFSET of the directory from the start of the file
///     ... data of the members, anywhere and in any order ...
///     "O" OFFSET " L" LENGTH " |" NAME CR LF    one line per member, to the end of the file or
///     0x1A
///
/// Offsets and lengths are hexadecimal and below 2^32; leading zeros are fine, so that a writer can
/// reserve a field of fixed width in the header. In the directory nothing but digits makes a
/// number: no sign and no "0x". The order of the fields is free, fields of other letters are
/// ignored, and of two fields of one letter, or two entries of one name, the later counts. Any
/// minor version is accepted. Names are case-sensitive, have "/" between levels and may hold
/// spaces.

namespace pells {

/// An archive's input stream, its directory, and the name of the member that is selected.
template <class Stream>
class PELLS_TEMPLATE_API basic_pellbuf {
public:
    /// Where the stored (compressed) bytes of a member lie in the archive. Nothing says that the
    /// file reaches that far.
    struct Entry {
        std::streamoff offset;  ///< in bytes, from the start of the file
        std::uint32_t length;   ///< in bytes
    };
    /// The members by name, in ascending byte order.
    typedef std::map<std::string, Entry> Directory;

    /// Picks the name from an entry of the directory.
    struct NameOf {
        typedef const std::string& result_type;
        result_type operator()(const typename Directory::value_type& entry) const {
            return entry.first;
        }
    };
    /// Yields member names.
    typedef boost::transform_iterator<NameOf, typename Directory::const_iterator> const_iterator;

    /// \param archiveStream not null; outlives this object unless it is handed over.
    /// \param owns          true hands the stream over: it is deleted with this object.
    basic_pellbuf(Stream* archiveStream, bool owns);
    basic_pellbuf(const basic_pellbuf&) = delete;
    basic_pellbuf& operator=(const basic_pellbuf&) = delete;
    virtual ~basic_pellbuf();

    /// The member names in ascending order.
    const_iterator begin() const;
    const_iterator end() const;

    /// Where each member lies in the file, by name.
    const Directory& getDirectory() const;

    /// The name that selected the member as it was asked for, or "" without one.
    const std::string& getMemberName() const;

protected:
    Stream* stream;          ///< the archive
    Stream* ownedStream;     ///< the same if it is this object's, else null
    Directory directory;     ///< filled by the derived class
    std::string memberName;  ///< see getMemberName()
};

extern template class PELLS_API basic_pellbuf<std::istream>;

/// Serves the inflated bytes of one member of an archive file at a time.
///
/// The library has the instance for char. An archive that was opened is without a selected member
/// and reads as empty. The file stays open as long as the buffer lives.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API basic_pellibuf : public simple_istreambuf<C, Traits>,
                                          public basic_pellbuf<std::istream> {
public:
    /// A file is no archive that can be read, or the file ends before a member's data does.
    struct PELLS_API BadPellFile : public std::runtime_error {
        /// \param message says what is wrong with the file, without its name.
        explicit BadPellFile(const std::string& message);
        ~BadPellFile() override;
    };

    /// Opens an archive and reads its header and directory.
    ///
    /// \param path of a regular file; nothing else is opened, so that no pipe makes it wait.
    /// \throws BadPellFile when the file cannot be opened or its header or directory is damaged. A
    ///         file that ends before its directory is an archive without members. Memory is in
    ///         proportion to the directory's bytes, whatever numbers it holds.
    explicit basic_pellibuf(const std::string& path);
    ~basic_pellibuf() noexcept override;

    /// See basic_pellistream::getWriteTime().
    bool getWriteTime(std::int64_t& seconds) const;

    /// Selects a member; see basic_pellistream::open().
    bool open(const std::string& member);
    void open(const Directory::value_type& entry);

    /// Inflates the next bytes of the selected member.
    ///
    /// \return how many characters were stored, which may be fewer than `room`; 0 at the member's
    ///         end.
    /// \throws BadPellFile when the file ends before the member's data does.
    /// \throws ZlibWrapper::ZlibError when the data is damaged, after logging it under "error".
    long read(C* into, long room) override;

protected:
    /// Reads members of an archive whose directory is known.
    ///
    /// \param file  of the library's own class for archives; not null.
    /// \param known what reading the file's directory would give.
    basic_pellibuf(std::unique_ptr<std::istream> file, Directory&& known);

    /// Inflates straight into the reader's memory where that is larger than the own buffer.
    std::streamsize xsgetn(C* to, std::streamsize count) override;

private:
    void readHeader();
    void select(const Entry& entry);
    void restart();
    std::uint64_t storedRest() const {
        return std::uint64_t{remaining} + aheadCount + inflater.avail_in;
    }
    long inflateSome(C* into, long room, int& result);
    long inflateExactly(C* into, long room, int& result);
    bool paysAhead(long room) const;
    int inflateAhead(long room);
    bool inflateBlock(std::size_t size, long held);
    int returnTo(std::uint64_t position, long room);
    long takeInflated(C* into, long room);
    bool refill(bool wide);
    void fetch(bool wide);

    char inputBuffer[1024];
    ZlibInflater inflater;
    std::uint32_t remaining;
    /// Bytes of the member that were inflated, in more bits than zlib counts with everywhere.
    std::uint64_t produced;
    std::vector<char> window;
    const char* ahead;
    std::uint32_t aheadCount;

    /// Bytes that were inflated ahead.
    std::vector<C> inflated;
    const C* nextInflated;
    long inflatedCount;
    /// How many of them, the last ones, wait for the next block.
    long heldBack;

    Entry selected;
    bool careful;  ///< the member is damaged
};

extern template class PELLS_API basic_pellibuf<char>;
extern template class PELLS_API simple_istream<char, std::char_traits<char>, basic_pellibuf<char>>;

/// An input stream over the members of an archive file.
///
///     pells::pellistream archive("Data/wall.pell");
///     if (archive.open("wood/oak.tga"))
///         archive.read(header, sizeof header);
///
/// The stream is made with exceptions(badbit): reading a damaged member throws BadPellFile or
/// ZlibError itself, from operator>>, read(), getline() and all the others. A member that was
/// damaged does no harm to the next one that is opened. One character can be put back; there is no
/// seeking. One thread only.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API basic_pellistream
    : public simple_istream<C, Traits, basic_pellibuf<C, Traits>> {
public:
    /// The parts of the buffer, for short.
    typedef basic_pellibuf<C, Traits> Buffer;
    typedef typename Buffer::BadPellFile BadPellFile;
    typedef typename Buffer::Directory Directory;
    typedef typename Buffer::const_iterator const_iterator;

    /// Opens an archive and reads its directory.
    ///
    /// \throws BadPellFile with the reason when the file is no archive that can be read.
    explicit basic_pellistream(const std::string& path);
    ~basic_pellistream() override;

    /// Selects the member that the next reads inflate, from its first byte.
    ///
    /// \param member name, "/" between levels, case-sensitive. A name that is not found is tried
    ///        once more with every "\" read as "/".
    /// \return false when the archive has no such member; do not read then.
    ///
    /// Clears the stream's flags. Everyone who shares the stream sees the new member. Nothing is
    /// read before the first read; memory does not depend on the member's size.
    bool open(const std::string& member);

    /// The same without looking for the name.
    ///
    /// \param entry of this archive's getDirectory().
    void open(const typename Directory::value_type& entry);

    /// When the archive was last written, in seconds since 1970: the file that is open, whatever
    /// lies under its name by now. False when the system does not tell.
    bool getWriteTime(std::int64_t& seconds) const;

    /// The member names in ascending order.
    const_iterator begin() const;
    const_iterator end() const;

    /// Where each member lies in the file, by name.
    const Directory& getDirectory() const;

    /// The name that selected the member as it was asked for, or "" without one.
    const std::string& getMemberName() const;

protected:
    /// Takes over a buffer made with new.
    explicit basic_pellistream(Buffer* ownBuffer);
};

extern template class PELLS_API basic_pellistream<char>;

/// The instances for bytes.
typedef basic_pellibuf<char> pellibuf;
typedef basic_pellistream<char> pellistream;

}  // namespace pells
