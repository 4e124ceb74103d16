// What the machine does to a running program: files that vanish, change or are no files, folders
// that may not be read, a disk that is full, a working directory that is gone.

#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>

#include "pells/image/image_fallback_manager.h"
#include "pells/log/log.h"
#include "pells/platform/debugger.h"
#include "support/asset_root.h"

namespace {

namespace fs = boost::filesystem;

class Sink : public pells::platform::DebuggerSink {
public:
    void write(const char* text) override { received += text; }
    std::string received;
};

class WorldFaults : public pells_test::AssetRootTest {
protected:
    WorldFaults() { getrlimit(RLIMIT_FSIZE, &fileSizes); }

    ~WorldFaults() override {
        pells::platform::setDebuggerSink(nullptr);
        setrlimit(RLIMIT_FSIZE, &fileSizes);
        EXPECT_EQ(seteuid(getuid()), 0);
    }

    /// Gives up the rights that no file can be closed to, until the end of the test.
    void becomeOrdinaryUser() const {
        if (geteuid() != 0)
            return;
        EXPECT_EQ(chmod(scratch.path(".").c_str(), 0777), 0);
        EXPECT_EQ(chmod("root", 0777), 0);
        ASSERT_EQ(seteuid(65534), 0);
    }

    rlimit fileSizes{};
};

TEST_F(WorldFaults, AFullDiskSilencesTheLogFileOnly) {
    Sink sink;
    pells::platform::setDebuggerSink(&sink);
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit small = {2000, fileSizes.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
    for (int line = 0; line < 100; ++line)
        PELLS_LOG("app", "line " << line << " of a hundred lines that do not fit the disk");
    pells::Log::instance().close();
    PELLS_LOG("app", "the last line");
    pells::Log::instance().close();
    EXPECT_LE(fs::file_size("pells.log"), 2000u);
    EXPECT_NE(sink.received.find("app: line 99 of"), std::string::npos);
    EXPECT_NE(sink.received.find("app: the last line\n"), std::string::npos);
}

TEST_F(WorldFaults, AWorkingDirectoryThatIsGoneLeavesTheDebugger) {
    Sink sink;
    pells::platform::setDebuggerSink(&sink);
    pells_test::prefs()["assetLocation"] = scratch.path("root");
    writeArchive("a.asset", {{"name", "content"}});
    fs::create_directory("gone");
    fs::current_path("gone");
    ASSERT_EQ(rmdir(scratch.path("gone").c_str()), 0);
    EXPECT_EQ(read("name"), "content");
    pells::Log::instance().close();
    EXPECT_NE(sink.received.find("asset.open: "), std::string::npos);
}

TEST_F(WorldFaults, FilesThatVanishAreMissedOneByOne) {
    writeArchive("a.asset", {{"newer", "old"}, {"kept", "kept"}}, 1000);
    write("newer", "new", 2000);
    write(".symlinks", "alias>newer\n");
    EXPECT_EQ(read("alias"), "new");
    fs::remove("root/newer");
    EXPECT_EQ(read("newer"), "(null)");
    EXPECT_EQ(read("alias"), "(null)");
    EXPECT_EQ(read("kept"), "kept");
}

TEST_F(WorldFaults, ArchivesThatChangeWhileTheyAreReadHarmNoOther) {
    writeArchive("cut.asset", {{"long", pells_test::noise(400000)}, {"first", "1"}});
    writeArchive("other.asset", {{"other", "fine"}});
    const auto container = manager().getFileStream("long", true);
    std::istream& in = container->getStream();
    char piece[512];
    ASSERT_TRUE(in.read(piece, sizeof piece));
    fs::resize_file("root/cut.asset", 200000);
    EXPECT_THROW(while (in.read(piece, sizeof piece)){}, pells::pellibuf::BadPellFile);
    EXPECT_EQ(read("other"), "fine");
    EXPECT_THROW(read("first"), pells::pellibuf::BadPellFile);

    // An archive that was replaced by name goes on serving the file that was opened.
    writeArchive("other.asset.new", {{"other", "new"}});
    fs::rename("root/other.asset.new", "root/other.asset");
    EXPECT_EQ(read("other"), "fine");
}

TEST_F(WorldFaults, AFolderThatMayNotBeReadHidesItselfOnly) {
    write("closed/inside", "x");
    write("open/inside", "y");
    write("open/.symlinks", "alias>inside\n");
    write("closed.asset", "no matter");
    ASSERT_EQ(chmod("root/closed", 0), 0);
    ASSERT_EQ(chmod("root/closed.asset", 0), 0);
    becomeOrdinaryUser();
    EXPECT_EQ(read("open/alias"), "y");
    EXPECT_EQ(read("closed/inside"), "(null)");
    EXPECT_EQ(manager().listfiles("closed", false), std::vector<std::string>());
    const pells_test::Lines errors = pells_test::logLines("error: ");
    EXPECT_EQ(errors.at(0), "Bad .asset file: root/closed.asset: Can't open pell file");
    chmod("root/closed", 0700);
}

TEST_F(WorldFaults, NamesNeedBeNoText) {
    const std::string name = "\xFF\xC0\xAF\x01\n";
    writeArchive("a.asset", {{"member\xFE", "m"}});
    write(name, "bytes");
    write(name + "folder/file", "below");
    EXPECT_EQ(read(name), "bytes");
    EXPECT_EQ(read("member\xFE"), "m");
    EXPECT_EQ(manager().listfiles("", true), std::vector<std::string>{name + "folder"});
    EXPECT_EQ(read(name + "folder\\file"), "below");
}

TEST_F(WorldFaults, PipesInTheRootBlockNothing) {
    ASSERT_EQ(mkfifo("root/pipe.asset", 0600), 0);
    ASSERT_EQ(mkfifo("root/.symlinks", 0600), 0);
    ASSERT_EQ(mkdir("root/Data", 0700), 0);
    ASSERT_EQ(mkfifo("root/Data/images.xml", 0600), 0);
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

TEST_F(WorldFaults, SingletonsMayLogWhenTheyDie) {
    PELLS_LOG("app", "a log comes first");
    Mourner::instance();
    pells::SingletonList::freeSingletons();
    EXPECT_EQ(pells_test::logLines("app: "),
              (std::vector<std::string>{"a log comes first", "farewell"}));

    // Here the log dies first, and another one is made for the farewell.
    Mourner::instance();
    PELLS_LOG("app", "a log comes second");
    pells::SingletonList::freeSingletons();
    EXPECT_EQ(pells_test::logLines("app: "), std::vector<std::string>{"farewell"});
    EXPECT_EQ(pells::Log::singleton, nullptr);
}

#ifndef NDEBUG
TEST_F(WorldFaults, ContainersThatOutliveTheManagerAreReported) {
    Sink sink;
    pells::platform::setDebuggerSink(&sink);
    pells_test::prefs() = {{"log", "-*"}, {"assetLocation", "root"}};
    writeArchive("a.asset", {{"name", "content"}});
    auto container = manager().getFileStream("name", true);
    pells::SingletonList::freeSingletons();
    EXPECT_NE(sink.received.find("Stream containers outlive the asset manager\n"),
              std::string::npos);
    container = nullptr;
    sink.received.clear();
    manager().getFileStream("name", true);
    pells::SingletonList::freeSingletons();
    EXPECT_EQ(sink.received.find("Stream containers"), std::string::npos);
}
#endif

}  // namespace
