#include <gtest/gtest.h>
#include <pells/kit.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>

#include "support/scratch_directory.h"

namespace {

using namespace pells_test;
using pells::kit::AtomicFile;
using pells::kit::FileError;

class AtomicFileTest : public ::testing::Test {
protected:
    AtomicFileTest() { scratch.enter(); }

    static void save(const std::string& path, const std::string& text) {
        AtomicFile file(path);
        file.write(text.data(), text.size());
        file.commit();
    }

    /// What saving throws, or "".
    static std::string failure(const std::string& path, const std::string& text) try {
        save(path, text);
        return "";
    } catch (const FileError& error) {
        EXPECT_EQ(error.what(), error.getPath() + ": " + error.getReason());
        return error.what();
    }

    ScratchDirectory scratch;
};

TEST_F(AtomicFileTest, ReplacesWhatALinkLeadsToAndKeepsItsMode) {
    scratch.write("folder/real", "old");
    ASSERT_EQ(chmod("folder/real", 0640), 0);
    ASSERT_EQ(symlink("folder/real", "link"), 0);
    AtomicFile file("link");
    file.write("-ew", 3);
    file.overwrite(0, "n", 1);
    file.write("!", 1);
    EXPECT_EQ(file.size(), 4U);
    EXPECT_EQ(readFile("folder/real"), "old");
    file.commit();
    EXPECT_EQ(readFile("folder/real"), "new!");
    struct stat status;
    ASSERT_EQ(stat("folder/real", &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 0640U);
    EXPECT_EQ(files(), (Lines{"folder", "link"}));
}

TEST_F(AtomicFileTest, SaysWhyItFailsAndLeavesNothing) {
    scratch.write("folder/file", "");
    ASSERT_EQ(symlink("nothing", "dangling"), 0);
    ASSERT_EQ(mkfifo("pipe", 0600), 0);
    const Lines before = files();
    const std::pair<const char*, const char*> cases[] = {
        {"none/file", "none/file: No such file or directory"},
        {"folder", "folder: Is a directory"},
        {"pipe", "pipe: Not a regular file"},
        {"dangling", "dangling: No such file or directory"},
        {"/proc/none", "/proc/none: No such file or directory"}};
    for (const auto& each : cases)
        EXPECT_EQ(failure(each.first, "text"), each.second);
    EXPECT_EQ(files(), before);
}

TEST_F(AtomicFileTest, KeepsTheOldFileWhereTheDiskIsFull) {
    save("file", "old");
    std::signal(SIGXFSZ, SIG_IGN);
    rlimit limit{};
    getrlimit(RLIMIT_FSIZE, &limit);
    limit.rlim_cur = 10000;
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &limit), 0);
    EXPECT_EQ(failure("file", std::string(10001, 'x')), "file: File too large");
    EXPECT_EQ(failure("file", std::string(100000, 'x')), "file: File too large");
    EXPECT_EQ(readFile("file"), "old");
    EXPECT_EQ(files(), Lines{"file"});
}

TEST_F(AtomicFileTest, IsGoneAfterASignalHoweverManyThereAre) {
    std::vector<std::unique_ptr<AtomicFile>> many(17);
    for (auto& each : many)
        each = std::make_unique<AtomicFile>("file" + std::to_string(&each - many.data()));
    AtomicFile::removeOnSignal();
    EXPECT_EQ(files().size(), 1U);
    EXPECT_TRUE(AtomicFile::isTemporaryName(files().front()));
    EXPECT_THROW(many.front()->commit(), FileError);
    many.clear();
    EXPECT_EQ(files(), Lines{});
}

}  // namespace
