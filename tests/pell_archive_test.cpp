#include "pells/asset/pell_archive.h"

#include <gtest/gtest.h>

#if !defined(_WIN32)
#include <sys/stat.h>
#endif

#include <functional>
#include <locale>
#include <random>

#include "support/archive_bytes.h"
#include "support/test_prefs.h"

namespace {

using pells_test::archiveOf;
using pells_test::archiveWithDirectory;
using pells_test::deflated;

/// The message with which the bytes are refused as an archive, or "" when they are none.
std::string refusalOf(const std::string& path) {
    try {
        const pells::pellistream archive(path);
        return "";
    } catch (const pells::pellibuf::BadPellFile& refusal) {
        return refusal.what();
    }
}

std::string noise(std::size_t size) {
    std::mt19937 random(7);
    std::string bytes;
    while (bytes.size() < size)
        bytes += static_cast<char>(random() & 0xFF);
    return bytes;
}

std::string readAll(std::istream& in) {
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

class PellArchive : public pells_test::LibraryTest {
protected:
    PellArchive() { pells_test::prefs()["log"] = "error"; }

    std::string write(const std::string& bytes) const {
        return pells_test::writeArchiveFile(scratch, bytes);
    }
};

TEST_F(PellArchive, RefusesDamagedHeadersAndDirectoriesWithTheReason) {
    const struct {
        std::string bytes;
        std::string message;
    } cases[] = {
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
        {archiveWithDirectory(""), ""},
        {archiveWithDirectory("\x1aO"), ""},
        {archiveWithDirectory("O1 L2 |a\r\n\x1aO"), ""},
        {archiveWithDirectory("X9 L0000000001 Offffffff Offffff |a b\r\n"), ""},
        {archiveWithDirectory("O1 L2 |\r\n"), ""},
        {archiveWithDirectory("O"), "Cannot read pell file directory entry"},
        {archiveWithDirectory("O1 L2 |"), "Cannot read pell file member name"},
        {archiveWithDirectory("O1 L2 |\n"), "Bad pell file member name"},
        {archiveWithDirectory("O1 L2 |a\n"), "Bad pell file member name"},
        {archiveWithDirectory("L2 |a\r\n"), "Pell file directory entry 'a': missing field 'O'"},
        {archiveWithDirectory("O1 |a\r\n"), "Pell file directory entry 'a': missing field 'L'"},
        {archiveWithDirectory("O1 L2g |a\r\n"),
         "Pell file directory entry 'a': bad field 'L': '2g'"},
        {archiveWithDirectory("O0x1 L2 |a\r\n"),
         "Pell file directory entry 'a': bad field 'O': '0x1'"},
        {archiveWithDirectory("O-1 L2 |a\r\n"),
         "Pell file directory entry 'a': bad field 'O': '-1'"},
        {archiveWithDirectory("O1 L100000000 |a\r\n"),
         "Pell file directory entry 'a': bad field 'L': '100000000'"},
        {archiveWithDirectory("O1"), "Pell file directory entry '': missing field 'L'"},
    };
    for (const auto& each : cases)
        EXPECT_EQ(refusalOf(write(each.bytes)), each.message) << each.bytes;
}

TEST_F(PellArchive, OpensRegularFilesOnly) {
#if !defined(_WIN32)
    ASSERT_EQ(mkfifo("pipe", 0600), 0);
#endif
    for (const std::string path : {"none", "", ".", "pipe", "/dev/zero"})
        EXPECT_EQ(refusalOf(path), "Can't open pell file") << path;
}

TEST_F(PellArchive, FindsMembersByNameAndServesThemAgain) {
    pells::pellistream archive(write(archiveOf(
        {{"b/\\c", "backslash"}, {"a/b", "one\ntwo\n"}, {"empty", ""}, {"a/b", "ONE\nTWO"}})));
    EXPECT_EQ(std::vector<std::string>(archive.begin(), archive.end()),
              (std::vector<std::string>{"a/b", "b/\\c", "empty"}));
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
    pells::pellistream archive(write(archiveOf({{"m", bytes}})));
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
    const std::string path = write(archiveOf({{"m", "text"}}));
    const std::locale before =
        std::locale::global(std::locale(std::locale::classic(), new Grouping));
    const std::string refusal = refusalOf(path);
    const std::string versionRefusal = refusalOf(write("PELLS 10v12.0\r\n\x1a"));
    std::locale::global(before);
    EXPECT_EQ(refusal, "");
    EXPECT_EQ(versionRefusal, "Bad pell file version 12.0, current version is 1.0");
}

/// Reads a member in pieces until it ends or throws; returns what came.
std::string readUntilFailure(pells::pellistream& archive, std::size_t size, std::string& failure) {
    std::string read;
    std::vector<char> piece(size);
    failure.clear();
    try {
        while (archive.read(piece.data(), static_cast<std::streamsize>(size)))
            read.append(piece.data(), size);
        read.append(piece.data(), static_cast<std::size_t>(archive.gcount()));
    } catch (const pells::pellibuf::BadPellFile& error) {
        failure = error.what();
    } catch (const pells::ZlibWrapper::ZlibError& error) {
        failure = error.what();
    }
    return read;
}

TEST_F(PellArchive, ServesWhatComesBeforeTheEndOfACutFile) {
    const std::string bytes = noise(300000);
    const std::string good = deflated("good");
    const std::string archiveBytes = archiveWithDirectory(
        "O" + pells_test::hexadecimal(pells_test::archiveHeaderSize) + " L4 |short\r\n" +
            "O100 L0 |none\r\nO1 L80000000 |beyond\r\nOffffffff L1 |nowhere\r\n" + "O15 L" +
            pells_test::hexadecimal(good.size()) + " |good\r\n" + "O200000 L200000 |m\r\n",
        good);
    std::string cut = archiveBytes;
    cut.resize(0x200000, '\0');
    cut += deflated(bytes).substr(0, 200000);
    // The end mark keeps the data that follows out of the directory.
    cut[archiveBytes.size()] = '\x1a';
    pells::pellistream archive(write(cut));
    std::string failure;
    for (const std::size_t size : {1u, 1000u, 4096u}) {
        ASSERT_TRUE(archive.open("m"));
        const std::string read = readUntilFailure(archive, size, failure);
        EXPECT_EQ(failure, "Can't read pell data stream for member 'm'");
        EXPECT_GT(read.size(), 200000u - 1024 - size) << size;
        EXPECT_TRUE(bytes.compare(0, read.size(), read) == 0) << size;
        archive.clear();
        EXPECT_THROW(archive.get(), pells::pellibuf::BadPellFile);
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

TEST_F(PellArchive, DamagedMembersThrowFromEveryWayOfReading) {
    std::string bytes = archiveOf({{"bad", noise(5000)}, {"good", "good"}});
    bytes[pells_test::archiveHeaderSize] = '\0';
    pells::pellistream archive(write(bytes));
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
        try {
            read();
            ADD_FAILURE() << "read damaged data";
        } catch (const pells::ZlibWrapper::ZlibError& error) {
            EXPECT_EQ(error.what(), message);
        }
        EXPECT_TRUE(archive.bad());
        ASSERT_TRUE(archive.open("good"));
        EXPECT_EQ(readAll(archive), "good");
    }
    EXPECT_EQ(pells_test::logLines(), std::vector<std::string>(5, "error: " + message));
}

/// Reads every member two ways. What is no documented refusal leaves the function.
void readAllMembers(const std::string& path) {
    try {
        pells::pellistream archive(path);
        for (const std::string& name : archive) {
            std::string failure;
            for (const std::size_t size : {100u, 10000u}) {
                EXPECT_TRUE(archive.open(name));
                EXPECT_LT(readUntilFailure(archive, size, failure).size(), 100000u);
            }
        }
    } catch (const pells::pellibuf::BadPellFile&) {
    }
}

TEST_F(PellArchive, SurvivesEveryCutAndEveryFlippedByte) {
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
