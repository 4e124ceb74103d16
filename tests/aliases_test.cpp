#include "support/asset_root.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;

class AliasTest : public AssetRootTest {
protected:
    ~AliasTest() override { pells::AssetManager::setAliasLimit(1000000); }

    /// The asset that a name stands for, or "".
    static std::string aliasOf(const std::string& name) { return manager().resolve(name).alias; }
};

TEST_F(AliasTest, ReachFilesThroughLinksOfFoldersAndInside) {
    writeArchive("a.asset", {{"textures/wood.tga", "wood"}});
    write(".symlinks", "# names\r\npics>textures\r\n");
    write("textures/.symlinks", "oak.tga>wood.tga");
    write("textures/plain.tga", "plain");
    for (const char* const name : {"textures/oak.tga", "pics/wood.tga", "pics\\oak.tga"})
        EXPECT_EQ(read(name), "wood") << name;
    EXPECT_EQ(read("pics/plain.tga"), "plain");
    EXPECT_FALSE(manager().isFile("pics/wood.tga"));
    EXPECT_FALSE(manager().isDir("pics"));
    EXPECT_EQ(sorted(logLines("asset.alias: ")),
              (Lines{"  'oak.tga' ==> 'wood.tga'", "  'pics' ==> 'textures'", "End   .symlinks",
                     "End   textures/.symlinks", "Found .symlinks", "Found textures/.symlinks",
                     "Making new DirNode for ''", "Making new DirNode for 'textures'",
                     "Mapping 'pics/.symlinks' to 'textures/.symlinks'",
                     "Mapping 'pics/oak.tga' to 'textures/wood.tga'",
                     "Mapping 'pics/plain.tga' to 'textures/plain.tga'",
                     "Mapping 'pics/wood.tga' to 'textures/wood.tga'",
                     "Mapping 'textures/oak.tga' to 'textures/wood.tga'"}));
    EXPECT_EQ(logLines("asset.open: AssetManager::getFileStream(pics/"),
              (Lines{"wood.tga): not in cache, but alias is: textures/wood.tga",
                     "oak.tga): not in cache, but alias is: textures/wood.tga",
                     "plain.tga): alias not in cache: textures/plain.tga",
                     "plain.tga): textures/plain.tga not in cache, trying filesystem"}));
}

TEST_F(AliasTest, LinesSplitAtRunsOfTheSign) {
    const std::string links = "a>>b\n>e>b>\nf\ng>b>c\n\nh > b\r\r\nz>b\nz>c\nk>d";
    writeArchive("a.asset",
                 {{"b", ""}, {"c", ""}, {"d/x", ""}, {"d/CVS/y", ""}, {".symlinks", links}});
    const std::pair<const char*, const char*> cases[] = {
        {"a", "b"}, {"e", "b"}, {"h ", ""}, {"z", "c"}, {"k/x", "d/x"}, {"k/CVS/y", ""}};
    for (const auto& each : cases)
        EXPECT_EQ(aliasOf(each.first), each.second) << each.first;
    EXPECT_EQ(logLines("asset.alias:   ??: "), (Lines{"'f'", "'g>b>c'", "''"}));
    EXPECT_EQ(logLines("asset.alias:   'h ' ==> "), Lines{"' b\r'"});
}

TEST_F(AliasTest, ADamagedLinkFileEndsTheConstruction) {
    write("a.asset", archiveOf({{".symlinks", "a>b"}}).replace(archiveHeaderSize, 1, 1, '\0'));
    EXPECT_THROW(manager(), pells::ZlibWrapper::ZlibError);
    EXPECT_EQ(pells::AssetManager::singleton, nullptr);
}

TEST_F(AliasTest, LinksOfTheFileSystemAreFollowedButNeverInCircles) {
    write("a/b/x", "x");
    write("a/b/.symlinks", "y>x");
    fs::create_directory_symlink("..", "root/a/b/up");
    fs::create_directory_symlink("b", "root/a/c");
    fs::create_directory_symlink(".", "root/here");
    fs::create_symlink("loop", "root/loop");
    // Members that lie behind such links are found all the same.
    writeArchive("a.asset", {{"here/.symlinks", "n>m"}, {"here/m", "m"}, {"/x/y", "rooted"}});
    EXPECT_EQ(aliasOf("a/c/y"), "a/c/x");
    EXPECT_EQ(aliasOf("here/n"), "here/m");
    EXPECT_EQ(read("/x/y"), "rooted");
    EXPECT_EQ(sorted(logLines("asset.alias: Making new DirNode for ")),
              (Lines{"''", "'a'", "'a/b'", "'a/c'", "'here'"}));
}

TEST_F(AliasTest, LinksOfTheFileSystemThatCrossEndTheSearchWithOneLine) {
    // Ten folders with links to one another: ten factorial ways through them, none of them
    // circular.
    for (char from = '0'; from <= '9'; ++from) {
        for (char to = '0'; to <= '9'; ++to) {
            fs::create_directories(std::string("root/") + to);
            if (from != to)
                fs::create_directory_symlink(std::string("../") + to,
                                             std::string("root/") + from + '/' + to);
        }
    }
    write("7/.symlinks", "y>x");
    write("7/x", "x");
    prefs()["log"] = "error -asset";
    pells::AssetManager::setAliasLimit(10000);
    EXPECT_EQ(aliasOf("7/y"), "7/x");
    EXPECT_EQ(logLines("error: Too many folders behind links of the file system").size(), 1u);
}

TEST_F(AliasTest, NamesInArchivesDoNotLeadTheSearchOutOfTheRoot) {
    scratch.write(".symlinks", "here>beside");
    scratch.write("beside/.symlinks", "n>m");
    scratch.write("beside/m", "m");
    writeArchive("a.asset", {{"../a/.symlinks", "c>b"}, {"../a/b", "b"}, {"d/../../beside/e", ""}});
    EXPECT_EQ(aliasOf("../a/c"), "../a/b");
    EXPECT_EQ(aliasOf("../beside/n") + aliasOf("d/../../beside/n"), "");
    EXPECT_EQ(sorted(logLines("asset.alias: Making new DirNode for ")),
              (Lines{"''", "'..'", "'../a'", "'d'", "'d/..'", "'d/../..'", "'d/../../beside'"}));
}

// What strangers may declare: each of these would take hours or all memory.
TEST_F(AliasTest, StopAtTheLimitWhereLinksDoubleWithEveryLevel) {
    prefs()["log"] = "error";
    pells::AssetManager::setAliasLimit(10000);
    for (const char* const link : {"link>f", "f>f"}) {
        Members members = {{"f", "x"}};
        for (std::string folder; folder.size() < 120; folder += "f/")
            members.emplace_back(folder + ".symlinks", link);
        writeArchive("a.asset", members);
        EXPECT_EQ(read("f"), "x");
        EXPECT_EQ(logLines("error: Too many aliases for the limit of 10000, some are dropped"),
                  Lines{""});
        pells::SingletonList::freeSingletons();
    }
}

TEST_F(AliasTest, StopAtTheLimitAndAtDeepFoldersAndEndlessLines) {
    prefs()["log"] = "error";
    pells::AssetManager::setAliasLimit(3);
    std::string deep;
    for (int depth = 0; depth < 100000; ++depth)
        deep += "d/";
    std::string links = "4>f\n3>f\n2>f\n1>f\n";
    links.resize(30000000, '>');
    links += "\n0>f\n";
    writeArchive("a.asset", {{deep + "x", "x"}, {"f", "f"}, {".symlinks", links}});
    EXPECT_EQ(read(deep + "x"), "x");
    EXPECT_EQ(aliasOf("0"), "") << "behind the endless line";
    EXPECT_EQ(aliasOf("3"), "f");
    EXPECT_EQ(aliasOf("4"), "") << "beyond the limit";
    EXPECT_EQ(logLines("error: Folder is nested too deeply to look for aliases: d/").size(), 1u);
    EXPECT_EQ(logLines("error: Too many aliases for the limit of 3, some are dropped"), Lines{""});
}

}  // namespace
