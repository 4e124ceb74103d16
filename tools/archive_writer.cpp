#include "tools/archive_writer.h"

#include <zlib.h>

#include <algorithm>
#include <istream>
#include <new>
#include <vector>

#include "tools/folder_files.h"

namespace pells {

namespace {

const char stamp[] = "PELLS ";
const char versionAndTerminator[] = "v1.0\r\n\x1a";
constexpr std::size_t offsetDigits = 8;
constexpr std::size_t blockSize = 65536;

std::string hexadecimal(std::uint64_t number, std::size_t digits = 1) {
    std::string text;
    for (; number != 0 || text.size() < digits; number /= 16)
        text.insert(text.begin(), "0123456789abcdef"[number % 16]);
    return text;
}

}  // namespace

/// Compresses one member after the other.
class ArchiveWriter::Deflater {
public:
    Deflater() : stream(), input(blockSize), output(blockSize) {
        if (deflateInit2(&stream, Z_BEST_COMPRESSION, Z_DEFLATED, 15, 9, Z_DEFAULT_STRATEGY) !=
            Z_OK)
            throw std::bad_alloc();
    }
    ~Deflater() { deflateEnd(&stream); }
    Deflater(const Deflater&) = delete;
    Deflater& operator=(const Deflater&) = delete;

    void restart() { deflateReset(&stream); }

    /// Compresses a block of at most blockSize bytes and hands what comes out to a function.
    template <class Write>
    void run(const char* bytes, std::size_t count, int flush, const Write& write) {
        // zlib's interface is older than const, and reads only.
        stream.next_in = const_cast<Bytef*>(reinterpret_cast<const Bytef*>(bytes));
        stream.avail_in = static_cast<uInt>(count);
        do {
            stream.next_out = reinterpret_cast<Bytef*>(output.data());
            stream.avail_out = static_cast<uInt>(output.size());
            deflate(&stream, flush);
            write(output.data(), output.size() - stream.avail_out);
        } while (stream.avail_out == 0);
    }

    /// Where the bytes to be compressed may be gathered.
    std::vector<char>& inputBlock() { return input; }

private:
    z_stream stream;
    std::vector<char> input;
    std::vector<char> output;
};

constexpr std::uint64_t ArchiveWriter::maximumSize;

ArchiveWriter::ArchiveWriter(const std::string& path, std::uint64_t sizeLimit)
    : file(path), limit(std::min(sizeLimit, maximumSize)), deflater(new Deflater), finished(false) {
    // The offset of the directory is filled in by finish().
    const std::string header = stamp + hexadecimal(0, offsetDigits) + versionAndTerminator;
    write(header.data(), header.size());
}

ArchiveWriter::~ArchiveWriter() = default;

void ArchiveWriter::add(const std::string& name, const std::string& bytes) {
    std::size_t taken = 0;
    addFrom(name, [&](char* into, std::size_t room) {
        const std::size_t count = bytes.copy(into, room, taken);
        taken += count;
        return count;
    });
}

void ArchiveWriter::add(const std::string& name, std::istream& in) {
    addFrom(name, [&](char* into, std::size_t room) {
        in.read(into, static_cast<std::streamsize>(room));
        if (in.bad())
            refuse(name, "its stream cannot be read");
        return static_cast<std::size_t>(in.gcount());
    });
}

void ArchiveWriter::addFile(const std::string& name, const std::string& path) {
    checkUsable();
    checkName(name);
    SourceFile source(path);
    addFrom(name, [&source](char* into, std::size_t room) { return source.read(into, room); });
}

void ArchiveWriter::addFolder(const std::string& folder) {
    checkUsable();
    FolderFiles listed(folder);
    const std::string::size_type slash = file.path().rfind('/');
    if (listed.contains(slash == std::string::npos ? "." : file.path().substr(0, slash + 1)))
        throw FileError(file.path(), "The archive would lie in the folder that it packs");
    for (const auto& member : listed.getFiles())
        checkFile(member.first, member.second.obstacle);
    for (const auto& member : listed.getFiles()) {
        SourceFile source = listed.open(member.first, member.second);
        addFrom(member.first,
                [&source](char* into, std::size_t room) { return source.read(into, room); });
    }
}

void ArchiveWriter::checkFile(const std::string& name, const std::string& obstacle) const {
    if (!obstacle.empty())
        refuse(name, obstacle);
    checkName(name);
}

void ArchiveWriter::addFrom(const std::string& name, const Source& source) {
    checkUsable();
    checkName(name);
    beginMember(name);
    const auto store = [this](const char* bytes, std::size_t count) { write(bytes, count); };
    std::vector<char>& block = deflater->inputBlock();
    for (std::size_t count; (count = source(block.data(), block.size())) != 0;)
        deflater->run(block.data(), count, Z_NO_FLUSH, store);
    deflater->run(nullptr, 0, Z_FINISH, store);
    endMember();
}

void ArchiveWriter::beginMember(const std::string& name) {
    current = name;
    directory[name] = Entry{file.size(), 0};
    deflater->restart();
}

void ArchiveWriter::endMember() {
    Entry& entry = directory[current];
    entry.length = file.size() - entry.offset;
    current.clear();
}

void ArchiveWriter::checkName(const std::string& name) const {
    if (name.empty())
        refuse(name, "the name is empty");
    if (name.find_first_of("\r\n") != std::string::npos)
        refuse(name, "the name has a line break, which ends a directory entry");
    if (name.find('\\') != std::string::npos)
        refuse(name, "the name has a backslash, which is read as \"/\": it could not be reached");
    if (directory.count(name) != 0)
        refuse(name, "the archive has a member of that name already");
}

void ArchiveWriter::checkUsable() const {
    if (finished)
        throw std::logic_error(file.path() + ": the archive is finished");
    if (!current.empty())
        throw std::logic_error(file.path() + ": adding '" + current + "' failed before");
}

void ArchiveWriter::write(const char* bytes, std::size_t count) {
    if (count > limit - std::min(limit, file.size()))
        refuseSize();
    file.write(bytes, count);
}

void ArchiveWriter::finish() {
    checkUsable();
    finished = true;
    const std::string offset = hexadecimal(file.size(), offsetDigits);
    writeDirectory();
    file.overwrite(static_cast<long>(sizeof stamp - 1), offset.data(), offset.size());
    file.commit();
}

void ArchiveWriter::writeDirectory() {
    for (const auto& member : directory) {
        const std::string line = "O" + hexadecimal(member.second.offset) + " L" +
                                 hexadecimal(member.second.length) + " |" + member.first + "\r\n";
        write(line.data(), line.size());
    }
}

void ArchiveWriter::refuse(const std::string& name, const std::string& reason) const {
    throw Refused(file.path() + ": member '" + name + "': " + reason);
}

void ArchiveWriter::refuseSize() const {
    const std::string reason = "the archive would pass " + std::to_string(limit) + " bytes";
    if (!current.empty())
        refuse(current, reason);
    throw Refused(file.path() + ": " + reason);
}

}  // namespace pells
