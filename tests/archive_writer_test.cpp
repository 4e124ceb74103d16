#include "tools/archive_writer.h"

#include <boost/filesystem/operations.hpp>
#include <set>
#include <sstream>
#include <stdexcept>

#include "pells/asset/pell_archive.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;
using pells::ArchiveWriter;
typedef ArchiveWriter::Refused Refused;

typedef std::map<std::string, std::string> Contents;

class ArchiveWriterTest : public LibraryTest {};

/// All members of an archive, as the library reads them.
Contents read(const std::string& path) {
    pells::pellistream archive(path);
    Contents members;
    for (const std::string& name : archive) {
        EXPECT_TRUE(archive.open(name)) << name;
        members[name] = readAll(archive);
    }
    return members;
}

TEST_F(ArchiveWriterTest, WritesTheBytesThatTheFormatSays) {
    // Members lie in the order of adding; the directory is in byte order: "Z", "a", 0xE4.
    ArchiveWriter writer("out.pell");
    for (const char* name : {"a", "\xE4", "Z"})
        writer.add(name, "");
    writer.finish();
    const std::string bytes = readFile("out.pell");
    EXPECT_EQ(bytes.substr(0, 21), "PELLS 0000002dv1.0\r\n\x1a");
    EXPECT_EQ(bytes.substr(0x2d), "O25 L8 |Z\r\nO15 L8 |a\r\nO1d L8 |\xE4\r\n");
}

TEST_F(ArchiveWriterTest, RefusesNamesThatCannotBeReached) {
    const std::pair<const char*, const char*> cases[] = {
        {"", "the name is empty"},
        {"a\nb", "the name has a line break, which ends a directory entry"},
        {"a\\b", "the name has a backslash, which is read as \"/\": it could not be reached"},
        {"twice", "the archive has a member of that name already"},
    };
    ArchiveWriter writer("out.pell");
    writer.add("twice", "first");
    for (const auto& each : cases) {
        EXPECT_EQ(thrown<Refused>([&] { writer.add(each.first, "x"); }),
                  std::string("out.pell: member '") + each.first + "': " + each.second);
    }
    // A refused name does no harm to the archive.
    std::istringstream second("second");
    writer.add("more", second);
    writer.finish();
    EXPECT_EQ(read("out.pell"), (Contents{{"more", "second"}, {"twice", "first"}}));
}

TEST_F(ArchiveWriterTest, PacksAFolderTheSameWhateverTheOrder) {
    const Contents expected = {{".symlinks", ""},
                               {"Sub-|b \x1a\xFF ", std::string(1000000, 'x')},
                               {"Sub/.hidden/x", noise(300000)},
                               {"Sub/a", "target"},
                               {"Sub/b", "target"}};
    for (const auto& member : expected)
        scratch.write("one/" + member.first, member.second);
    for (auto member = expected.rbegin(); member != expected.rend(); ++member)
        scratch.write("two/" + member->first, member->second);
    fs::remove("two/Sub/b");
    fs::create_symlink("a", "two/Sub/b");
    fs::create_directories("two/empty/folder");
    std::set<std::string> archives;
    for (const char* folder : {"one", "two/", "./two/."}) {
        ArchiveWriter writer("out.pell");
        writer.addFolder(folder);
        writer.finish();
        EXPECT_EQ(read("out.pell"), expected) << folder;
        archives.insert(readFile("out.pell"));
    }
    EXPECT_EQ(archives.size(), 1u);
}

TEST_F(ArchiveWriterTest, RefusesAFolderThatItCannotStoreWhole) {
    const std::pair<const char*, const char*> cases[] = {
        {"nowhere", "is a symbolic link that leads nowhere"},
        {"link", "is a symbolic link that leads nowhere"},
        {"../outside.txt", "is a symbolic link out of the folder"},
        {"sub", "is a symbolic link to a folder; declare it in a .symlinks file instead"}};
    scratch.write("outside.txt", "secret");
    scratch.write("in/sub/file", "x");
    for (const auto& each : cases) {
        fs::remove("in/link");
        fs::create_symlink(each.first, "in/link");
        EXPECT_EQ(thrown<Refused>([] { ArchiveWriter("out.pell").addFolder("in"); }),
                  std::string("out.pell: member 'link': ") + each.second);
    }
}

TEST_F(ArchiveWriterTest, KeepsTheOldFileUntilTheNewOneIsComplete) {
    const fs::perms permissions = fs::owner_read | fs::owner_write | fs::others_read;
    scratch.write("real.pell", "old");
    fs::permissions("real.pell", permissions);
    fs::create_symlink("real.pell", "link.pell");
    {
        std::istringstream broken("bytes");
        broken.setstate(std::ios_base::badbit);
        ArchiveWriter writer("link.pell");
        writer.add("good", "x");
        EXPECT_EQ(
            thrown<Refused>([&] { writer.add("bad", broken); }),
            fs::canonical("real.pell").string() + ": member 'bad': its stream cannot be read");
        EXPECT_THROW(writer.add("more", "x"), std::logic_error);
        EXPECT_THROW(writer.finish(), std::logic_error);
    }
    EXPECT_EQ(readFile("real.pell"), "old");
    EXPECT_EQ(files(), (Lines{"link.pell", "real.pell"}));

    ArchiveWriter writer("link.pell");
    writer.add("a", "b");
    writer.finish();
    EXPECT_TRUE(fs::is_symlink("link.pell"));
    EXPECT_EQ(read("real.pell"), (Contents{{"a", "b"}}));
    EXPECT_EQ(fs::status("real.pell").permissions(), permissions);
}

// Wherever the limit falls, in the header, the data or the directory, the archive is either
// complete or refused, and never larger.
TEST_F(ArchiveWriterTest, NeverPassesItsSizeLimit) {
    bool refused = true;
    for (std::uint64_t limit = 0; refused; ++limit) {
        const std::string message = thrown<Refused>([&] {
            ArchiveWriter writer("out.pell", limit);
            writer.add("a", noise(100));
            writer.add("b", "x");
            writer.finish();
        });
        const std::string reason = "the archive would pass " + std::to_string(limit) + " bytes";
        refused = !message.empty();
        EXPECT_EQ(message.find(reason) != std::string::npos, refused) << message;
        EXPECT_EQ(files(), refused ? Lines() : Lines{"out.pell"}) << limit;
        EXPECT_TRUE(refused || fs::file_size("out.pell") == limit) << limit;
    }
}

}  // namespace
