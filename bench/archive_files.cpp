#include "bench/archive_files.h"

#include <zlib.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <random>
#include <stdexcept>
#include <utility>

namespace bench {

namespace {

const Bytef* bytesOf(const std::string& text) {
    return reinterpret_cast<const Bytef*>(text.data());
}

std::string compressed(const std::string& bytes) {
    uLongf size = compressBound(static_cast<uLong>(bytes.size()));
    std::string stream(size, '\0');
    compress2(reinterpret_cast<Bytef*>(&stream[0]), &size, bytesOf(bytes),
              static_cast<uLong>(bytes.size()), Z_BEST_COMPRESSION);
    stream.resize(size);
    return stream;
}

std::string formatted(const char* format, std::size_t first, std::size_t second) {
    char text[64];
    std::snprintf(text, sizeof text, format, first, second);
    return text;
}

void requireWritten(std::ofstream& file, const std::string& path) {
    if (!file.flush())
        throw std::runtime_error("cannot write " + path);
}

/// A record of a zip file: little-endian numbers of 2, 4 and 8 bytes.
class ZipRecord {
public:
    /// \param kind the last two bytes of the record's signature.
    explicit ZipRecord(std::uint32_t kind) { number(kind << 16 | 0x4B50, 4); }

    ZipRecord& number(std::uint64_t value, int size) {
        for (int i = 0; i < size; ++i, value >>= 8)
            bytes += static_cast<char>(value & 0xFF);
        return *this;
    }

    /// What the header before a member and its entry in the directory have in common.
    ZipRecord& description(const Member& member) {
        const Content& content = *member.content;
        number(20, 2).number(0, 2).number(Z_DEFLATED, 2).number(0x00210000, 4);
        number(content.crc, 4).number(content.stream.size() - 6, 4);
        return number(content.bytes.size(), 4).number(member.name.size(), 2).number(0, 2);
    }

    std::string bytes;
};

/// What ends a zip file whose directory begins after so many bytes.
std::string zipEnd(std::uint64_t offset, std::uint64_t size, std::uint64_t count) {
    std::string end;
    const std::uint64_t most = 0xFFFF;
    if (count >= most) {
        ZipRecord large(0x0606);
        large.number(44, 8).number(45, 2).number(45, 2).number(0, 8).number(count, 8);
        end += large.number(count, 8).number(size, 8).number(offset, 8).bytes;
        end += ZipRecord(0x0706).number(0, 4).number(offset + size, 8).number(1, 4).bytes;
    }
    ZipRecord last(0x0605);
    last.number(0, 4).number(std::min(count, most), 2).number(std::min(count, most), 2);
    return end + last.number(size, 4).number(offset, 4).number(0, 2).bytes;
}

}  // namespace

Content::Content(std::string uncompressed)
    : bytes(std::move(uncompressed)),
      stream(compressed(bytes)),
      crc(static_cast<std::uint32_t>(crc32(0, bytesOf(bytes), static_cast<uInt>(bytes.size())))) {}

std::string textBytes(std::size_t size) {
    std::minstd_rand random(1);
    std::vector<std::string> words(2000);
    for (std::string& word : words) {
        for (std::size_t letters = 2 + random() % 8; letters != 0; --letters)
            word += static_cast<char>('a' + random() % 26);
    }
    std::string text;
    while (text.size() < size) {
        // The product of two numbers prefers the words in front, as languages do.
        text += words[random() % words.size() * (random() % words.size()) / words.size()];
        text += random() % 12 == 0 ? '\n' : ' ';
    }
    text.resize(size);
    return text;
}

std::string textureBytes(std::size_t size) {
    std::minstd_rand random(2);
    std::string pixels(size, '\0');
    for (std::size_t i = 0; i < size; ++i) {
        const double column = static_cast<double>(i / 3 % 1024);
        const double row = static_cast<double>(i / 3072);
        const double shade = 120 + 60 * std::sin(column / 90) + 50 * std::sin(row / 70);
        pixels[i] = static_cast<char>(static_cast<int>(shade) + static_cast<int>(random() % 4));
    }
    return pixels;
}

std::string noiseBytes(std::size_t size) {
    std::mt19937 random(3);
    std::string noise(size, '\0');
    for (char& byte : noise)
        byte = static_cast<char>(random());
    return noise;
}

std::vector<std::string> memberNames(std::size_t count, const std::string& top) {
    std::vector<std::string> names;
    names.reserve(count);
    for (std::size_t i = 0; i < count; ++i)
        names.push_back(top + formatted("/set%05zu/wall%02zu.tga", i / 100, i % 100));
    return names;
}

std::vector<Member> membersOf(const std::vector<std::string>& names, const Content& content) {
    std::vector<Member> members;
    members.reserve(names.size());
    for (const std::string& name : names)
        members.push_back(Member{name, &content});
    return members;
}

void writePell(const std::string& path, const std::vector<Member>& members) {
    std::size_t offset = 21;  // the length of the header
    std::string directory;
    std::ofstream file(path, std::ios_base::binary);
    file << std::string(offset, ' ');
    for (const Member& member : members) {
        const std::string& stream = member.content->stream;
        file << stream;
        directory += formatted("O%zx L%zx |", offset, stream.size()) + member.name + "\r\n";
        offset += stream.size();
    }
    file << directory;
    file.seekp(0);
    file << formatted("PELLS %08zxv1.%zu\r\n\x1a", offset, 0);
    requireWritten(file, path);
}

void writeZip(const std::string& path, const std::vector<Member>& members) {
    std::uint64_t offset = 0;
    std::string directory;
    std::ofstream file(path, std::ios_base::binary);
    for (const Member& member : members) {
        const std::string& stream = member.content->stream;
        const std::string header = ZipRecord(0x0403).description(member).bytes + member.name;
        file << header << stream.substr(2, stream.size() - 6);
        ZipRecord entry(0x0201);
        entry.number(20, 2).description(member).number(0, 2).number(0, 2).number(0, 2);
        directory += entry.number(0, 4).number(offset, 4).bytes + member.name;
        offset += header.size() + stream.size() - 6;
    }
    file << directory << zipEnd(offset, directory.size(), members.size());
    requireWritten(file, path);
}

}  // namespace bench
