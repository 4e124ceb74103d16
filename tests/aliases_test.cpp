#include "support/asset_root.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;

class AliasTest : public AssetRootTest {
protected:
    ~AliasTest() override { pells::AssetManager::setAliasLimit(1000000); }

    /// The asset that a name stands for, or "".
    static std::string aliasOf(const std::string& name) { return manager().resolve(name).alias; }

    static void expectTooMany(const std::string& limit) {
        EXPECT_EQ(logLines("error: Too many aliases for the limit of "),
                  Lines{limit + ", some are dropped"});
    }
};

TEST_F(AliasTest, ReachFilesThroughLinksOfFoldersAndInside) {
    writeArchive("a.asset", {{"textures/wood.tga", "wood"}});
    write(".symlinks", "# names\r\npics>textures\r\n");
    write("textures/.symlinks", "oak.tga>wood.tga");
    write("textures/plain.tga", "plain");
    for (const char* const name : {"textures/oak.tga", "pics/wood.tga", "pics\\oak.tga"}) {
        EXPECT_EQ(aliasOf(name), "textures/wood.tga");
        EXPECT_EQ(read(name), "wood");
    }
    EXPECT_EQ(read("pics/plain.tga"), "plain");
    EXPECT_EQ(aliasOf("textures/wood.tga"), "");
    EXPECT_FALSE(manager().isFile("pics/wood.tga"));
    EXPECT_FALSE(manager().isDir("pics"));
    EXPECT_EQ(manager().listfiles("pics", false), Lines());

    EXPECT_EQ(sorted(logLines("asset.alias: ")),
              (Lines{"  'oak.tga' ==> 'wood.tga'", "  'pics' ==> 'textures'", "End   .symlinks",
                     "End   textures/.symlinks", "Found .symlinks", "Found textures/.symlinks",
                     "Making new DirNode for ''", "Making new DirNode for 'textures'",
                     "Mapping 'pics/.symlinks' to 'textures/.symlinks'",
                     "Mapping 'pics/oak.tga' to 'textures/wood.tga'",
                     "Mapping 'pics/plain.tga' to 'textures/plain.tga'",
                     "Mapping 'pics/wood.tga' to 'textures/wood.tga'",
                     "Mapping 'textures/oak.tga' to 'textures/wood.tga'"}));
    const std::string start = "asset.open: AssetManager::getFileStream(pics/";
    for (const char* const line :
         {"oak.tga): not in cache, but alias is: textures/wood.tga",
          "plain.tga): alias not in cache: textures/plain.tga",
          "plain.tga): textures/plain.tga not in cache, trying filesystem"})
        EXPECT_EQ(logLines(start + line), Lines{""}) << line;
}

TEST_F(AliasTest, LinesSplitAtRunsOfTheSign) {
    writeArchive("a.asset", {{"b", "1"},
                             {"c", "2"},
                             {"d/x", "3"},
                             {"d/CVS/y", "4"},
                             {".symlinks",
                              "a>>b\n>e>b>\nf\ng>b>c\n\nh > b\r\r\ni>none\nz>b\nz>c\n"
                              "k>d"}});
    EXPECT_EQ(aliasOf("a"), "b");
    EXPECT_EQ(aliasOf("e"), "b");
    EXPECT_EQ(aliasOf("h "), "");
    EXPECT_EQ(aliasOf("z"), "c") << "the link entered last wins";
    EXPECT_EQ(aliasOf("k/x"), "d/x");
    EXPECT_EQ(aliasOf("k/CVS/y"), "");
    for (const char* const line : {"  ??: 'f'", "  ??: 'g>b>c'", "  ??: ''", "  'h ' ==> ' b\r'"})
        EXPECT_EQ(logLines(std::string("asset.alias: ") + line), Lines{""}) << line;
}

TEST_F(AliasTest, ADamagedLinkFileEndsTheConstruction) {
    std::string bytes = archiveOf({{".symlinks", "a>b"}});
    bytes[archiveHeaderSize] = '\0';
    write("a.asset", bytes);
    EXPECT_THROW(manager(), pells::ZlibWrapper::ZlibError);
    EXPECT_EQ(pells::AssetManager::singleton, nullptr);
}

TEST_F(AliasTest, LinksOfTheFileSystemAreFollowedButNeverInCircles) {
    write("a/b/x", "x");
    write("a/b/.symlinks", "y>x");
    fs::create_directory_symlink("..", "root/a/b/up");
    fs::create_directory_symlink("../a", "root/a/self");
    fs::create_directory_symlink("b", "root/a/c");
    fs::create_directory_symlink(".", "root/here");
    fs::create_symlink("loop", "root/loop");
    // Members that lie behind such links are found all the same.
    writeArchive("a.asset", {{"here/here/.symlinks", "n>m"},
                             {"here/here/m", "m"},
                             {"a/./././b/k", "k"},
                             {"/x/y", "rooted"}});
    EXPECT_EQ(aliasOf("a/c/y"), "a/c/x");
    EXPECT_EQ(aliasOf("here/here/n"), "here/here/m");
    EXPECT_EQ(read("/x/y"), "rooted");
    EXPECT_EQ(sorted(logLines("asset.alias: Making new DirNode for ")),
              (Lines{"''", "'a'", "'a/.'", "'a/./.'", "'a/././.'", "'a/./././b'", "'a/b'", "'a/c'",
                     "'here'", "'here/here'"}));
}

TEST_F(AliasTest, StopAtTheLimitWithOneLine) {
    pells::AssetManager::setAliasLimit(3);
    writeArchive("a.asset", {{"f", "f"}, {".symlinks", "a>f\nb>f\nc>f\nd>f\ne>f\n"}});
    EXPECT_EQ(aliasOf("c"), "f");
    EXPECT_EQ(aliasOf("d"), "");
    expectTooMany("3");
}

/// What strangers may declare: each of these would take hours or all memory.
class AliasBomb : public AliasTest {
protected:
    AliasBomb() { prefs()["log"] = "error"; }
};

TEST_F(AliasBomb, LinksThatDoubleWithEveryLevel) {
    for (const char* const link : {"link>f", "f>f"}) {
        std::vector<std::pair<std::string, std::string>> members;
        std::string folder;
        for (int depth = 0; depth < 60; ++depth) {
            members.emplace_back(folder + ".symlinks", link);
            folder += "f/";
        }
        members.emplace_back(folder + "x", "x");
        writeArchive("a.asset", members);
        pells::AssetManager::setAliasLimit(10000);
        EXPECT_EQ(read(folder + "x"), "x");
        expectTooMany("10000");
        pells::SingletonList::freeSingletons();
    }
}

TEST_F(AliasBomb, DeepFoldersAndEndlessLines) {
    pells::AssetManager::setAliasLimit(1000);
    std::string deep;
    for (int depth = 0; depth < 100000; ++depth)
        deep += "d/";
    std::string endless("a>f\n");
    endless.resize(30000000, '>');
    writeArchive("a.asset", {{deep + "x", "x"}, {"f", "f"}, {".symlinks", endless + "\nb>f\n"}});
    EXPECT_EQ(read(deep + "x"), "x");
    EXPECT_EQ(aliasOf("a"), "f");
    EXPECT_EQ(logLines("error: Folder is nested too deeply to look for aliases: d/").size(), 1u);
    expectTooMany("1000");
}

}  // namespace
