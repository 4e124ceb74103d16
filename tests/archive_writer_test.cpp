#include "tools/archive_writer.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <iterator>
#include <limits>
#include <map>
#include <random>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "pells/asset/pell_archive.h"
#include "support/scratch_directory.h"
#include "support/test_prefs.h"

namespace {

namespace fs = boost::filesystem;
using pells::ArchiveWriter;
using pells::FileError;

typedef std::map<std::string, std::string> Members;

class ArchiveWriterTest : public pells_test::LibraryTest {};

/// All members of an archive, as the library reads them.
Members read(const std::string& path) {
    pells::pellistream archive(path);
    const std::vector<std::string> names(archive.begin(), archive.end());
    Members members;
    for (const std::string& name : names) {
        EXPECT_TRUE(archive.open(name)) << name;
        members[name].assign(std::istreambuf_iterator<char>(archive), {});
    }
    return members;
}

std::string noise(std::size_t size) {
    std::mt19937 random(1);
    std::string bytes(size, '\0');
    std::generate(bytes.begin(), bytes.end(), [&] { return static_cast<char>(random()); });
    return bytes;
}

std::vector<std::string> filesIn(const std::string& folder) {
    std::vector<std::string> names;
    for (const fs::directory_entry& entry : fs::directory_iterator(folder))
        names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
}

/// What the refusal of something says; "" when nothing is refused.
template <class Error, class Function>
std::string refusal(const Function& function) {
    try {
        function();
    } catch (const Error& error) {
        return error.what();
    }
    return "";
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
    EXPECT_EQ(filesIn("."), std::vector<std::string>{"out.pell"});
}

TEST_F(ArchiveWriterTest, WritesTheBytesThatTheFormatSays) {
    ArchiveWriter empty("empty.pell");
    empty.finish();
    EXPECT_EQ(pells_test::readFile("empty.pell"), "PELLS 00000015v1.0\r\n\x1a");

    // Members lie in the order of adding; the directory is in byte order: "Z", "a", 0xE4.
    ArchiveWriter writer("out.pell");
    for (const char* name : {"a", "\xE4", "Z"})
        writer.add(name, "");
    writer.finish();
    const std::string bytes = pells_test::readFile("out.pell");
    EXPECT_EQ(bytes.substr(0, 21), "PELLS 0000002dv1.0\r\n\x1a");
    EXPECT_EQ(bytes.substr(0x2d), "O25 L8 |Z\r\nO15 L8 |a\r\nO1d L8 |\xE4\r\n");
}

TEST_F(ArchiveWriterTest, RefusesNamesThatCannotBeReached) {
    struct Case {
        const char* name;
        const char* message;
    };
    const Case cases[] = {
        {"", "out.pell: member '': the name is empty"},
        {"a\nb",
         "out.pell: member 'a\nb': the name has a line break, which ends a directory entry"},
        {"a\r", "out.pell: member 'a\r': the name has a line break, which ends a directory entry"},
        {"a\\b",
         "out.pell: member 'a\\b': the name has a backslash, which is read as \"/\": it could not "
         "be reached"},
        {"twice", "out.pell: member 'twice': the archive has a member of that name already"},
    };
    ArchiveWriter writer("out.pell");
    writer.add("twice", "first");
    for (const Case& each : cases) {
        EXPECT_EQ(refusal<ArchiveWriter::Refused>([&] { writer.add(each.name, "x"); }),
                  each.message);
    }
    // A refused name does no harm to the archive.
    writer.add("more", "second");
    writer.finish();
    EXPECT_EQ(read("out.pell"), (Members{{"more", "second"}, {"twice", "first"}}));
}

TEST_F(ArchiveWriterTest, PacksAFolderTheSameWhateverTheOrder) {
    const std::vector<std::string> names = {".symlinks", "Sub/.hidden/x", "Sub/a.tga", "Sub-b",
                                            "z"};
    for (const std::string& name : names)
        scratch.write("one/" + name, "bytes of " + name);
    for (auto name = names.rbegin(); name != names.rend(); ++name)
        scratch.write("two/" + *name, "bytes of " + *name);
    fs::create_symlink("a.tga", "one/Sub/b.tga");
    scratch.write("two/Sub/b.tga", "bytes of Sub/a.tga");
    fs::create_directories("two/empty/folder");
    const char* const folders[] = {"one", "two/", "./two/.", "link"};
    fs::create_directory_symlink("one", "link");

    Members expected = {{"Sub/b.tga", "bytes of Sub/a.tga"}};
    for (const std::string& name : names)
        expected[name] = "bytes of " + name;
    std::string first;
    for (const char* folder : folders) {
        ArchiveWriter writer("out.pell");
        writer.addFolder(folder);
        writer.finish();
        EXPECT_EQ(read("out.pell"), expected) << folder;
        if (first.empty())
            first = pells_test::readFile("out.pell");
        EXPECT_EQ(pells_test::readFile("out.pell"), first) << folder;
    }
}

TEST_F(ArchiveWriterTest, RefusesAFolderThatItCannotStoreWhole) {
    const std::string outside = scratch.write("outside.txt", "secret");
    struct Case {
        const char* link;
        const char* target;
        const char* reason;
    };
    const Case cases[] = {
        {"dangling", "nowhere", "is a symbolic link that leads nowhere"},
        {"loop", "loop", "is a symbolic link that leads nowhere"},
        {"up", "..", "is a symbolic link out of the folder"},
        {"out", "../outside.txt", "is a symbolic link out of the folder"},
        {"dir", "sub", "is a symbolic link to a folder; declare it in a .symlinks file instead"},
        {"self", ".", "is a symbolic link to a folder; declare it in a .symlinks file instead"},
    };
    for (const Case& each : cases) {
        const std::string folder = std::string("in-") + each.link;
        scratch.write(folder + "/sub/file", "x");
        fs::create_symlink(each.target, folder + "/" + each.link);
        ArchiveWriter writer("out.pell");
        EXPECT_EQ(refusal<ArchiveWriter::Refused>([&] { writer.addFolder(folder); }),
                  std::string("out.pell: member '") + each.link + "': " + each.reason);
    }
    ArchiveWriter inside("in-dir/sub/new.pell");
    EXPECT_EQ(refusal<FileError>([&] { inside.addFolder("in-dir"); }),
              "in-dir/sub/new.pell: The archive would lie in the folder that it packs");
    EXPECT_EQ(refusal<FileError>([&] { inside.addFolder("missing"); }),
              "missing: No such file or directory");
    scratch.write("folder2/back\\slash", "x");
    ArchiveWriter writer("out.pell");
    EXPECT_THROW(writer.addFolder("folder2"), ArchiveWriter::Refused);
}

TEST_F(ArchiveWriterTest, KeepsTheOldFileUntilTheNewOneIsComplete) {
    scratch.write("out.pell", "old");
    {
        ArchiveWriter abandoned("out.pell");
        abandoned.add("a", "b");
    }
    std::istringstream broken("bytes");
    ArchiveWriter writer("out.pell");
    writer.add("good", "x");
    broken.setstate(std::ios_base::badbit);
    EXPECT_EQ(refusal<ArchiveWriter::Refused>([&] { writer.add("bad", broken); }),
              "out.pell: member 'bad': its stream cannot be read");
    EXPECT_THROW(writer.add("more", "x"), std::logic_error);
    EXPECT_THROW(writer.finish(), std::logic_error);
    EXPECT_EQ(pells_test::readFile("out.pell"), "old");

    fs::create_directory("folder");
    EXPECT_EQ(refusal<FileError>([] { ArchiveWriter("folder"); }), "folder: Is a directory");
    EXPECT_EQ(refusal<FileError>([] { ArchiveWriter("/dev/null"); }),
              "/dev/null: Not a regular file");
    EXPECT_EQ(refusal<FileError>([] { ArchiveWriter("missing/x"); }),
              "missing/x: No such file or directory");
}

TEST_F(ArchiveWriterTest, ReplacesTheFileBehindALinkAndKeepsItsPermissions) {
    scratch.write("real.pell", "old");
    fs::permissions("real.pell", fs::owner_read | fs::owner_write | fs::others_read);
    fs::create_symlink("real.pell", "link.pell");
    ArchiveWriter writer("link.pell");
    writer.add("a", "b");
    writer.finish();
    EXPECT_TRUE(fs::is_symlink("link.pell"));
    EXPECT_EQ(read("real.pell"), (Members{{"a", "b"}}));
    EXPECT_EQ(fs::status("real.pell").permissions(),
              fs::owner_read | fs::owner_write | fs::others_read);
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
        const std::string message = refusal<ArchiveWriter::Refused>([&] { write(limit); });
        const std::string reason = "the archive would pass " + std::to_string(limit) + " bytes";
        EXPECT_EQ(message.substr(message.size() - std::min(message.size(), reason.size())), reason);
        EXPECT_TRUE(filesIn(".").empty()) << limit;
    }
    write(size);
    EXPECT_EQ(fs::file_size("out.pell"), size);
}

}  // namespace
