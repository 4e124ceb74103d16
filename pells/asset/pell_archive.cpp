#include "pells/asset/pell_archive.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <locale>
#include <sstream>

#include "pells/asset/detail/archive_file.h"
#include "pells/asset/detail/pell_directory.h"
#include "pells/core/version.h"

namespace pells {

namespace {

const char stamp[] = {'P', 'E', 'L', 'L', 'S', ' '};
const char terminator[] = {'\r', '\n', '\x1a'};

/// Compressed input is read in blocks of this size.
const std::uint32_t blockSize = 1024;

/// Compressed input that is read ahead: a little for a reader who takes small pieces; for one who
/// asks for much, most members as a whole, since every further piece makes zlib copy its window.
const std::uint32_t smallWindow = 8 * 1024;
const std::uint32_t largeWindow = 256 * 1024;

/// What is inflated at a time for one who asks for much, but less than this. zlib is slow wherever
/// the data repeats bytes of an earlier call; with pieces of 4 KB a quarter of the time goes there.
const long largeBlock = 256L * 1024;

/// The same for one who takes small pieces but has taken more than a glance.
const long smallBlock = 32L * 1024;
const std::uint64_t glance = 4096;

bool isFailure(int zlibResult) {
    return zlibResult != Z_OK && zlibResult != Z_STREAM_END;
}

const Version& currentVersion() {
    static const Version version("1.0");
    return version;
}

}  // namespace

template <class Stream>
basic_pellbuf<Stream>::basic_pellbuf(Stream* archiveStream, bool owns)
    : stream(archiveStream), ownedStream(owns ? archiveStream : nullptr) {}

template <class Stream>
basic_pellbuf<Stream>::~basic_pellbuf() {
    delete ownedStream;
}

template <class Stream>
typename basic_pellbuf<Stream>::const_iterator basic_pellbuf<Stream>::begin() const {
    return const_iterator(directory.begin(), NameOf());
}

template <class Stream>
typename basic_pellbuf<Stream>::const_iterator basic_pellbuf<Stream>::end() const {
    return const_iterator(directory.end(), NameOf());
}

template <class Stream>
const typename basic_pellbuf<Stream>::Directory& basic_pellbuf<Stream>::getDirectory() const {
    return directory;
}

template <class Stream>
const std::string& basic_pellbuf<Stream>::getMemberName() const {
    return memberName;
}

template <class C, class Traits>
basic_pellibuf<C, Traits>::BadPellFile::BadPellFile(const std::string& message)
    : std::runtime_error(message) {}

template <class C, class Traits>
basic_pellibuf<C, Traits>::BadPellFile::~BadPellFile() = default;

template <class C, class Traits>
basic_pellibuf<C, Traits>::basic_pellibuf(const std::string& path)
    : basic_pellibuf(std::make_unique<detail::ArchiveFile>(path), Directory()) {
    if (stream->fail())
        throw BadPellFile("Can't open pell file");
    readHeader();
    detail::readPellDirectory(*stream, directory);
}

template <class C, class Traits>
basic_pellibuf<C, Traits>::basic_pellibuf(std::unique_ptr<std::istream> file, Directory&& known)
    : simple_istreambuf<C, Traits>(1024),
      basic_pellbuf<std::istream>(file.release(), true),
      inflater(nullptr, 0, 15, nullptr, nullptr, nullptr),
      remaining(0),
      produced(0),
      ahead(nullptr),
      aheadCount(0),
      nextInflated(nullptr),
      inflatedCount(0),
      heldBack(0),
      selected{},
      careful(false) {
    static_assert(sizeof(C) == 1 && sizeof inputBuffer == blockSize, "members are bytes");
    directory.swap(known);
}

template <class C, class Traits>
basic_pellibuf<C, Traits>::~basic_pellibuf() noexcept try {
} catch (...) {
    // The inflater throws, after a line in the log, when zlib finds its stream inconsistent.
    return;
}

template <class C, class Traits>
bool basic_pellibuf<C, Traits>::getWriteTime(std::int64_t& seconds) const {
    detail::RegularFile::Identity identity{};
    if (!static_cast<const detail::ArchiveFile&>(*stream).getFile().identify(identity))
        return false;
    seconds = identity.writeTime;
    return true;
}

template <class C, class Traits>
void basic_pellibuf<C, Traits>::readHeader() {
    stream->seekg(0);
    if (!stream->read(inputBuffer, sizeof stamp))
        throw BadPellFile("Pell file too short for stamp");
    if (std::memcmp(inputBuffer, stamp, sizeof stamp) != 0)
        throw BadPellFile("Input file not a pell file");

    std::uint32_t directoryOffset = 0;
    char versionMark = 0;
    int majorNumber = 0;
    char dot = 0;
    int minorNumber = 0;
    *stream >> std::hex >> directoryOffset >> std::dec;
    *stream >> versionMark >> majorNumber >> dot >> minorNumber;
    if (!*stream)
        throw BadPellFile("Cannot read pell file header");
    bool formatIsGood = versionMark == 'v' && dot == '.';
    for (const char expected : terminator)
        formatIsGood = formatIsGood && stream->get() == static_cast<unsigned char>(expected);
    if (!formatIsGood)
        throw BadPellFile("Bad pell file header format");

    std::ostringstream message;
    message.imbue(std::locale::classic());
    if (majorNumber != currentVersion().getMajor()) {
        message << "Bad pell file version " << majorNumber << '.' << minorNumber
                << ", current version is " << currentVersion();
        throw BadPellFile(message.str());
    }
    if (!stream->seekg(static_cast<std::streamoff>(directoryOffset))) {
        message << "Bad pell file directory offset " << std::hex << directoryOffset;
        throw BadPellFile(message.str());
    }
}

template <class C, class Traits>
bool basic_pellibuf<C, Traits>::open(const std::string& member) {
    Directory::const_iterator entry = directory.find(member);
    if (entry == directory.end()) {
        std::string converted = member;
        std::replace(converted.begin(), converted.end(), '\\', '/');
        entry = directory.find(converted);
    }
    if (entry == directory.end()) {
        memberName.clear();
        return false;
    }
    memberName = member;
    select(entry->second);
    return true;
}

template <class C, class Traits>
void basic_pellibuf<C, Traits>::open(const Directory::value_type& entry) {
    memberName = entry.first;
    select(entry.second);
}

template <class C, class Traits>
void basic_pellibuf<C, Traits>::select(const Entry& entry) {
    selected = entry;
    C* const start = this->buffer();
    this->setg(start, start, start);
    careful = false;
    restart();
}

/// Begins to inflate the selected member anew.
template <class C, class Traits>
void basic_pellibuf<C, Traits>::restart() {
    stream->clear();
    stream->seekg(selected.offset);
    remaining = selected.length;
    aheadCount = 0;
    inflatedCount = 0;
    heldBack = 0;
    produced = 0;
    inflateReset(&inflater);
    inflater.next_in = nullptr;
    inflater.avail_in = 0;
}

template <class C, class Traits>
long basic_pellibuf<C, Traits>::read(C* into, long room) {
    if (room <= 0)
        return 0;
    int result = inflatedCount <= heldBack ? inflateAhead(room) : Z_OK;
    long count = 0;
    if (inflatedCount == 0 && !isFailure(result))
        count = inflateExactly(into, room, result);
    if (inflatedCount != 0)
        return takeInflated(into, room);
    if (isFailure(result)) {
        inflater.check("read(): bad pell data stream for member '" + memberName + "'", result,
                       Z_STREAM_END, Z_OK);
    }
    return count;
}

/// Inflates for one read, straight into the reader's memory. Where that fails, the rest of what was
/// read ahead may have been in the way: then the member is read in blocks from its start.
template <class C, class Traits>
long basic_pellibuf<C, Traits>::inflateExactly(C* into, long room, int& result) {
    const std::uint64_t position = produced;
    const long count = inflateSome(into, room, result);
    if (!isFailure(result) || careful || room > this->bufferSize())
        return count;
    result = returnTo(position, room);
    return inflatedCount != 0 || isFailure(result) ? 0 : inflateSome(into, room, result);
}

/// Inflates until there is some output; none means the member's end or a failure of zlib.
template <class C, class Traits>
long basic_pellibuf<C, Traits>::inflateSome(C* into, long room, int& result) {
    // Small reads take the input in small pieces, so that whatever comes before a damaged place
    // reaches the reader; large ones give zlib all it can use at once.
    const bool wide = room > this->bufferSize();
    const uInt space = static_cast<uInt>(std::min<long>(room, std::numeric_limits<int>::max()));
    inflater.next_out = reinterpret_cast<Bytef*>(into);
    inflater.avail_out = space;
    do {
        if (inflater.avail_in == 0 && !refill(wide)) {
            result = Z_STREAM_END;
            break;
        }
        result = inflate(&inflater, Z_NO_FLUSH);
    } while ((result == Z_OK || result == Z_BUF_ERROR) && inflater.avail_out == space);
    produced += space - inflater.avail_out;
    return static_cast<long>(space - inflater.avail_out);
}

/// Whether it pays to inflate more than a read of that size takes.
template <class C, class Traits>
bool basic_pellibuf<C, Traits>::paysAhead(long room) const {
    // Who takes small pieces may want no more than a look at the first bytes.
    const bool mayStop = room <= this->bufferSize() && produced < glance;
    const std::uint64_t severalReads = 4 * static_cast<std::uint64_t>(room);
    return !careful && !mayStop && room < largeBlock && storedRest() >= severalReads;
}

/// Inflates a block of which the next reads are served, behind what was held back of the last one.
///
/// \return a failure of zlib that the next read is to report, if there is one.
template <class C, class Traits>
int basic_pellibuf<C, Traits>::inflateAhead(long room) {
    const bool small = room <= this->bufferSize();
    if (inflatedCount == 0 ? !paysAhead(room) : !small) {
        heldBack = 0;
        return Z_OK;
    }
    const std::uint64_t position = produced - static_cast<std::uint64_t>(inflatedCount);
    std::copy(nextInflated, nextInflated + inflatedCount, inflated.begin());
    const std::uint64_t wanted =
        std::max<std::uint64_t>(4 * storedRest(), static_cast<std::uint64_t>(this->bufferSize()));
    const long most = small ? smallBlock : largeBlock;
    const std::size_t size = static_cast<std::size_t>(
        inflatedCount + static_cast<long>(std::min(wanted, static_cast<std::uint64_t>(most))));
    if (inflated.size() < size)
        inflated.resize(size);
    nextInflated = inflated.data();
    const bool good = inflateBlock(size, small ? this->bufferSize() : 0);
    return good ? Z_OK : returnTo(position, room);
}

/// \param held how much of the block waits for the next one, unless the member ends: what a reader
///             is served must not reach into the piece that a damage behind the block loses.
/// \return false for damage.
template <class C, class Traits>
bool basic_pellibuf<C, Traits>::inflateBlock(std::size_t size, long held) {
    int result = Z_OK;
    long count = 1;
    try {
        while (count != 0 && inflatedCount <= held && !isFailure(result)) {
            const long room = static_cast<long>(size) - inflatedCount;
            count = inflateSome(inflated.data() + inflatedCount, room, result);
            inflatedCount += count;
        }
    } catch (const BadPellFile&) {
        return false;
    }
    heldBack = count != 0 ? held : 0;
    return !isFailure(result);
}

/// Goes back to a place in a damaged member, in blocks of input and pieces as the reader asks for
/// them, and inflates nothing ahead any more: the pieces before the damaged one are served as if
/// nothing had been.
///
/// \return the result of the piece that reaches the place: a failure has lost what it inflated.
template <class C, class Traits>
int basic_pellibuf<C, Traits>::returnTo(std::uint64_t position, long room) {
    restart();
    careful = true;
    const std::size_t largestPiece = static_cast<std::size_t>(std::max(room, this->bufferSize()));
    if (inflated.size() < largestPiece)
        inflated.resize(largestPiece);
    int result = Z_OK;
    long count = 1;
    while (produced < position && count != 0 && !isFailure(result)) {
        // Before the first piece there is no character that could be put back.
        const long piece = produced == 0 ? std::max(room, this->bufferSize()) : room;
        count = inflateSome(inflated.data(), piece, result);
    }
    if (produced > position && !isFailure(result)) {
        inflatedCount = static_cast<long>(produced - position);
        nextInflated = inflated.data() + (count - inflatedCount);
    }
    return result;
}

template <class C, class Traits>
long basic_pellibuf<C, Traits>::takeInflated(C* into, long room) {
    const long count = std::min(room, inflatedCount - heldBack);
    Traits::copy(into, nextInflated, static_cast<std::size_t>(count));
    nextInflated += count;
    inflatedCount -= count;
    return count;
}

template <class C, class Traits>
std::streamsize basic_pellibuf<C, Traits>::xsgetn(C* to, std::streamsize count) {
    std::streamsize done = std::min<std::streamsize>(count, this->egptr() - this->gptr());
    Traits::copy(to, this->gptr(), static_cast<std::size_t>(done));
    this->gbump(static_cast<int>(done));
    while (count - done > this->bufferSize()) {
        const std::streamsize most = std::numeric_limits<long>::max();
        const long got = read(to + done, static_cast<long>(std::min(count - done, most)));
        if (got <= 0)
            return done;
        done += got;
        // The last character consumed can be put back.
        C* const start = this->buffer();
        *start = to[done - 1];
        this->setg(start, start + 1, start + 1);
    }
    return done + simple_istreambuf<C, Traits>::xsgetn(to + done, count - done);
}

/// Gives the inflater input; false when the member has no more.
template <class C, class Traits>
bool basic_pellibuf<C, Traits>::refill(bool wide) {
    if (aheadCount == 0) {
        if (remaining == 0)
            return false;
        fetch(wide);
    }
    const std::uint32_t given = wide ? aheadCount : std::min(aheadCount, blockSize);
    inflater.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(ahead));
    inflater.avail_in = given;
    ahead += given;
    aheadCount -= given;
    return true;
}

/// Reads the next stored bytes of the member.
template <class C, class Traits>
void basic_pellibuf<C, Traits>::fetch(bool wide) {
    const std::uint32_t wanted = std::min(remaining, wide ? largeWindow : smallWindow);
    if (wanted > window.size() && wanted > blockSize)
        window.resize(wanted);
    char* const into = wanted > blockSize ? window.data() : inputBuffer;
    stream->read(into, static_cast<std::streamsize>(wanted));
    std::uint32_t got = static_cast<std::uint32_t>(stream->gcount());
    if (got < wanted) {
        // The file ends here. The whole blocks before its end are served, as if they had been read
        // one by one; the next attempt finds the stream failed and nothing to serve.
        got -= got % blockSize;
        if (got == 0)
            throw BadPellFile("Can't read pell data stream for member '" + memberName + "'");
    }
    remaining -= got;
    ahead = into;
    aheadCount = got;
}

template class basic_pellbuf<std::istream>;
template class basic_pellibuf<char>;
template class simple_istream<char, std::char_traits<char>, basic_pellibuf<char>>;

template <class C, class Traits>
basic_pellistream<C, Traits>::basic_pellistream(const std::string& path)
    : basic_pellistream(new Buffer(path)) {}

template <class C, class Traits>
basic_pellistream<C, Traits>::basic_pellistream(Buffer* ownBuffer)
    : simple_istream<C, Traits, Buffer>(ownBuffer) {
    this->exceptions(std::ios_base::badbit);
}

template <class C, class Traits>
basic_pellistream<C, Traits>::~basic_pellistream() = default;

template <class C, class Traits>
bool basic_pellistream<C, Traits>::open(const std::string& member) {
    this->clear();
    return this->ownBuffer().open(member);
}

template <class C, class Traits>
void basic_pellistream<C, Traits>::open(const typename Directory::value_type& entry) {
    this->clear();
    this->ownBuffer().open(entry);
}

template <class C, class Traits>
bool basic_pellistream<C, Traits>::getWriteTime(std::int64_t& seconds) const {
    return this->ownBuffer().getWriteTime(seconds);
}

template <class C, class Traits>
typename basic_pellistream<C, Traits>::const_iterator basic_pellistream<C, Traits>::begin() const {
    return this->ownBuffer().begin();
}

template <class C, class Traits>
typename basic_pellistream<C, Traits>::const_iterator basic_pellistream<C, Traits>::end() const {
    return this->ownBuffer().end();
}

template <class C, class Traits>
const typename basic_pellistream<C, Traits>::Directory& basic_pellistream<C, Traits>::getDirectory()
    const {
    return this->ownBuffer().getDirectory();
}

template <class C, class Traits>
const std::string& basic_pellistream<C, Traits>::getMemberName() const {
    return this->ownBuffer().getMemberName();
}

template class basic_pellistream<char>;

}  // namespace pells
