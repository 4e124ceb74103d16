// Opening archives and reading their members, against libraries for zip files with the same
// members.

#include <zlib.h>

#include <algorithm>
#include <map>
#include <memory>
#include <random>
#include <utility>

#include "bench/archive_files.h"
#include "bench/archive_sources.h"
#include "bench/support/bench.h"
#include "pells/asset/pell_archive.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"

namespace {

using bench::ArchiveReader;
using bench::ArchiveSource;
using bench::Content;
using bench::Member;

/// The same members in both kinds of archive, each written when the first contestant asks for it.
class ArchivePair {
public:
    explicit ArchivePair(std::string fileName) : name(std::move(fileName)) {}
    ArchivePair(const ArchivePair&) = delete;
    ArchivePair& operator=(const ArchivePair&) = delete;
    virtual ~ArchivePair() = default;

    std::unique_ptr<ArchiveSource> openWith(const ArchiveReader& reader) {
        std::string& path = reader.readsZip ? zip : pell;
        if (path.empty()) {
            path = bench::scratch() + '/' + name + (reader.readsZip ? ".zip" : ".pell");
            (reader.readsZip ? bench::writeZip : bench::writePell)(path, members());
        }
        return reader.open(path);
    }

protected:
    virtual std::vector<Member> members() = 0;

private:
    std::string name;
    std::string pell;
    std::string zip;
};

/// Members of some size, one of each kind of content, named after it.
class Blobs : public ArchivePair {
public:
    explicit Blobs(std::int64_t memberSize)
        : ArchivePair("blobs" + std::to_string(memberSize)),
          size(static_cast<std::size_t>(memberSize)) {}

    const Content& content(const std::string& kind) {
        if (contents.empty()) {
            contents.emplace("text", bench::textBytes(size));
            contents.emplace("texture", bench::textureBytes(size));
            contents.emplace("noise", bench::noiseBytes(size));
        }
        return contents.at(kind);
    }

private:
    std::vector<Member> members() override {
        std::vector<Member> all;
        for (const auto& content : contents)
            all.push_back(Member{content.first, &content.second});
        return all;
    }

    std::size_t size;
    std::map<std::string, Content> contents;
};

/// Many members of 1 KB.
class SmallMembers : public ArchivePair {
public:
    static const std::size_t size = 1024;

    explicit SmallMembers(std::size_t count)
        : ArchivePair("small" + std::to_string(count)), names(bench::memberNames(count)) {}

    /// In an order that is not the archive's.
    std::vector<std::string> shuffledNames() const {
        std::vector<std::string> shuffled = names;
        std::shuffle(shuffled.begin(), shuffled.end(), std::minstd_rand(4));
        return shuffled;
    }

private:
    std::vector<Member> members() override {
        const std::string text = bench::textBytes(100 * size);
        for (std::size_t start = 0; start < text.size() && contents.size() < 100; start += size)
            contents.emplace_back(text.substr(start, size));
        std::vector<Member> all;
        for (std::size_t i = 0; i < names.size(); ++i)
            all.push_back(Member{names[i], &contents[i % contents.size()]});
        return all;
    }

    std::vector<std::string> names;
    std::vector<Content> contents;
};

/// Members without bytes, of which only the directory matters.
class EmptyMembers : public ArchivePair {
public:
    EmptyMembers(const std::string& listingOrder, std::int64_t memberCount)
        : ArchivePair("empty" + listingOrder + std::to_string(memberCount)),
          order(listingOrder),
          count(static_cast<std::size_t>(memberCount)) {}

private:
    std::vector<Member> members() override {
        std::vector<Member> all = bench::membersOf(bench::memberNames(count), nothing);
        if (order == "shuffled")
            std::shuffle(all.begin(), all.end(), std::minstd_rand(5));
        return all;
    }

    std::string order;
    std::size_t count;
    Content nothing{std::string()};
};

/// A TGA file of 24 bits per pixel.
std::string tgaFile(int side) {
    unsigned char header[18] = {0, 0, 2};
    pells::Image_base::setInt(header + 12, side);
    pells::Image_base::setInt(header + 14, side);
    header[16] = 24;
    const auto pixels = static_cast<std::size_t>(side) * static_cast<std::size_t>(side);
    return std::string(header, header + sizeof header) + bench::textureBytes(3 * pixels);
}

/// Inflates a whole zlib stream into memory that is there already, which is all that a reader must.
void inflateAtOnce(benchmark::State& state, const Content& content) {
    std::vector<Bytef> bytes(content.bytes.size());
    z_stream stream = {};
    inflateInit(&stream);
    for (auto _ : state) {
        inflateReset(&stream);
        stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(content.stream.data()));
        stream.avail_in = static_cast<uInt>(content.stream.size());
        stream.next_out = bytes.data();
        stream.avail_out = static_cast<uInt>(bytes.size());
        if (inflate(&stream, Z_FINISH) != Z_STREAM_END)
            state.SkipWithError("zlib fails");
        benchmark::ClobberMemory();
    }
    inflateEnd(&stream);
}

void addReading(const std::shared_ptr<Blobs>& blobs, const std::string& kind, std::int64_t size,
                std::size_t piece) {
    const std::string work = "read " + kind + "/by " + std::to_string(piece);
    for (const ArchiveReader& reader : bench::archiveReaders()) {
        bench::add(work, size, reader.contestant, [=, &reader](benchmark::State& state) {
            const Content& content = blobs->content(kind);
            const auto source = blobs->openWith(reader);
            std::vector<char> bytes(content.bytes.size() + piece);
            if (readMember(*source, kind, piece, bytes) != content.bytes.size() ||
                content.bytes.compare(0, content.bytes.size(), bytes.data(),
                                      content.bytes.size()) != 0)
                state.SkipWithError("reads something else");
            for (auto _ : state)
                benchmark::DoNotOptimize(readMember(*source, kind, piece, bytes));
        });
    }
    bench::add(work, size, "zlib",
               [=](benchmark::State& state) { inflateAtOnce(state, blobs->content(kind)); });
}

void addReadingByName(std::int64_t count) {
    const auto archives = std::make_shared<SmallMembers>(static_cast<std::size_t>(count));
    for (const ArchiveReader& reader : bench::archiveReaders()) {
        bench::add("read by name", count, reader.contestant, [=, &reader](benchmark::State& state) {
            const auto source = archives->openWith(reader);
            const std::vector<std::string> names = archives->shuffledNames();
            std::vector<char> bytes(2 * SmallMembers::size);
            for (auto _ : state) {
                for (const std::string& name : names) {
                    if (readMember(*source, name, bytes.size(), bytes) != SmallMembers::size)
                        state.SkipWithError("reads something else");
                }
            }
        });
    }
}

void addOpening(const std::string& order, std::int64_t count) {
    const auto archives = std::make_shared<EmptyMembers>(order, count);
    for (const ArchiveReader& reader : bench::archiveReaders()) {
        // Seconds would go by without a figure that is asked for.
        if ((reader.contestant == "PhysicsFS" && count > 10000) ||
            (reader.contestant == "minizip" && count > 100000))
            continue;
        bench::add("open/" + order, count, reader.contestant,
                   [=, &reader](benchmark::State& state) {
                       if (!archives->openWith(reader)->select(bench::memberNames(1).front()))
                           state.SkipWithError("the first member is not there");
                       for (auto _ : state) {
                           auto source = archives->openWith(reader);
                           state.PauseTiming();
                           source.reset();
                           state.ResumeTiming();
                       }
                   });
    }
}

void addPicture(std::int64_t side) {
    const auto content = std::make_shared<Content>(tgaFile(static_cast<int>(side)));
    bench::add("picture/24 bits", side, "pells", [=](benchmark::State& state) {
        const std::string path = bench::scratch() + "/picture.pell";
        bench::writePell(path, {Member{"tga", content.get()}});
        pells::pellistream archive(path);
        pells::Image_base image(0, 0);
        for (auto _ : state) {
            if (!archive.open("tga") || !pells::TGAFileLoader::loadTarga(&image, archive))
                state.SkipWithError("the picture cannot be read");
        }
    });
    bench::add("picture/24 bits", side, "zlib",
               [=](benchmark::State& state) { inflateAtOnce(state, *content); });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t size : bench::sizes({65536, 4194304})) {
        const auto blobs = std::make_shared<Blobs>(size);
        for (const char* const kind : {"text", "texture", "noise"}) {
            addReading(blobs, kind, size, 4096);
            addReading(blobs, kind, size, 65536);
        }
    }
    addReadingByName(20000);
    addPicture(1024);
    for (const std::int64_t count : bench::sizes({1000, 10000, 100000, 1000000}))
        addOpening("ordered", count);
    for (const std::int64_t count : bench::sizes({100000}))
        addOpening("shuffled", count);
}
