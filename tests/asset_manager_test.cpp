#include "pells/asset/asset_manager.h"

#include <algorithm>
#include <limits>

#include "support/asset_root.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;

class AssetManagerTest : public AssetRootTest {};

TEST_F(AssetManagerTest, LogsWhatItFindsAndOpens) {
    writeArchive("a.asset", {{"dir/x", "x"}});
    write("b.asset", "no archive");
    fs::create_directory("root/c.asset");
    fs::create_symlink("d.asset", "root/d.asset");
    write("e.ASSET", "e");
    EXPECT_EQ(read("dir\\x"), "x");
    EXPECT_EQ(read("none"), "(null)");
    for (const char* const line :
         {"asset.iter: Found root/a.asset", "asset.iter: Found root/e.ASSET",
          "asset.iter:   which is a directory, skipping",
          "asset.iter:   which isn't a .asset file, skipping",
          "asset.entries: >>> For this asset file, found entry: dir/x",
          "asset.iter: listfiles(, files): considering dir/x",
          "asset.list: listfiles(, files): skipping subdir file: dir/x",
          "asset.list: listfiles(, files): from filesystem: a.asset",
          "asset.list: listfiles(, dirs): from cache: dir",
          "asset.list: listfiles(dir, files): from cache: x",
          "asset.list: listfiles(dir, dirs): skipping plain file: x",
          "asset.open: AssetManager::getFileStream(dir/x): found in cache",
          "asset.open: AssetManager::getFileStream(none): none not in cache, trying filesystem",
          "error: Couldn't open the specified file from disc: root/none",
          "error: Bad .asset file: root/b.asset: Input file not a pell file",
          "error: Bad .asset file: root/d.asset: Can't open pell file"})
        EXPECT_EQ(logLines(line), Lines{""}) << line;
    EXPECT_EQ(logLines("error: Bad .asset file: ").size(), 2u);
}

TEST_F(AssetManagerTest, ServesWhatWasWrittenLast) {
    typedef pells::AssetManager::Resolution Resolution;
    const std::time_t beyond32Bits = std::time_t{1} << 33;
    writeArchive("a.asset",
                 {{"both", "a"}, {"gone/x", "a"}, {"sub/new", "a"}, {"sub/old", "a"}, {"tie", "a"}},
                 1000);
    writeArchive("b.asset", {{"both", "b"}, {"tie", "b"}}, 1000);
    writeArchive("c.asset", {{"both", "c"}}, 1001);
    writeArchive("d.asset", {{"end", "d"}, {"far", "d"}}, beyond32Bits);
    writeArchive("e.asset", {{"far", "e"}}, beyond32Bits + 5);
    write("sub/new", "plain", 1001);
    write("sub/old", "plain", 1000);
    write("end", "plain", beyond32Bits + 1);
    write("only", "plain");

    const std::pair<const char*, const char*> served[] = {
        {"both", "c"}, {"sub/new", "plain"}, {"sub/old", "a"},  {"end", "plain"},
        {"far", "e"},  {"only", "plain"},    {"/only", "plain"}};  // the last one below the root,
                                                                   // too
    for (const auto& each : served)
        EXPECT_EQ(read(each.first), each.second) << each.first;
    const Resolution both = manager().resolve("both");
    EXPECT_EQ(both.path, "root/c.asset");
    EXPECT_EQ(both.overridden.size(), 2u);
    EXPECT_FALSE(both.tie);
    EXPECT_EQ(manager().resolve("end").source, Resolution::NEWER_FILE);
    EXPECT_FALSE(manager().resolve("far").tie);

    // Between archives of one time the scan decides, and its order is the file system's.
    const Resolution tie = manager().resolve("tie");
    EXPECT_TRUE(tie.tie);
    EXPECT_EQ("root/" + read("tie") + ".asset", tie.path);
    const Lines scan = logLines("asset.iter: Found root/");
    EXPECT_LT(std::find(scan.begin(), scan.end(), read("tie") + ".asset"),
              std::find(scan.begin(), scan.end(), tie.overridden.at(0).substr(5)));
}

TEST_F(AssetManagerTest, ReportsNamesThatTheFileSystemRefuses) {
    const std::string name(300, 'n');
    const std::string zero("plain\0x", 7);
    write("plain", "plain");
    writeArchive("a.asset", {{name, "long"}, {zero, "zero"}}, 1000);
    EXPECT_EQ(read(name), "long");
    EXPECT_EQ(read(zero), "zero");
    EXPECT_EQ(read(zero + "y"), "(null)");
    EXPECT_EQ(manager().listfiles(name, true), Lines());
    EXPECT_EQ(logLines("error: Can't get timestamp for file root/" + name + ": ").size(), 1u);
    const std::string listing = "error: listfiles(" + name + ", dirs)";
    EXPECT_EQ(logLines(listing + ": Can't list directory in filesystem: ").size(), 1u);
}

TEST_F(AssetManagerTest, MembersOfOneArchiveShareAStream) {
    writeArchive("a.asset", {{"one", "1111"}, {"two", "2222"}});
    const auto one = manager().getFileStream("one", true);
    EXPECT_EQ(one->getStream().get(), '1');
    const auto two = manager().getFileStream("two", true);
    EXPECT_EQ(one->getStream().get(), '2');
}

TEST_F(AssetManagerTest, ARootThatIsNotThereLeavesTheConstructor) {
    prefs()["assetLocation"] = "";
    EXPECT_THROW(manager(), fs::filesystem_error);
    EXPECT_EQ(pells::AssetManager::singleton, nullptr);
    prefs()["assetLocation"] = "root";
    EXPECT_FALSE(manager().isFile("x"));
    EXPECT_EQ(logLines("asset.ctor: "), Lines{"Asset manager has no .asset files to check."});
}

TEST_F(AssetManagerTest, TellsFilesFromFoldersAndListsEachNameOnce) {
    // Without a line for each, the members in a folder are passed over as a whole.
    prefs()["log"] = "-*";
    Members members = {{"w\\v", ""}};
    for (const char* const name :
         {"d/b", "d/b.a", "d/b/x", "d/b/y", "d/b0", "d.x/\xFF\xC0\x01", "d0", "d/e/"})
        members.emplace_back(name, "");
    writeArchive("a.asset", members, std::numeric_limits<std::int32_t>::max());
    write("d/b0", "");
    write("d/new", "");
    write("d/b.x/\xFF\n", "");
    const struct {
        const char* dir;
        Lines files;
        Lines folders;
    } cases[] = {{"d", {"b", "b.a", "b0", "new"}, {"b", "b.x", "e"}},
                 {"d\\b", {"x", "y"}, {}},
                 {"d\\b.x", {"\xFF\n"}, {}},
                 {"d.x", {"\xFF\xC0\x01"}, {}},
                 {"", {"a.asset", "d0", "w\\v"}, {"d", "d.x"}}};
    for (const auto& each : cases) {
        EXPECT_EQ(sorted(manager().listfiles(each.dir, false)), each.files) << each.dir;
        EXPECT_EQ(sorted(manager().listfiles(each.dir, true)), each.folders) << each.dir;
        EXPECT_TRUE(manager().isDir(each.dir)) << each.dir;
    }
    EXPECT_TRUE(manager().isFile("d\\b"));
    EXPECT_TRUE(manager().isFile("d/new"));
    EXPECT_FALSE(manager().isFile("d/b.x"));
    EXPECT_FALSE(manager().isFile("w\\v"));
    EXPECT_FALSE(manager().isDir("d0"));
    EXPECT_FALSE(manager().isDir("none"));
}

TEST(AssetOpener, TellsTimesBeyond32BitsByTheNearestOne) {
    const std::pair<std::int64_t, std::int32_t> times[] = {
        {7, 7}, {std::int64_t{1} << 40, 2147483647}, {-(std::int64_t{1} << 40), -2147483647 - 1}};
    for (const auto& each : times) {
        const pells::AssetManager::FileOpener opener("path", each.first);
        EXPECT_EQ(opener.getWriteTime(), each.first);
        EXPECT_EQ(opener.getTimestamp(), each.second);
    }
}

TEST(StreamContainers, SayInWordsThatAFileCannotBeOpened) {
    try {
        pells::iTemporaryStreamContainer container("none");
        FAIL() << "it was opened";
    } catch (const std::exception& failure) {
        EXPECT_STREQ(failure.what(), "no regular file of that name can be opened");
    }
}

}  // namespace
