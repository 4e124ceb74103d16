#include "tools/member_reader.h"

#include <algorithm>
#include <new>

#include "tools/atomic_file.h"

namespace pells_tool {

MemberReader::MemberReader(const std::string& archivePath,
                           const pells::pellistream::Directory::value_type& entry)
    : path(archivePath),
      name(entry.first),
      file(archivePath, std::ios_base::binary),
      remaining(entry.second.length),
      input(65536),
      inflater(),
      ended(false) {
    file.seekg(entry.second.offset);
    if (inflateInit(&inflater) != Z_OK)
        throw std::bad_alloc();
}

MemberReader::~MemberReader() {
    inflateEnd(&inflater);
}

void MemberReader::fail(const std::string& what) const {
    throw pells::FileError(path, "member '" + name + "': " + what);
}

/// Gives the inflater the next stored bytes.
void MemberReader::refill() {
    if (remaining == 0)
        fail("The stored bytes end before the data does");
    const std::size_t wanted = std::min<std::size_t>(remaining, input.size());
    file.read(input.data(), static_cast<std::streamsize>(wanted));
    const std::size_t got = static_cast<std::size_t>(file.gcount());
    if (got == 0)
        fail("The file ends inside the data");
    remaining -= static_cast<std::uint32_t>(got);
    inflater.next_in = reinterpret_cast<Bytef*>(input.data());
    inflater.avail_in = static_cast<uInt>(got);
}

std::size_t MemberReader::read(char* into, std::size_t room) {
    inflater.next_out = reinterpret_cast<Bytef*>(into);
    inflater.avail_out = static_cast<uInt>(room);
    while (!ended && inflater.avail_out == room) {
        if (inflater.avail_in == 0)
            refill();
        const int result = inflate(&inflater, Z_NO_FLUSH);
        ended = result == Z_STREAM_END;
        if (!ended && result != Z_OK && result != Z_BUF_ERROR)
            fail(std::string("The data is damaged: ") +
                 (inflater.msg ? inflater.msg : zError(result)));
    }
    const std::size_t count = room - inflater.avail_out;
    if (count == 0 && (remaining != 0 || inflater.avail_in != 0))
        fail("More bytes are stored than the data has");
    return count;
}

}  // namespace pells_tool
