#include "tools/archive_writer.h"

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <limits>
#include <sstream>
#include <stdexcept>

#include "pells/asset/pell_archive.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;
using pells::ArchiveWriter;
using pells::FileError;
typedef ArchiveWriter::Refused Refused;

typedef std::map<std::string, std::string> Members;

class ArchiveWriterTest : public LibraryTest {};

/// All members of an archive, as the library reads them.
Members read(const std::string& path) {
    pells::pellistream archive(path);
    Members members;
    for (const std::string& name : Lines(archive.begin(), archive.end())) {
        EXPECT_TRUE(archive.open(name)) << name;
        members[name] = readAll(archive);
    }
    return members;
}

TEST_F(ArchiveWriterTest, StoresEveryKindOfMemberAndName) {
    const Members members = {{"a", ""},
                             {" leading and trailing ", "spaces"},
                             {"deep/er/file.tga", noise(300000)},
                             {"pipe|in|name", "1"},
                             {"end-of-file \x1a mark", "2"},
                             {std::string("zero \0 byte", 11), "3"},
                             {"\xC3\xA4\xFF", "4"},
                             {"long/" + std::string(5000, 'n'), std::string(1000000, 'x')}};
    ArchiveWriter writer("out.pell");
    bool asStream = false;
    for (const auto& member : members) {
        std::istringstream stream(member.second);
        if ((asStream = !asStream))
            writer.add(member.first, stream);
        else
            writer.add(member.first, member.second);
    }
    EXPECT_FALSE(fs::exists("out.pell")) << "before it is complete";
    writer.finish();
    EXPECT_EQ(read("out.pell"), members);
    EXPECT_EQ(files(), Lines{"out.pell"});
}

TEST_F(ArchiveWriterTest, WritesTheBytesThatTheFormatSays) {
    ArchiveWriter("empty.pell").finish();
    EXPECT_EQ(readFile("empty.pell"), "PELLS 00000015v1.0\r\n\x1a");

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
        {"a\r", "the name has a line break, which ends a directory entry"},
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
    writer.add("more", "second");
    writer.finish();
    EXPECT_EQ(read("out.pell"), (Members{{"more", "second"}, {"twice", "first"}}));
}

TEST_F(ArchiveWriterTest, PacksAFolderTheSameWhateverTheOrder) {
    const Lines names = {".symlinks", "Sub/.hidden/x", "Sub/a.tga", "Sub-b", "z"};
    Members expected = {{"Sub/b.tga", "bytes of Sub/a.tga"}};
    for (std::size_t i = 0; i < names.size(); ++i) {
        const std::string& other = names[names.size() - 1 - i];
        scratch.write("one/" + names[i], expected[names[i]] = "bytes of " + names[i]);
        scratch.write("two/" + other, "bytes of " + other);
    }
    fs::create_symlink("a.tga", "one/Sub/b.tga");
    scratch.write("two/Sub/b.tga", "bytes of Sub/a.tga");
    fs::create_directories("two/empty/folder");
    fs::create_directory_symlink("one", "link");
    std::string first;
    for (const char* folder : {"one", "two/", "./two/.", "link"}) {
        ArchiveWriter writer("out.pell");
        writer.addFolder(folder);
        writer.finish();
        EXPECT_EQ(read("out.pell"), expected) << folder;
        if (first.empty())
            first = readFile("out.pell");
        EXPECT_EQ(readFile("out.pell"), first) << folder;
    }
}

TEST_F(ArchiveWriterTest, RefusesAFolderThatItCannotStoreWhole) {
    scratch.write("outside.txt", "secret");
    const char nowhere[] = "is a symbolic link that leads nowhere";
    const char outOf[] = "is a symbolic link out of the folder";
    const char folderLink[] =
        "is a symbolic link to a folder; declare it in a .symlinks file instead";
    const struct {
        const char* link;
        const char* target;
        const char* reason;
    } cases[] = {
        {"dangling", "nowhere", nowhere}, {"loop", "loop", nowhere},  {"up", "..", outOf},
        {"out", "../outside.txt", outOf}, {"dir", "sub", folderLink}, {"self", ".", folderLink}};
    for (const auto& each : cases) {
        const std::string folder = std::string("in-") + each.link;
        scratch.write(folder + "/sub/file", "x");
        fs::create_symlink(each.target, folder + "/" + each.link);
        ArchiveWriter writer("out.pell");
        EXPECT_EQ(thrown<Refused>([&] { writer.addFolder(folder); }),
                  std::string("out.pell: member '") + each.link + "': " + each.reason);
    }
    scratch.write("folder2/back\\slash", "x");
    ArchiveWriter inside("in-dir/sub/new.pell");
    EXPECT_EQ(thrown<FileError>([&] { inside.addFolder("in-dir"); }),
              "in-dir/sub/new.pell: The archive would lie in the folder that it packs");
    EXPECT_EQ(thrown<FileError>([&] { inside.addFolder("missing"); }),
              "missing: No such file or directory");
    EXPECT_THROW(inside.addFolder("folder2"), Refused);
}

TEST_F(ArchiveWriterTest, KeepsTheOldFileUntilTheNewOneIsComplete) {
    scratch.write("out.pell", "old");
    ArchiveWriter("out.pell").add("a", "b");
    std::istringstream broken("bytes");
    ArchiveWriter writer("out.pell");
    writer.add("good", "x");
    broken.setstate(std::ios_base::badbit);
    EXPECT_EQ(thrown<Refused>([&] { writer.add("bad", broken); }),
              "out.pell: member 'bad': its stream cannot be read");
    EXPECT_THROW(writer.add("more", "x"), std::logic_error);
    EXPECT_THROW(writer.finish(), std::logic_error);
    EXPECT_EQ(readFile("out.pell"), "old");

    fs::create_directory("folder");
    for (const std::string path : {"folder: Is a directory", "/dev/null: Not a regular file",
                                   "missing/x: No such file or directory"})
        EXPECT_EQ(thrown<FileError>([&] { ArchiveWriter(path.substr(0, path.find(':'))); }), path);
}

TEST_F(ArchiveWriterTest, ReplacesTheFileBehindALinkAndKeepsItsPermissions) {
    const fs::perms permissions = fs::owner_read | fs::owner_write | fs::others_read;
    scratch.write("real.pell", "old");
    fs::permissions("real.pell", permissions);
    fs::create_symlink("real.pell", "link.pell");
    ArchiveWriter writer("link.pell");
    writer.add("a", "b");
    writer.finish();
    EXPECT_TRUE(fs::is_symlink("link.pell"));
    EXPECT_EQ(read("real.pell"), (Members{{"a", "b"}}));
    EXPECT_EQ(fs::status("real.pell").permissions(), permissions);
}

// Wherever the limit falls, in the header, the data or the directory, the archive is either
// complete or refused, and never larger.
TEST_F(ArchiveWriterTest, NeverPassesItsSizeLimit) {
    const auto write = [](std::uint64_t limit) {
        ArchiveWriter writer("out.pell", limit);
        writer.add("a", noise(100));
        writer.add("b", "x");
        writer.finish();
    };
    write(std::numeric_limits<std::uint64_t>::max());
    const std::uint64_t size = fs::file_size("out.pell");
    fs::remove("out.pell");
    for (std::uint64_t limit = 0; limit < size; ++limit) {
        const std::string message = thrown<Refused>([&] { write(limit); });
        const std::string reason = "the archive would pass " + std::to_string(limit) + " bytes";
        EXPECT_EQ(message.substr(message.size() - std::min(message.size(), reason.size())), reason);
        EXPECT_TRUE(files().empty()) << limit;
    }
    write(size);
    EXPECT_EQ(fs::file_size("out.pell"), size);
}

}  // namespace
