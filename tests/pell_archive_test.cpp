#include "pells/asset/pell_archive.h"

#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <locale>
#include <random>

#include "support/archive_bytes.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

using namespace pells_test;
using pells::pellibuf;
using pells::pellistream;
using pells::ZlibWrapper;

class PellArchive : public LibraryTest {
protected:
    std::string write(const std::string& bytes) const { return writeArchiveFile(scratch, bytes); }
};

TEST_F(PellArchive, RefusesWhatIsNoArchiveWithTheReasonInAnyLocale) {
    struct Grouping : std::numpunct<char> {
        std::string do_grouping() const override { return "\1"; }
    };
    const std::string entry = "Pell file directory entry ";
    const std::pair<std::string, std::string> cases[] = {
        {"PELLS", "Pell file too short for stamp"},
        {"pells 10v1.0\r\n\x1a", "Input file not a pell file"},
        {"PELLS 100000000v1.0\r\n\x1a", "Cannot read pell file header"},
        {"PELLS 10v1.x\r\n\x1a", "Cannot read pell file header"},
        {"PELLS 10w1.0\r\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1,0\r\n\x1a", "Bad pell file header format"},
        {"PELLS 10v1.0\n\x1a", "Bad pell file header format"},
        {"PELLS 10v12.34\r\n\x1a", "Bad pell file version 12.34, current version is 1.0"},
        {"PELLS \n 0000000100 v 1 . 7\r\n\x1a", ""},
        {"PELLS ffffffffv1.0\r\n\x1a", ""},
        {archiveWithDirectory("\x1aO"), ""},
        {archiveWithDirectory("X0 L2 O00000000ffffffff \x1a"), ""},
        {archiveWithDirectory("O1 \x1a"), entry + "'': missing field 'L'"},
        {archiveWithDirectory("L2 |a\r\n"), entry + "'a': missing field 'O'"},
        {archiveWithDirectory("O1 L0x2 |a\r\n"), entry + "'a': bad field 'L': '0x2'"},
        {archiveWithDirectory("O100000000 L1"), entry + "'': bad field 'O': '100000000'"},
        {archiveWithDirectory("O"), "Cannot read pell file directory entry"},
        {archiveWithDirectory("O1 L2 |"), "Cannot read pell file member name"},
        {archiveWithDirectory("O1 L2 |a\n"), "Bad pell file member name"},
    };
    for (const std::locale& locale :
         {std::locale::classic(), std::locale(std::locale::classic(), new Grouping)}) {
        const std::locale before = std::locale::global(locale);
        for (const auto& each : cases) {
            const std::string path = write(each.first);
            EXPECT_EQ(thrown<pellibuf::BadPellFile>([&] { pellistream archive(path); }),
                      each.second)
                << each.first;
        }
        std::locale::global(before);
    }
}

TEST_F(PellArchive, ReadsDirectoriesOfAnySizeInAnyOrder) {
    std::mt19937 random(11);
    std::string text;
    std::map<std::string, std::uint32_t> expected;
    for (int i = 0; i < 10000; ++i) {
        // Told apart by the last character only, by the length or by a zero byte, some of them not.
        const std::size_t lengths[] = {0, 7, 8, 9, 16, 256, 300};
        std::string name(lengths[random() % 7], 'n');
        for (auto letters = random() % 4; letters != 0; --letters)
            name += "\0a\xFF"[random() % 3];
        const auto number = static_cast<std::uint32_t>(random());
        text += "O" + hexadecimal(number / 3) + " L" + hexadecimal(number) + " |" + name + "\r\n";
        expected[name] = number;
    }
    const pellistream archive(write(archiveWithDirectory(text)));
    ASSERT_EQ(archive.getDirectory().size(), expected.size());
    for (const auto& entry : archive.getDirectory()) {
        EXPECT_EQ(entry.second.length, expected.at(entry.first));
        EXPECT_EQ(entry.second.offset, expected.at(entry.first) / 3);
    }
}

TEST_F(PellArchive, FindsMembersByNameAndServesThemAgain) {
    pellistream archive(write(
        archiveOf({{"b/\\c", "back\nslash"}, {"a/b", "old"}, {"empty", ""}, {"a/b", "new"}})));
    EXPECT_EQ(Lines(archive.begin(), archive.end()), (Lines{"a/b", "b/\\c", "empty"}));
    EXPECT_EQ(archive.get(), EOF);
    for (const std::string name : {"a/b", "a\\b"}) {
        ASSERT_TRUE(archive.open(name));
        EXPECT_EQ(archive.getMemberName(), name);
        EXPECT_EQ(readAll(archive), "new");
    }
    ASSERT_TRUE(archive.open("b/\\c"));
    EXPECT_EQ(archive.get(), 'b');
    EXPECT_FALSE(archive.open("A/b"));
    EXPECT_EQ(archive.getMemberName(), "");
    ASSERT_TRUE(archive.open("empty"));
    EXPECT_EQ(readAll(archive), "");
}

TEST_F(PellArchive, ReadsTheSameBytesInPiecesOfAnySize) {
    const std::string bytes = noise(200000) + std::string(100000, 'x') + noise(3000);
    pellistream archive(write(archiveOf({{"m", bytes}})));
    for (const std::size_t size : {1u, 7u, 1023u, 1024u, 1025u, 1026u, 65536u, 400000u}) {
        ASSERT_TRUE(archive.open("m"));
        std::string read;
        std::vector<char> piece(size);
        while (archive.read(piece.data(), static_cast<std::streamsize>(size))) {
            read.append(piece.data(), size);
            // Whatever way a character was read, it can be put back.
            ASSERT_EQ(archive.putback(read.back()).get(), static_cast<unsigned char>(read.back()));
        }
        read.append(piece.data(), static_cast<std::size_t>(archive.gcount()));
        EXPECT_TRUE(read == bytes) << size;
    }
}

struct Reading {
    std::string bytes;
    std::string failure;
};

/// What comes of a member in pieces of some size before it ends or throws.
Reading readMember(pellistream& archive, const std::string& name, std::size_t size) {
    Reading reading;
    std::vector<char> piece(size);
    EXPECT_TRUE(archive.open(name)) << name;
    const std::string fileFailure = thrown<pellibuf::BadPellFile>([&] {
        reading.failure = thrown<ZlibWrapper::ZlibError>([&] {
            while (archive.read(piece.data(), static_cast<std::streamsize>(size)))
                reading.bytes.append(piece.data(), size);
            reading.bytes.append(piece.data(), static_cast<std::size_t>(archive.gcount()));
        });
    });
    reading.failure += fileFailure;
    return reading;
}

TEST_F(PellArchive, ServesWhatComesBeforeTheDamageInPiecesOfAnySize) {
    std::mt19937 random(5);
    std::string bytes;
    while (bytes.size() < 600000)
        bytes += hexadecimal(random() >> random() % 32);
    bytes.resize(600000);
    const std::string good = archiveOf({{"m", bytes}});
    const std::size_t dataSize = deflated(bytes).size();
    const auto writeDamaged = [&](std::size_t at, std::size_t size) {
        return write(std::string(good).replace(archiveHeaderSize + at, size, size, '\xFF'));
    };
    for (std::size_t at = 1000; at < dataSize - 200; at += dataSize / 16 | 1) {
        pellistream archive(writeDamaged(at, at % 2 ? 1 : 200));
        const Reading expected = readMember(archive, "m", 1);
        // The text compresses evenly.
        EXPECT_GT(expected.bytes.size() + 10000, bytes.size() * at / dataSize);
        for (const std::size_t size : {1025u, 4096u, 50000u, 300000u}) {
            const Reading reading = readMember(archive, "m", size);
            EXPECT_EQ(reading.failure, expected.failure) << at;
            EXPECT_GT(reading.bytes.size() + size + 1024, expected.bytes.size()) << at;
            const std::size_t both = std::min(reading.bytes.size(), expected.bytes.size());
            EXPECT_EQ(reading.bytes.compare(0, both, expected.bytes, 0, both), 0)
                << at << ' ' << size;
        }
    }
    pellistream noHeader(writeDamaged(0, 1));
    EXPECT_EQ(readMember(noHeader, "m", 1).failure,
              "ZlibInflater::read(): bad pell data stream for member 'm': Z_DATA_ERROR (-3): "
              "incorrect header check");
    EXPECT_TRUE(noHeader.bad());

    // Whoever asks for just the bytes of a member learns that its checksum is wrong, too.
    pellistream archive(writeDamaged(dataSize - 4, 4));
    ASSERT_TRUE(archive.open("m"));
    EXPECT_TRUE(archive.ignore(580000));
    EXPECT_THROW(archive.read(&bytes[0], 20000), ZlibWrapper::ZlibError);
}

/// What a reader gets who takes the characters of a member one by one: input goes to zlib in blocks
/// of 1024 bytes, output comes in pieces of at most 1024 characters, of which all but the first
/// leave room for one to be put back. What a failing piece holds is lost.
Reading inflatedInBlocks(const std::string& stored) {
    z_stream inflater = {};
    inflateInit(&inflater);
    Reading reading;
    std::size_t given = 0;
    int result = Z_OK;
    for (unsigned room = 1024, count = 1; count != 0; room = 1023) {
        Bytef piece[1024];
        inflater.next_out = piece;
        inflater.avail_out = room;
        do {
            if (inflater.avail_in == 0) {
                const std::size_t block = std::min<std::size_t>(1024, stored.size() - given);
                inflater.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(&stored[given]));
                inflater.avail_in = static_cast<uInt>(block);
                given += block;
                result = block == 0 ? Z_STREAM_END : Z_OK;
            }
            if (result != Z_STREAM_END)
                result = inflate(&inflater, Z_NO_FLUSH);
        } while ((result == Z_OK || result == Z_BUF_ERROR) && inflater.avail_out == room);
        const bool failed = result != Z_OK && result != Z_STREAM_END;
        count = failed ? 0 : room - inflater.avail_out;
        reading.bytes.append(reinterpret_cast<const char*>(piece), count);
        reading.failure = failed ? "failed" : "";
    }
    inflateEnd(&inflater);
    return reading;
}

TEST_F(PellArchive, ServesAsMuchOfADamagedMemberAsReadingItBlockByBlockWould) {
    std::mt19937 random(3);
    std::string text;
    while (text.size() < 70000)
        text += hexadecimal(random() >> random() % 32) + (random() % 4 ? " and " : "\n");
    for (int round = 0; round < 400; ++round) {
        const std::size_t size = random() % 70000;
        const int level = std::array<int, 3>{0, 1, 9}[random() % 3];
        std::string stored = deflated(random() % 4 ? text.substr(0, size) : noise(size), level);
        if (round % 4 == 0)
            stored.resize(random() % stored.size());
        else if (round % 4 == 1)
            stored[random() % stored.size()] ^= 0x10;
        else
            stored.back() ^= 1;  // of the checksum
        SCOPED_TRACE(testing::Message() << round << ": " << size << " bytes, level " << level);
        pellistream archive(
            write(archiveWithDirectory("O15 L" + hexadecimal(stored.size()) + " |m\r\n", stored)));
        const Reading expected = inflatedInBlocks(stored);
        const Reading reading = readMember(archive, "m", 1);
        EXPECT_EQ(reading.bytes.size(), expected.bytes.size());
        EXPECT_TRUE(reading.bytes == expected.bytes);
        EXPECT_EQ(reading.failure.empty(), expected.failure.empty());
    }
}

TEST_F(PellArchive, IsReadIndependentlyByAProcessAndItsChild) {
    const std::string bytes = noise(300000);
    pellistream archive(write(archiveOf({{"a", bytes}, {"b", noise(500000)}})));
    for (int round = 0; round < 20; ++round) {
        ASSERT_TRUE(archive.open("a"));
        archive.ignore(1);
        const pid_t child = fork();
        if (child == 0) {
            archive.open("b");
            _exit(readAll(archive).size() == 500000 ? 0 : 1);
        }
        EXPECT_TRUE(readAll(archive) == bytes.substr(1));
        int status = -1;
        waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
}

TEST_F(PellArchive, SurvivesEveryCutAndEveryFlippedByte) {
    // What is no documented refusal leaves the function.
    const auto readAllMembers = [](const std::string& path) {
        thrown<pellibuf::BadPellFile>([&] {
            pellistream archive(path);
            for (const std::string& name : archive) {
                for (const std::size_t size : {100u, 10000u})
                    EXPECT_LT(readMember(archive, name, size).bytes.size(), 100000u);
            }
        });
    };
    const std::string good =
        archiveOf({{"a.txt", "hello hello hello hello"}, {"dir/noise", noise(1500)}});
    for (std::size_t at = 0; at < good.size(); ++at) {
        std::string damaged[] = {good.substr(0, at), good, good};
        damaged[1][at] = static_cast<char>(good[at] ^ 0x01);
        damaged[2][at] = static_cast<char>(good[at] ^ 0xFF);
        for (const std::string& bytes : damaged)
            EXPECT_NO_THROW(readAllMembers(write(bytes))) << at;
    }
}

}  // namespace
