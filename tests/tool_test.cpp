#include <gtest/gtest.h>
#include <png.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>

#include "support/archive_bytes.h"
#include "support/tga_file.h"

namespace {

using namespace pells_test;

/// An entry of an image table, for a picture with one loader.
std::string definition(const std::string& name, const std::string& file) {
    return "<imageEntry><name>" + name + "</name><getters><getter class=\"TGAFileLoader\"><text>" +
           file + "</text></getter></getters></imageEntry>\n";
}

std::string definitions(const std::string& entries) {
    return "<imagedefs><imageEntries>" + entries + "</imageEntries></imagedefs>";
}

/// What a run of the real tool left behind.
struct Outcome {
    int status;
    std::string out;
    std::string err;
};

/// Each test has a folder to run the tool in, and one beside it for what the tool prints.
class ToolTest : public ::testing::Test {
protected:
    ToolTest() { scratch.enter(); }

    /// Runs a script in which $PELLS is the tool.
    Outcome shell(const std::string& script) {
        printed.write("script",
                      "export LSAN_OPTIONS=print_suppressions=0:suppressions='" PELLS_SUPPRESSIONS
                      "'\nPELLS='" PELLS_TOOL "'\n" +
                          script + "\n");
        const std::string command = "bash '" + printed.path("script") + "' >'" +
                                    printed.path("out") + "' 2>'" + printed.path("err") + "'";
        const int status = std::system(command.c_str());
        return {WEXITSTATUS(status), readFile(printed.path("out")), readFile(printed.path("err"))};
    }

    Outcome pells(const std::string& arguments) { return shell("\"$PELLS\" " + arguments); }

    /// Expects one line that says what, where and why; a status that tells wrong usage from other
    /// failures; nothing on standard output; no file made, and "good.pell" as it was.
    void expectFailure(const std::string& command, const std::string& line) {
        SCOPED_TRACE(command);
        const Lines before = files();
        const std::string bytes = readFile("good.pell");
        const Outcome outcome = pells(command);
        EXPECT_EQ(outcome.status, line.find("(see --help)") != std::string::npos ? 2 : 1);
        EXPECT_EQ(outcome.err, "pells: " + line + "\n");
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(files(), before);
        EXPECT_EQ(readFile("good.pell"), bytes);
    }

    ScratchDirectory printed;
    ScratchDirectory scratch;
};

/// The pixels of a PNG picture, 0xRRGGBB each.
std::vector<std::uint32_t> decodePng(const std::string& path) {
    png_image image = {};
    image.version = PNG_IMAGE_VERSION;
    EXPECT_TRUE(png_image_begin_read_from_file(&image, path.c_str())) << image.message;
    image.format = PNG_FORMAT_RGB;
    std::vector<unsigned char> bytes(PNG_IMAGE_SIZE(image));
    EXPECT_TRUE(png_image_finish_read(&image, nullptr, bytes.data(), 0, nullptr)) << image.message;
    std::vector<std::uint32_t> pixels;
    for (std::size_t i = 0; i + 2 < bytes.size(); i += 3)
        pixels.push_back(std::uint32_t{bytes[i]} << 16 | std::uint32_t{bytes[i + 1]} << 8 |
                         bytes[i + 2]);
    return pixels;
}

TEST_F(ToolTest, PacksListsAndPrints) {
    scratch.write("in/.symlinks", "b>a\n");
    scratch.write("in/sub/zero", std::string("\0\r\n", 3));
    EXPECT_EQ(pells("pack in/ --output a.pell").out, "");
    EXPECT_EQ(pells("list a.pell").out, "        12  .symlinks\n        11  sub/zero\n");
    EXPECT_EQ(pells("cat a.pell 'sub\\zero'").out, std::string("\0\r\n", 3));
    EXPECT_EQ(pells("--version").out.substr(0, 6), "pells ");
    EXPECT_NE(pells("sheet --help").out.find("--output"), std::string::npos);
}

TEST_F(ToolTest, FailsWithOneLineAndLeavesNothing) {
    const std::pair<const char*, const char*> cases[] = {
        {"", "A subcommand is required (see --help)"},
        {"frob", "unknown command 'frob' (see --help)"},
        {"--frob", "unknown option '--frob' (see --help)"},
        {"pack in", "pack: --output is required (see --help)"},
        {"pack -o out.pell missing", "pack: missing: No such file or directory"},
        {"pack -o in in", "pack: in: Is a directory"},
        {"pack -o in/out.pell in",
         "pack: in/out.pell: The archive would lie in the folder that it packs"},
        {"cat good.pell nope", "cat: good.pell: The archive has no member 'nope'"},
        {"list --frob", "list: unknown option '--frob' (see --help)"},
        {"list missing.pell", "list: missing.pell: No such file or directory"},
        {"list in", "list: in: Is a directory"},
        {"list pipe", "list: pipe: Not a regular file"},
        {"list ended.pell",
         "list: ended.pell: The directory should begin at byte 39, but the file has only 39"},
        {"cat ended.pell a",
         "cat: ended.pell: The directory should begin at byte 39, but the file has only 39"},
        {"cat cut.pell a", "cat: cut.pell: member 'a': The file ends inside the data"},
        {"cat good.pell '[m]'", "cat: good.pell: The archive has no member '[m]'"},
        {"cat junk.pell a",
         "cat: junk.pell: member 'a': The data is damaged: incorrect header check"},
        {"resolve root", "resolve: NAME is required (see --help)"},
        {"resolve good.pell a", "resolve: good.pell: Not a directory"},
        {"sheet root -o /dev/null", "sheet: /dev/null: Not a regular file"},
        {"sheet in -o good.pell",
         "sheet: asset Data/images.xml: Couldn't open the specified file from disc: "
         "in/Data/images.xml"},
        {"sheet root -o good.pell >/dev/full", "sheet: standard output: No space left on device"},
        {"swatch -o good.pell", "swatch: MATERIAL.xml or --blend is required (see --help)"},
        {"swatch -o good.pell missing.xml", "swatch: missing.xml: No such file or directory"},
        {"swatch -o good.pell /dev/zero", "swatch: /dev/zero: Not a regular file"},
        {"swatch -o good.pell cut.pell", "swatch: cut.pell: It does not begin with an XML element"},
        {"swatch -o good.pell --blend wood.xml cut.xml",
         "swatch: cut.xml: Malformed XML: premature EOF"},
        {"swatch -o good.pell wood.xml",
         "swatch: wood.xml: texture 'wood.tga': --root is needed to find it"},
        {"swatch -o good.pell wood.xml --root root",
         "swatch: wood.xml: texture 'wood.tga': Couldn't open the specified file from disc: "
         "root/wood.tga"},
        {"swatch -o good.pell none.xml --root root",
         "swatch: none.xml: texture 'none.tga': The picture has no pixels"},
        {"swatch -o good.pell wood.xml --root root --log -error",
         "swatch: wood.xml: texture 'wood.tga': failed without a reason in the log"},
        {"--help >/dev/full", "standard output: No space left on device"},
        {"cat good.pell a >&-", "cat: standard output: Bad file descriptor"},
        // As good as a full disk.
        {"--version >/dev/null; ulimit -f 4; \"$PELLS\" pack -o good.pell noise",
         "pack: good.pell: File too large"},
    };
    scratch.write("in/sub/file", "x");
    scratch.write("noise/big", noise(100000));
    scratch.write("root/Data/images.xml", definitions(definition("a", "a.tga")));
    scratch.write("good.pell", archiveOf({{"a", "hello\n"}, {"big", std::string(3000000, 'x')}}));
    scratch.write("cut.pell", archiveWithDirectory("O99 L9 |a\r\n"));
    scratch.write("ended.pell", archiveOf({{"a", "some bytes"}}).substr(0, 39));
    ASSERT_EQ(readFile("ended.pell").substr(6, 8), "00000027");
    scratch.write("junk.pell", archiveWithDirectory("O15 L4 |a\r\n", "JUNK"));
    ASSERT_EQ(mkfifo("pipe", 0600), 0);
    scratch.write("cut.xml", "<material><shininess>5</shininess>");
    scratch.write("wood.xml", "<m><texname>wood.tga</texname></m>");
    scratch.write("none.xml", "<m><texname>none.tga</texname></m>");
    scratch.write("root/none.tga", tgaHeader(0, 9, 24));
    for (const auto& each : cases)
        expectFailure(each.first, each.second);
    const Outcome pipe = shell("set -o pipefail; \"$PELLS\" cat good.pell big | head -c1");
    EXPECT_EQ(pipe.status, 128 + 13) << "as any tool ends whose reader goes away";
    EXPECT_EQ(pipe.err, "");
}

TEST_F(ToolTest, TellsAMemberThatIsNotWhole) {
    const std::string stored = deflated(std::string(100000, 'x'));
    const std::string size = hexadecimal(stored.size());
    const std::pair<std::string, std::string> cases[] = {
        {"O15 L" + hexadecimal(stored.size() - 3), "The stored bytes end before the data does"},
        {"O15 L" + hexadecimal(stored.size() + 1), "More bytes are stored than the data has"},
        {"O15 Lffff", "More bytes are stored than the data has"}};
    for (const auto& each : cases) {
        scratch.write("a.pell", archiveWithDirectory(each.first + " |m\r\n", stored + "rest"));
        const Outcome outcome = pells("cat a.pell m");
        EXPECT_EQ(outcome.out, std::string(100000, 'x'));
        EXPECT_EQ(outcome.err, "pells: cat: a.pell: member 'm': " + each.second + "\n");
        EXPECT_EQ(outcome.status, 1);
    }
    const Outcome list = pells("list a.pell");
    EXPECT_EQ(list.out, "     65535  m\n");
    EXPECT_EQ(list.err, "pells: list: a.pell: 1 member of 1 reach beyond the end of the file\n");
}

TEST_F(ToolTest, TakesNamesAsTheyAreAndShowsThemHarmlessly) {
    for (const char* const name : {"root/a", "root/[b]", "root/[a,c]"})
        scratch.write(name, "x");
    const Outcome resolved = pells("resolve root '[a]' '[b]' '[a,c]' '' '%' a");
    EXPECT_EQ(resolved.out,
              "[a]: nowhere\n[b]: plain file root/[b], in no archive\n"
              "[a,c]: plain file root/[a,c], in no archive\n: nowhere\n%: nowhere\n"
              "a: plain file root/a, in no archive\n");
    const std::string names[] = {"\xC2\x9B", "\x9B",     "\xE2\x80\xAE", "\xEF\xBB\xBF",
                                 "\x7F",     "\xD0\x96", "\xE6\x97\xA5", "\xF0\x9F\x98\x80",
                                 "\xE9"};
    std::string directory;
    for (const std::string& name : names)
        directory += "O0 L0 |" + name + "\r\n";
    scratch.write("a.pell", archiveWithDirectory(directory));
    std::string shown = pells("list a.pell").out;
    for (std::size_t at; (at = shown.find("         0  ")) != std::string::npos;)
        shown.erase(at, 12);
    EXPECT_EQ(shown,
              "\\x7f\n\\x9b\n\\xc2\\x9b\n\xD0\x96\n\\xe2\\x80\\xae\n\xE6\x97\xA5\n\xE9\n"
              "\\xef\\xbb\\xbf\n\xF0\x9F\x98\x80\n");
}

TEST_F(ToolTest, LeavesTheLogAndTheInputOfOthersAlone) {
    scratch.write("pells.log", "of the application\n");
    scratch.write("good.pell", "");
    scratch.write("root/Data/images.xml", definitions(definition("a", "a.tga")));
    scratch.write("root/a.tga", tgaFile(2, 2, 24));
    scratch.write("in.xml", "<m><texname>a.tga</texname></m>");
    ASSERT_EQ(symlink("root/a.tga", "link.png"), 0);
    const std::pair<const char*, const char*> cases[] = {
        {"swatch in.xml --root root -o in.xml", "swatch: in.xml"},
        {"swatch in.xml --root root -o link.png", "swatch: link.png"},
        {"sheet root -o root/Data/images.xml", "sheet: root/Data/images.xml"},
        {"sheet root -o link.png", "sheet: link.png"}};
    for (const auto& each : cases)
        expectFailure(each.first, each.second + std::string(": It would replace what is read"));
    EXPECT_EQ(readFile("root/a.tga"), tgaFile(2, 2, 24));
    EXPECT_EQ(pells("resolve root none").status, 1);
    EXPECT_EQ(pells("sheet root -o sheet.png").err, "");
    EXPECT_EQ(readFile("pells.log"), "of the application\n");
    EXPECT_NE(pells("sheet root -o sheet.png --log time.summary").err.find("time.summary: "),
              std::string::npos);
    EXPECT_EQ(pells("sheet root -o sheet.png --log time.summary --log-file own.log").err, "");
    EXPECT_NE(readFile("own.log").find("time.summary: "), std::string::npos);
}

TEST_F(ToolTest, ReadsDocumentsAndPicturesUpToALimit) {
    scratch.write("large.xml", "<m>" + std::string(200000, ' ') + "</m>");
    scratch.write("root/Data/images.xml", definitions(definition("a", "a.tga")));
    scratch.write("root/a.tga", tgaFile(40, 40, 24));
    EXPECT_EQ(pells("swatch large.xml -o out.png --max-document 100K").err,
              "pells: swatch: large.xml: XML document goes on beyond byte 102403 (--max-document "
              "sets the limit)\n");
    EXPECT_EQ(pells("swatch large.xml -o out.png --max-document 1M").err, "");
    EXPECT_NE(pells("sheet root -o out.png --max-pixels 1599")
                  .out.find("a.tga: tga image too large (--max-pixels sets the limit)\n"),
              std::string::npos);
    EXPECT_EQ(pells("sheet root -o out.png --max-pixels 1600").out,
              "1 of 1 picture found, 0 of them by a fallback\n");
}

TEST_F(ToolTest, SpreadsManyPicturesOverPages) {
    std::string entries;
    for (int i = 1000; i < 1700; ++i)
        entries += definition(std::to_string(i), "a.tga");
    scratch.write("root/Data/images.xml", definitions(entries));
    scratch.write("root/a.tga", tgaFile(2, 2, 24));
    EXPECT_EQ(pells("sheet root -o sheet.png").out,
              "sheet-1.png: Pictures 1 to 530 of 700\n"
              "sheet-2.png: 700 of 700 pictures found, 0 of them by a fallback\n");
    EXPECT_EQ(files(), (Lines{"root", "sheet-1.png", "sheet-2.png"}));
    EXPECT_FALSE(decodePng("sheet-2.png").empty());
}

TEST_F(ToolTest, WritesAnArchiveToStandardOutput) {
    scratch.write("in/file", "x");
    EXPECT_EQ(pells("pack -o a.pell in && \"$PELLS\" pack -o - in | cmp - a.pell").status, 0);
    EXPECT_EQ(pells("pack -o ./- in").status, 0);
    EXPECT_EQ(files(), (Lines{"-", "a.pell", "in"}));
    EXPECT_EQ(pells("pack -o - in >/dev/full").err,
              "pells: pack: standard output: No space left on device\n");
}

TEST_F(ToolTest, KeepsTheOldOutputWhenItIsInterrupted) {
    scratch.write("out.pell", "old");
    // The sparse file takes longer than anybody waits.
    const Outcome interrupted = shell(R"(mkdir in; truncate -s 20G in/noise
        "$PELLS" pack -o out.pell in & job=$!
        for ((i = 0; i < 1000; i++)); do
            ls .pells-*.tmp >/dev/null 2>&1 && break
            sleep 0.01
        done
        ls .pells-*.tmp | wc -l
        kill -TERM $job
        wait $job)");
    EXPECT_EQ(interrupted.status, 128 + 15);
    EXPECT_EQ(interrupted.out, "1\n");
    EXPECT_EQ(files(), (Lines{"in", "out.pell"}));
    EXPECT_EQ(readFile("out.pell"), "old");
}

// The sample root with its archives and write times.
TEST_F(ToolTest, ResolvesAndDrawsTheSamples) {
    const Outcome prepared = shell(R"(set -e
        cp -r ')" PELLS_SAMPLES R"(/root' assets
        for name in textures maps patch; do
            "$PELLS" pack -o assets/$name.asset ')" PELLS_SAMPLES R"('/archives/$name
        done
        for name in rose flag; do
            "$PELLS" pack -o assets/Data/$name.pell ')" PELLS_SAMPLES R"('/pictures/$name
        done
        find assets -exec touch -d 2020-01-01 {} +
        touch -d 2020-02-01 assets/maps.asset assets/textures.asset
        touch -d 2020-03-01 assets/patch.asset
        touch -d 2020-04-01 assets/Textures/marble.tga)");
    ASSERT_EQ(prepared.status, 0) << prepared.err;
    const std::string badAsset =
        "pells: warning: Bad .asset file: assets/broken.asset: Input file not a pell file\n";
    const Outcome resolved = pells(
        "resolve assets Textures/brick.tga Textures/marble.tga Pictures/oak.tga Textures/rock.tga "
        "'Icons\\badge.tga' Data");
    EXPECT_EQ(resolved.status, 1);
    EXPECT_EQ(resolved.err, badAsset + "pells: resolve: assets: 2 names of 6 not found\n");
    EXPECT_EQ(resolved.out,
              "Textures/brick.tga: member Textures/brick.tga of assets/patch.asset, newer than "
              "assets/textures.asset\n"
              "Textures/marble.tga: plain file assets/Textures/marble.tga, newer than the copy in "
              "assets/textures.asset\n"
              "Pictures/oak.tga: alias of Textures/wood.tga, member Textures/wood.tga of "
              "assets/textures.asset\n"
              "Textures/rock.tga: nowhere\n"
              "Icons\\badge.tga: plain file assets/Icons/badge.tga, in no archive\n"
              "Data: nowhere\n");

    const Outcome drawn = pells("sheet assets -o sheet.png");
    EXPECT_EQ(drawn.err,
              badAsset +
                  "pells: warning: packed: TGAFileLoader Damaged/packed.tga: image type 10 is "
                  "run-length encoded: packets are read as pixels\n");
    for (const char* const part :
         {"glow: fell back to TGAFileLoader Icons/glow.tga\n"
          "  TGAFileLoader Damaged/cut.tga: tga file shorter than data\n"
          "  PellTGAFileLoader assets/Damaged/notes.pell: Can't read pell file: Input file not a "
          "pell file\n",
          "lost: not found\n"
          "  TGAFileLoader Textures/lost.tga: Couldn't open the specified file from disc: "
          "assets/Textures/lost.tga\n",
          "17 of 18 pictures found, 3 of them by a fallback\n"})
        EXPECT_NE(drawn.out.find(part), std::string::npos) << part << drawn.out;

    // The heart's 9 x 8 pixels are shown as squares of 19 x 19, its dark outline among them.
    const std::vector<std::uint32_t> pixels = decodePng("sheet.png");
    const auto heart = std::count(pixels.begin(), pixels.end(), 0x780A1EU);
    EXPECT_EQ(heart % std::ptrdiff_t{361}, 0);
    EXPECT_GT(heart, 0);
    // The plate of the badge, opaque and not scaled, is there in its own colour.
    EXPECT_GT(std::count(pixels.begin(), pixels.end(), 0x2364AAU), 5000);
}

// Whatever the pictures and their names are, there is a sheet that says how each of them fared.
TEST_F(ToolTest, DrawsWhatStrangersSend) {
    scratch.write("root/thin.tga", tgaHeader(1, 60000, 24) + std::string(180000, 'x'));
    scratch.write("root/empty.tga", tgaHeader(0, 5, 32));
    scratch.write("root/huge.tga", tgaHeader(65535, 65535, 32) + "x");
    scratch.write("root/mapped.tga", tgaHeader(2, 2, 8, 0, 1) + "abcd");
    scratch.write("root/damaged.asset", archiveWithDirectory("O15 L4 |bad.tga\r\n", "JUNK"));
    std::string entries = definition("\xFF\x1B[31m\xC3", "thin.tga") +
                          definition(std::string(100000, 'n'), std::string(3000, 'f'));
    for (const char* name : {"empty", "huge", "bad"})
        entries += definition(name, std::string(name) + ".tga");
    for (int i = 0; i < 300; ++i)
        entries += definition("many " + std::to_string(i), "mapped.tga");
    scratch.write("root/Data/images.xml", definitions(entries));

    const std::string out = pells("sheet root -o sheet.png").out;
    for (const char* part : {"\nhuge: not found\n  TGAFileLoader huge.tga: tga ",
                             "bad: not found\n  TGAFileLoader bad.tga: ",
                             "\n302 of 305 pictures found, 0 of them by a fallback\n"})
        EXPECT_NE(out.find(part), std::string::npos) << part;
    EXPECT_FALSE(decodePng("sheet.png").empty());
    const std::string silent = pells("sheet root -o sheet.png --log -error").out;
    EXPECT_NE(silent.find("huge.tga: failed without a reason in the log\n"), std::string::npos);
}

TEST_F(ToolTest, DrawsMaterialsTheirBlendAndTheCheckerboardBehindThem) {
    // Black but for the light that it gives off.
    const auto write = [this](const std::string& name, const std::string& emissive, char alpha) {
        scratch.write(name + ".xml", "<m><ambient r='0' g='0' b='0' a='1'/><emissive a='1' " +
                                         emissive + "/><diffuse r='0' g='0' b='0' a='" + alpha +
                                         "'/></m>");
    };
    write("red", "r='1' g='0' b='0'", '1');
    write("blue", "r='0' g='0' b='1'", '1');
    write("unseen", "r='0' g='0' b='0'", '0');
    EXPECT_EQ(pells("swatch -o out.png --blend red.xml blue.xml red.xml unseen.xml").err, "");
    const std::vector<std::uint32_t> pixels = decodePng("out.png");
    const auto spheres = [&pixels](std::uint32_t colour) {
        // A sphere of 196 pixels has 30172 of them, some at its edge.
        return std::count(pixels.begin(), pixels.end(), colour) / 29500;
    };
    EXPECT_EQ(spheres(0xFF0000), 2);
    EXPECT_EQ(spheres(0x0000FF), 1);
    EXPECT_EQ(spheres(0xFF00FF), 1);
    EXPECT_GT(std::count(pixels.begin(), pixels.end(), 0xD9DDE3), 20000) << "checkerboard";
}

// The texture's name may have any bytes, and the document may come from a pipe.
TEST_F(ToolTest, DrawsSampleMaterialsAndThoseOfStrangers) {
    scratch.write("odd.xml", "<m><texname>\xFF\x1B[31m.tga</texname></m>");
    scratch.write("root/\xFF\x1B[31m.tga", tgaHeader(2, 2, 24, 0, 10) + std::string(12, 'x'));
    const Outcome odd = pells("swatch <(cat odd.xml) --root root -o out.png");
    EXPECT_EQ(odd.err.substr(odd.err.find("texture")),
              "texture '\xFF\\x1b[31m.tga': image type 10 is run-length encoded: packets are read "
              "as pixels\n");
    EXPECT_EQ(odd.status, 0);
    const std::string samples =
        "'" PELLS_SAMPLES "'/materials/*.xml --root '" PELLS_SAMPLES "/root'";
    EXPECT_EQ(pells("swatch -o out.png --log asset " + samples).status, 0);
}

}  // namespace
