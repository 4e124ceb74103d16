// What the machine does to a running program: files that vanish, change or are no files, folders
// that may not be read, a disk that is full, a working directory that is gone.

#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <functional>

#include "pells/image/image_fallback_manager.h"
#include "pells/log/log.h"
#include "support/asset_root.h"
#include "support/debugger_text.h"
#include "support/thrown.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;

class WorldFaults : public AssetRootTest {
protected:
    WorldFaults() { getrlimit(RLIMIT_FSIZE, &fileSizes); }

    ~WorldFaults() override {
        setrlimit(RLIMIT_FSIZE, &fileSizes);
        EXPECT_EQ(seteuid(getuid()), 0);
    }

    rlimit fileSizes{};
    DebuggerText debugger;
};

TEST_F(WorldFaults, AFullDiskSilencesTheLogFileOnly) {
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit small = {2000, fileSizes.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
    for (int line = 0; line < 100; ++line)
        PELLS_LOG("app", "line " << line << " of a hundred lines that do not fit the disk");
    pells::Log::instance().close();
    PELLS_LOG("app", "the last line");
    pells::Log::instance().close();
    EXPECT_LE(fs::file_size("pells.log"), 2000u);
    EXPECT_TRUE(debugger.has("app: line 99 of"));
    EXPECT_TRUE(debugger.has("app: the last line\n"));
}

TEST_F(WorldFaults, AWorkingDirectoryThatIsGoneSilencesTheLogFileOnly) {
    prefs()["assetLocation"] = scratch.path("root");
    writeArchive("a.asset", {{"name", "content"}});
    fs::create_directory("gone");
    fs::current_path("gone");
    fs::remove(scratch.path("gone"));
    EXPECT_EQ(read("name"), "content");
    pells::Log::instance().close();
    EXPECT_TRUE(debugger.has("asset.open: "));
}

TEST_F(WorldFaults, NothingUnderTheLogsNameBlocksOrIsOverwritten) {
    scratch.write("precious", "as it was");
    const std::pair<const char*, std::function<void(const char*)>> obstacles[] = {
        {"a pipe", [](const char* name) { EXPECT_EQ(mkfifo(name, 0600), 0); }},
        {"a folder", [](const char* name) { fs::create_directory(name); }},
        {"a link", [](const char* name) { fs::create_symlink("precious", name); }},
        {"a link to nothing", [](const char* name) { fs::create_symlink("nothing", name); }},
        {"a device", [](const char* name) { fs::create_symlink("/dev/zero", name); }}};
    for (const auto& obstacle : obstacles) {
        SCOPED_TRACE(obstacle.first);
        for (const char* const name : {"pells.log", "pells.log.prefs"}) {
            fs::remove_all(name);
            obstacle.second(name);
        }
        prefs().clear();
        PELLS_LOG("app", "a site that asks for the rules");
        pells::SingletonList::freeSingletons();
        prefs() = {{"log", "*"}};
        debugger.received.clear();
        pells::LogKey key("app");
        pells::Log::instance().beginLine(key) << obstacle.first << '\n';
        pells::Log::instance().close();
        EXPECT_TRUE(debugger.has(std::string("app: ") + obstacle.first + '\n'));
        EXPECT_EQ(readFile("precious"), "as it was");
        EXPECT_FALSE(fs::exists("nothing"));
        pells::SingletonList::freeSingletons();
    }
}

TEST_F(WorldFaults, FilesThatVanishOrChangeHarmNoOther) {
    writeArchive("cut.asset", {{"long", noise(400000)}, {"newer", "old"}}, 1000);
    writeArchive("other.asset", {{"other", "fine"}});
    write("newer", "new", 2000);
    write(".symlinks", "alias>newer\n");
    EXPECT_EQ(read("alias"), "new");
    const auto container = manager().getFileStream("long", true);
    EXPECT_TRUE(container->getStream().ignore(512));
    fs::resize_file("root/cut.asset", 200000);
    fs::remove("root/newer");
    const auto readOn = [&container] { container->getStream().ignore(400000); };
    EXPECT_EQ(thrown<pells::pellibuf::BadPellFile>(readOn),
              "Can't read pell data stream for member 'long'");
    EXPECT_GT(container->getStream().gcount(), 190000);
    EXPECT_EQ(read("newer"), "(null)");
    EXPECT_EQ(read("alias"), "(null)");

    // An archive that was replaced by name goes on serving the file that was opened.
    writeArchive("other.asset.new", {{"other", "new"}});
    fs::rename("root/other.asset.new", "root/other.asset");
    EXPECT_EQ(read("other"), "fine");
}

TEST_F(WorldFaults, AnArchiveThatVanishesDuringTheScanHidesItselfOnly) {
    Members members;
    for (int i = 0; i < 20000; ++i)
        members.emplace_back("member " + std::to_string(i), "");
    scratch.write("thief", archiveOf(members));
    writeArchive("a.asset", {{"name", "content"}});
    prefs()["log"] = "-*";
    const pid_t child = fork();
    if (child == 0) {
        for (;;) {
            static_cast<void>(link("thief", "root/thief.asset"));
            usleep(300);
            unlink("root/thief.asset");
            usleep(300);
        }
    }
    for (int round = 0; round < 50; ++round) {
        EXPECT_NO_THROW(EXPECT_EQ(read("name"), "content"));
        pells::SingletonList::freeSingletons();
    }
    kill(child, SIGKILL);
    waitpid(child, nullptr, 0);
}

TEST_F(WorldFaults, WhatMayNotBeReadHidesItselfOnly) {
    write("closed/inside", "x");
    write("open/inside", "y");
    write("open/.symlinks", "alias>inside\n");
    write("closed.asset", "no matter");
    write("secret", "x");
    ASSERT_EQ(chmod("root/closed", 0), 0);
    ASSERT_EQ(chmod("root/secret", 0), 0);
    ASSERT_EQ(chmod("root/closed.asset", 0), 0);
    ASSERT_EQ(chmod(".", 0777), 0);
    // No file can be closed to root.
    ASSERT_TRUE(geteuid() != 0 || seteuid(65534) == 0);
    EXPECT_EQ(read("open/alias"), "y");
    EXPECT_EQ(read("closed/inside"), "(null)");
    EXPECT_EQ(manager().resolve("secret").source, pells::AssetManager::Resolution::NOWHERE);
    EXPECT_EQ(manager().resolve("open/alias").path, "root/open/inside");
    EXPECT_EQ(manager().listfiles("closed", false), Lines());
    EXPECT_EQ(logLines("error: ").at(0),
              "Bad .asset file: root/closed.asset: Can't open pell file");
    chmod("root/closed", 0700);
}

TEST_F(WorldFaults, PipesInTheRootBlockNothing) {
    fs::create_directory("root/Data");
    for (const char* const pipe : {"root/pipe.asset", "root/.symlinks", "root/Data/images.xml"})
        ASSERT_EQ(mkfifo(pipe, 0600), 0) << pipe;
    fs::create_symlink("/dev/zero", "root/zero.asset");
    writeArchive("a.asset", {{"name", "content"}});
    EXPECT_EQ(read("name"), "content");
    EXPECT_TRUE(pells::ImageFallbackManager::instance().getImageNames().empty());
}

/// Logs when it is freed.
class Mourner : public pells::Singleton<Mourner> {
public:
    ~Mourner() override { PELLS_LOG("app", "farewell"); }
};

TEST_F(WorldFaults, SingletonsMayLogWhenTheyDieAfterTheLog) {
    Mourner::instance();
    PELLS_LOG("app", "the log comes second and dies first");
    pells::SingletonList::freeSingletons();
    EXPECT_EQ(logLines("app: "), Lines{"farewell"});
    EXPECT_EQ(pells::Log::singleton, nullptr);
}

#ifndef NDEBUG
TEST_F(WorldFaults, ContainersThatOutliveTheManagerAreReported) {
    prefs() = {{"log", "-*"}, {"assetLocation", "root"}};
    writeArchive("a.asset", {{"name", "content"}});
    manager().getFileStream("name", true);
    pells::SingletonList::freeSingletons();
    EXPECT_FALSE(debugger.has("Stream containers"));
    const auto container = manager().getFileStream("name", true);
    pells::SingletonList::freeSingletons();
    EXPECT_TRUE(debugger.has("Stream containers outlive the asset manager\n"));
}
#endif

}  // namespace
