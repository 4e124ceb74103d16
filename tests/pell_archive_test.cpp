#include "pells/asset/pell_archive.h"

#if !defined(_WIN32)
#include <sys/stat.h>
#endif

#include <algorithm>
#include <functional>
#include <locale>
#include <random>
#include <set>

#include "support/archive_bytes.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

using namespace pells_test;
using pells::pellibuf;
using pells::pellistream;

/// The message with which the bytes are refused as an archive, or "" when they are none.
std::string refusalOf(const std::string& path) {
    return thrown<pellibuf::BadPellFile>([&] { pellistream archive(path); });
}

class PellArchive : public LibraryTest {
protected:
    PellArchive() { prefs()["log"] = "error"; }

    std::string write(const std::string& bytes) const { return writeArchiveFile(scratch, bytes); }
};

TEST_F(PellArchive, RefusesDamagedHeadersAndDirectoriesWithTheReason) {
    const std::pair<std::string, std::string> cases[] = {
        {"", "Pell file too short for stamp"},
        {"PELLS", "Pell file too short for stamp"},
        {"PELLS\n10v1.0\r\n\x1a", "Input file not a pell file"},
        {"pells 10v1.0\r\n\x1a", "Input file not a pell file"},
        {"PELLS ", "Cannot read pell file header"},
        {"PELLS xv1.0\r\n\x1a", "Cannot read pell file header"},
        {"PELLS 100000000v1.0\r\n\x1a", "Cannot read pell file header"},
        {"PELLS 10v", "Cannot read pell file header"},
        {"PELLS 10v1.x\r\n\x1a", "Cannot read pell file header"},
        {"PELLS 10w1.0\r\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1,0\r\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1.0\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1.0 \r\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1.0\r\n", "Bad pell file header format"},
        {"PELLS 10v2.0\r\n\x1a", "Bad pell file version 2.0, current version is 1.0"},
        {"PELLS 10v12.34\r\n\x1a", "Bad pell file version 12.34, current version is 1.0"},
        {"PELLS \n 0000000100 v 1 . 7\r\n\x1a", ""},
        {"PELLS ffffffffv1.0\r\n\x1a", ""},
    };
    for (const auto& each : cases)
        EXPECT_EQ(refusalOf(write(each.first)), each.second) << each.first;
    const std::pair<std::string, std::string> directories[] = {
        {"", ""},
        {"\x1aO", ""},
        {"O1 L2 |a\r\n\x1aO", ""},
        {"O", "Cannot read pell file directory entry"},
        {"O1 L2 |", "Cannot read pell file member name"},
        {"O1 L2 |a\n", "Bad pell file member name"},
        {"L2 |a\r\n", "Pell file directory entry 'a': missing field 'O'"},
        {"O1 |a\r\n", "Pell file directory entry 'a': missing field 'L'"},
        {"O1 L2g |a\r\n", "Pell file directory entry 'a': bad field 'L': '2g'"},
        {"O1 L100000000 |a\r\n", "Pell file directory entry 'a': bad field 'L': '100000000'"},
        {"O1", "Pell file directory entry '': missing field 'L'"},
    };
    for (const auto& each : directories)
        EXPECT_EQ(refusalOf(write(archiveWithDirectory(each.first))), each.second) << each.first;
}

TEST_F(PellArchive, OpensRegularFilesOnly) {
#if !defined(_WIN32)
    ASSERT_EQ(mkfifo("pipe", 0600), 0);
#endif
    for (const std::string path : {"none", "", ".", "pipe", "/dev/zero"})
        EXPECT_EQ(refusalOf(path), "Can't open pell file") << path;
}

TEST_F(PellArchive, FindsMembersByNameAndServesThemAgain) {
    pellistream archive(write(archiveOf(
        {{"b/\\c", "backslash"}, {"a/b", "one\ntwo\n"}, {"empty", ""}, {"a/b", "ONE\nTWO"}})));
    EXPECT_EQ(Lines(archive.begin(), archive.end()), (Lines{"a/b", "b/\\c", "empty"}));
    EXPECT_EQ(archive.getDirectory().at("empty").length, deflated("").size());

    EXPECT_EQ(archive.get(), EOF);
    for (const std::string name : {"a/b", "a\\b"}) {
        ASSERT_TRUE(archive.open(name));
        EXPECT_EQ(archive.getMemberName(), name);
        EXPECT_EQ(readAll(archive), "ONE\nTWO");
        EXPECT_EQ(archive.get(), EOF);
    }
    ASSERT_TRUE(archive.open("b/\\c"));
    archive.get();
    EXPECT_FALSE(archive.open("B/\\c"));
    EXPECT_EQ(archive.getMemberName(), "");
    ASSERT_TRUE(archive.open("empty"));
    EXPECT_EQ(archive.get(), EOF);
    ASSERT_TRUE(archive.open("b/\\c"));
    std::string line;
    EXPECT_TRUE(std::getline(archive, line));
    EXPECT_EQ(line, "backslash");
}

TEST_F(PellArchive, ReadsTheSameBytesInPiecesOfAnySize) {
    const std::string bytes = noise(200000) + std::string(100000, 'x') + noise(3000);
    pellistream archive(write(archiveOf({{"m", bytes}})));
    for (const std::size_t size : {1u, 2u, 7u, 1023u, 1024u, 1025u, 1026u, 65536u, 400000u}) {
        ASSERT_TRUE(archive.open("m"));
        std::string read;
        std::vector<char> piece(size);
        while (archive.read(piece.data(), static_cast<std::streamsize>(size)) || archive.gcount()) {
            read.append(piece.data(), static_cast<std::size_t>(archive.gcount()));
            if (!archive)
                break;
            // Whatever way a character was read, it can be put back.
            ASSERT_TRUE(archive.putback(read.back()));
            ASSERT_EQ(archive.get(), static_cast<unsigned char>(read.back()));
        }
        EXPECT_TRUE(read == bytes) << size;
    }
}

TEST_F(PellArchive, ReadsInTheClassicLocaleWhateverTheGlobalOneIs) {
    struct Grouping : std::numpunct<char> {
        std::string do_grouping() const override { return "\1"; }
    };
    const std::locale before =
        std::locale::global(std::locale(std::locale::classic(), new Grouping));
    const std::string refusal = refusalOf(write(archiveOf({{"m", "text"}})));
    const std::string versionRefusal = refusalOf(write("PELLS 10v12.0\r\n\x1a"));
    std::locale::global(before);
    EXPECT_EQ(refusal, "");
    EXPECT_EQ(versionRefusal, "Bad pell file version 12.0, current version is 1.0");
}

/// Reads a member in pieces until it ends or throws; returns what came.
std::string readUntilFailure(pellistream& archive, std::size_t size, std::string& failure) {
    std::string read;
    std::vector<char> piece(size);
    failure.clear();
    try {
        while (archive.read(piece.data(), static_cast<std::streamsize>(size)))
            read.append(piece.data(), size);
        read.append(piece.data(), static_cast<std::size_t>(archive.gcount()));
    } catch (const pellibuf::BadPellFile& error) {
        failure = error.what();
    } catch (const pells::ZlibWrapper::ZlibError& error) {
        failure = error.what();
    }
    return read;
}

TEST_F(PellArchive, ServesWhatComesBeforeTheEndOfACutFile) {
    const std::string bytes = noise(300000);
    const std::string good = deflated("good");
    // The end mark keeps the data that follows out of the directory.
    std::string cut = archiveWithDirectory(
        "O15 L4 |short\r\nO1 L80000000 |beyond\r\n"
        "Offffffff L1 |nowhere\r\nO15 L" +
            hexadecimal(good.size()) + " |good\r\nO200000 L200000 |m\r\n\x1a",
        good);
    cut.resize(0x200000, '\0');
    pellistream archive(write(cut + deflated(bytes).substr(0, 200000)));
    std::string failure;
    for (const std::size_t size : {1u, 1000u, 4096u}) {
        ASSERT_TRUE(archive.open("m"));
        const std::string read = readUntilFailure(archive, size, failure);
        EXPECT_EQ(failure, "Can't read pell data stream for member 'm'");
        EXPECT_GT(read.size(), 200000u - 1024 - size) << size;
        EXPECT_TRUE(bytes.compare(0, read.size(), read) == 0) << size;
        archive.clear();
        EXPECT_THROW(archive.get(), pellibuf::BadPellFile);
    }
    for (const std::string name : {"beyond", "nowhere"}) {
        ASSERT_TRUE(archive.open(name));
        readUntilFailure(archive, 1000000, failure);
        EXPECT_NE(failure, "") << name;
    }
    ASSERT_TRUE(archive.open("short"));
    EXPECT_LT(readUntilFailure(archive, 10, failure).size(), 4u);
    EXPECT_EQ(failure, "");
    ASSERT_TRUE(archive.open("good"));
    EXPECT_EQ(readAll(archive), "good");
}

/// What comes of a zlib stream, read in blocks of 1024 bytes and inflated in pieces of 1023 (the
/// first one 1024), before the piece in which it is damaged.
std::string inflatedBeforeDamage(const std::string& stream) {
    z_stream zlib = {};
    inflateInit(&zlib);
    std::string all;
    char piece[1024];
    int result = Z_OK;
    for (std::size_t at = 0; result == Z_OK && at < stream.size();) {
        const uInt room = all.empty() ? 1024 : 1023;
        zlib.next_out = reinterpret_cast<Bytef*>(piece);
        zlib.avail_out = room;
        do {
            if (zlib.avail_in == 0) {
                zlib.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(stream.data())) + at;
                zlib.avail_in = static_cast<uInt>(std::min<std::size_t>(1024, stream.size() - at));
                at += zlib.avail_in;
            }
            result = inflate(&zlib, Z_NO_FLUSH);
        } while (result == Z_OK && zlib.avail_out == room && at < stream.size());
        if (result == Z_OK || result == Z_STREAM_END)
            all.append(piece, room - zlib.avail_out);
    }
    inflateEnd(&zlib);
    return all;
}

TEST_F(PellArchive, ServesTheSamePartOfADamagedMemberInPiecesOfAnySize) {
    std::mt19937 random(5);
    std::string bytes;
    while (bytes.size() < 600000)
        bytes += hexadecimal(random() >> random() % 32);
    const std::string good = archiveOf({{"m", bytes}});
    const std::size_t dataSize = archiveHeaderSize + deflated(bytes).size();
    const auto damagedAt = [&good](std::size_t at, std::size_t size) {
        return std::string(good).replace(at, size, size, '\xFF');
    };
    std::set<std::string> failures;
    for (std::size_t at = dataSize / 16; at < dataSize - 200; at += dataSize / 16) {
        pellistream archive(write(damagedAt(at, at % 2 ? 1 : 200)));
        std::string expectedFailure;
        std::string failure;
        ASSERT_TRUE(archive.open("m"));
        const std::string expected = readUntilFailure(archive, 1, expectedFailure);
        const std::string damaged = damagedAt(at, at % 2 ? 1 : 200);
        EXPECT_TRUE(expected == inflatedBeforeDamage(damaged.substr(archiveHeaderSize,
                                                                    dataSize - archiveHeaderSize)))
            << at;
        for (const std::size_t size : {1025u, 4096u, 50000u, 300000u}) {
            ASSERT_TRUE(archive.open("m"));
            const std::string read = readUntilFailure(archive, size, failure);
            EXPECT_EQ(failure, expectedFailure) << at;
            EXPECT_LE(read.size(), expected.size() + 1024);
            EXPECT_GT(read.size() + size + 1024, expected.size());
            const std::size_t both = std::min(read.size(), expected.size());
            EXPECT_EQ(read.compare(0, both, expected, 0, both), 0) << at << ' ' << size;
        }
        failures.insert(failure);
    }
    EXPECT_GT(failures.size(), 1u) << "damaged data and damaged checksums";

    // Whoever asks for just the bytes of a member learns that its checksum is wrong, too.
    pellistream archive(write(damagedAt(dataSize - 4, 4)));
    ASSERT_TRUE(archive.open("m"));
    std::vector<char> piece(20000);
    for (std::size_t left = bytes.size(); left > piece.size(); left -= piece.size())
        archive.read(piece.data(), 20000);
    const auto rest = static_cast<std::streamsize>((bytes.size() - 1) % piece.size() + 1);
    EXPECT_THROW(archive.read(piece.data(), rest), pells::ZlibWrapper::ZlibError);
}

TEST_F(PellArchive, DamagedMembersThrowFromEveryWayOfReading) {
    std::string bytes = archiveOf({{"bad", noise(5000)}, {"good", "good"}});
    bytes[archiveHeaderSize] = '\0';
    pellistream archive(write(bytes));
    const std::string message =
        "ZlibInflater::read(): bad pell data stream for member 'bad': Z_DATA_ERROR (-3): "
        "incorrect header check";
    char piece[2000];
    std::string line;
    const std::function<void()> ways[] = {
        [&] { archive.read(piece, sizeof piece); }, [&] { std::getline(archive, line); },
        [&] { archive >> line; }, [&] { archive.ignore(10); }, [&] { archive.get(); }};
    for (const auto& read : ways) {
        ASSERT_TRUE(archive.open("bad"));
        EXPECT_EQ(thrown<pells::ZlibWrapper::ZlibError>(read), message);
        EXPECT_TRUE(archive.bad());
        ASSERT_TRUE(archive.open("good"));
        EXPECT_EQ(readAll(archive), "good");
    }
    EXPECT_EQ(logLines("error: "), Lines(5, message));
}

TEST_F(PellArchive, SurvivesEveryCutAndEveryFlippedByte) {
    // Reads every member two ways. What is no documented refusal leaves the function.
    const auto readAllMembers = [](const std::string& path) {
        thrown<pellibuf::BadPellFile>([&] {
            pellistream archive(path);
            for (const std::string& name : archive) {
                std::string failure;
                for (const std::size_t size : {100u, 10000u}) {
                    EXPECT_TRUE(archive.open(name));
                    EXPECT_LT(readUntilFailure(archive, size, failure).size(), 100000u);
                }
            }
        });
    };
    const std::string good =
        archiveOf({{"a.txt", "hello hello hello hello"}, {"dir/noise", noise(1500)}});
    for (std::size_t at = 0; at < good.size(); ++at) {
        EXPECT_NO_THROW(readAllMembers(write(good.substr(0, at)))) << at;
        for (const int bits : {0x01, 0xFF}) {
            std::string flipped = good;
            flipped[at] = static_cast<char>(flipped[at] ^ bits);
            EXPECT_NO_THROW(readAllMembers(write(flipped))) << at;
        }
    }
}

}  // namespace
