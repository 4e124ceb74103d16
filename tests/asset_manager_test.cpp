#include "pells/asset/asset_manager.h"

#include <algorithm>
#include <limits>
#include <random>
#include <set>

#include "support/asset_root.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;
typedef pells::AssetManager::Resolution Resolution;

class AssetManagerTest : public AssetRootTest {};

TEST_F(AssetManagerTest, LogsWhatItFindsAndOpens) {
    writeArchive("a.asset", {{"dir/x", "x"}});
    EXPECT_EQ(read("dir\\x"), "x");
    EXPECT_EQ(read("none"), "(null)");
    const std::string opening = "asset.open: AssetManager::getFileStream(";
    EXPECT_EQ(logLines(),
              (Lines{
                  "asset.iter: Found root/a.asset",
                  "asset.entries: >>> For this asset file, found entry: dir/x",
                  "asset.alias: Making new DirNode for ''",
                  "asset.iter: listfiles(, files): considering dir/x",
                  "asset.list: listfiles(, files): skipping subdir file: dir/x",
                  "asset.list: listfiles(, files): from filesystem: a.asset",
                  opening + ".symlinks): .symlinks not in cache, trying filesystem",
                  "error: Couldn't open the specified file from disc: root/.symlinks",
                  "asset.iter: listfiles(, dirs): considering dir/x",
                  "asset.list: listfiles(, dirs): from cache: dir",
                  "asset.alias: Making new DirNode for 'dir'",
                  "asset.iter: listfiles(dir, files): considering dir/x",
                  "asset.list: listfiles(dir, files): from cache: x",
                  opening + "dir/.symlinks): dir/.symlinks not in cache, trying filesystem",
                  "error: Couldn't open the specified file from disc: root/dir/.symlinks",
                  "asset.iter: listfiles(dir, dirs): considering dir/x",
                  "asset.list: listfiles(dir, dirs): skipping plain file: x",
                  opening + "dir/x): found in cache",
                  opening + "none): none not in cache, trying filesystem",
                  "error: Couldn't open the specified file from disc: root/none",
              }));
}

TEST_F(AssetManagerTest, SkipsWhatIsNoArchive) {
    write("b.asset", "no archive");
    write("c.ASSET", "x");
    fs::create_directory("root/d.asset");
    fs::create_symlink("e.asset", "root/e.asset");
    EXPECT_EQ(read("b.asset"), "no archive");
    Lines scan = logLines("asset.iter: ");
    scan.resize(6);
    EXPECT_EQ(sorted(scan),
              (Lines{"  which is a directory, skipping", "  which isn't a .asset file, skipping",
                     "Found root/b.asset", "Found root/c.ASSET", "Found root/d.asset",
                     "Found root/e.asset"}));
    EXPECT_EQ(logLines("asset.ctor: "), Lines{"Asset manager has no .asset files to check."});
    EXPECT_EQ(logLines("error: Bad .asset file: ").size(), 2u);
    EXPECT_EQ(logLines("error: Bad .asset file: root/b.asset: "),
              Lines{"Input file not a pell file"});
    EXPECT_EQ(logLines("error: Bad .asset file: root/e.asset: "), Lines{"Can't open pell file"});
}

TEST_F(AssetManagerTest, ServesWhatWasWrittenLast) {
    const std::time_t beyond32Bits = std::time_t{1} << 33;
    writeArchive("a.asset", {{"both", "a"}, {"file", "a"}, {"sub/old", "a"}, {"tie", "a"}}, 1000);
    writeArchive("b.asset", {{"both", "b"}, {"late", "b"}, {"tie", "b"}}, 1000);
    writeArchive("c.asset", {{"both", "c"}, {"late", "c"}}, 1001);
    writeArchive("d.asset", {{"end", "d"}}, beyond32Bits);
    write("file", "plain", 1001);
    write("sub/old", "plain", 1000);
    write("end", "plain", beyond32Bits + 1);
    write("only", "plain");

    const std::pair<const char*, const char*> served[] = {
        {"both", "c"}, {"file", "plain"}, {"sub/old", "a"},
        {"end", "d"},  {"only", "plain"}, {"/only", "plain"}};  // the last one below the root, too
    for (const auto& each : served)
        EXPECT_EQ(read(each.first), each.second) << each.first;

    const Resolution both = manager().resolve("both");
    EXPECT_EQ(both.source, Resolution::ARCHIVE_MEMBER);
    EXPECT_EQ(both.path, "root/c.asset");
    EXPECT_EQ(both.member, "both");
    EXPECT_EQ(both.overridden.size(), 2u);
    EXPECT_FALSE(both.tie);

    // Between archives of one time the scan decides, and its order is the file system's.
    const Resolution tie = manager().resolve("tie");
    EXPECT_TRUE(tie.tie);
    const Lines scan = logLines("asset.iter: ");
    const auto first = std::find_if(scan.begin(), scan.end(), [](const std::string& line) {
        return line == "Found root/a.asset" || line == "Found root/b.asset";
    });
    EXPECT_EQ("Found " + tie.path, *first);
    EXPECT_EQ("root/" + read("tie") + ".asset", tie.path);

    const Resolution file = manager().resolve("file");
    EXPECT_EQ(file.source, Resolution::NEWER_FILE);
    EXPECT_EQ(file.path, "root/file");
    EXPECT_EQ(file.overridden, Lines{"root/a.asset"});
    EXPECT_EQ(manager().resolve("only").source, Resolution::FILE_SYSTEM);
    EXPECT_EQ(manager().resolve("none").source, Resolution::NOWHERE);
}

TEST_F(AssetManagerTest, ReportsNamesThatTheFileSystemRefuses) {
    const std::string name(300, 'n');
    const std::string zero("a.asset\0x", 9);
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
    write("file", "plain");
    const auto one = manager().getFileStream("one", true);
    EXPECT_EQ(one->getStream().get(), '1');
    const auto two = manager().getFileStream("two", true);
    EXPECT_EQ(one->getStream().get(), '2');
    EXPECT_EQ(&one->getStream(), &two->getStream());

    const auto file = manager().getFileStream("file", true);
    const auto again = manager().getFileStream("file", true);
    EXPECT_EQ(file->getStream().get(), 'p');
    EXPECT_EQ(again->getStream().get(), 'p');
    EXPECT_EQ(file->getStream().get(), 'l');
}

TEST_F(AssetManagerTest, ARootThatIsNotThereLeavesTheConstructor) {
    prefs()["assetLocation"] = "";
    EXPECT_THROW(manager(), fs::filesystem_error);
    EXPECT_EQ(pells::AssetManager::singleton, nullptr);
    prefs()["assetLocation"] = "root";
    EXPECT_FALSE(manager().isFile("x"));
    EXPECT_TRUE(manager().isDir(""));
}

TEST_F(AssetManagerTest, TellsFilesFromFoldersOnDiskAndInArchives) {
    writeArchive("a.asset", {{"d/e/x", ""}, {"d/y", ""}, {"d0", ""}, {"d.x/z", ""}, {"w\\v", ""}});
    write("d/y", "");
    write("d/f/u", "");
    for (const char* const file : {"d\\y", "d/y", "d/f/u", "d0"}) {
        EXPECT_TRUE(manager().isFile(file));
        EXPECT_FALSE(manager().isDir(file));
    }
    for (const char* const dir : {"d\\e", "d/f", "d.x"}) {
        EXPECT_TRUE(manager().isDir(dir));
        EXPECT_FALSE(manager().isFile(dir));
    }
    EXPECT_FALSE(manager().isFile("w\\v"));
    EXPECT_EQ(manager().listfiles("d\\e", false), Lines{"x"});
    EXPECT_EQ(logLines("asset.list: ").back(), "listfiles(d\\e, files): from cache: x");
}

TEST_F(AssetManagerTest, ListsEachNameOnce) {
    std::mt19937 random(11);
    std::vector<std::pair<std::string, std::string>> members;
    std::set<std::string> names;
    for (int i = 0; i < 300; ++i) {
        std::string name;
        for (auto letters = 1 + random() % 8; letters > 0; --letters)
            name += "aab.0/"[random() % 6];
        members.emplace_back(name, "");
        names.insert(name);
    }
    writeArchive("a.asset", members, std::numeric_limits<std::int32_t>::max());
    for (const char* const plain : {"a/b", "a/new", "b/a/c", "folder/x"}) {
        write(plain, "");
        names.insert(plain);
    }
    names.insert("a.asset");

    // Real folders by another name: everything on disk is in them, too.
    const std::map<std::string, std::pair<Lines, Lines>> onDisk = {
        {".", {{"a.asset"}, {"a", "b", "folder"}}}, {"a/", {{"b", "new"}, {}}}};
    for (const std::string dir : {"", "a", "b", "a/a", "a/", ".", "folder", "none"}) {
        std::set<std::string> expected[2];  // files and folders
        const std::string start = dir.empty() ? "" : dir + "/";
        for (const std::string& name : names) {
            if (name.compare(0, start.size(), start) != 0)
                continue;
            const std::string::size_type slash = name.find('/', start.size());
            expected[slash != std::string::npos].insert(
                name.substr(start.size(), slash - start.size()));
        }
        if (onDisk.count(dir) != 0) {
            expected[0].insert(onDisk.at(dir).first.begin(), onDisk.at(dir).first.end());
            expected[1].insert(onDisk.at(dir).second.begin(), onDisk.at(dir).second.end());
        }
        // Folders are passed over only while no line is written.
        for (const char* const tags : {"*", "-*", "asset.list"}) {
            pells::SingletonList::freeSingletons();
            prefs()["log"] = tags;
            for (const bool folders : {false, true}) {
                EXPECT_EQ(sorted(manager().listfiles(dir, folders)),
                          Lines(expected[folders].begin(), expected[folders].end()))
                    << dir;
            }
        }
    }
}

}  // namespace
