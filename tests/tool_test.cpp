#include <gtest/gtest.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "support/tool_runs.h"
#include "tools/archive_writer.h"

namespace {

namespace fs = boost::filesystem;
using pells_test::decodePng;
using pells_test::Outcome;
using pells_test::readFile;
using pells_test::tga;

class ToolTest : public pells_test::ToolRuns {
protected:
    /// An archive of members "a" and "dir/b c".
    void writeArchive(const std::string& path) {
        pells::ArchiveWriter archive(path);
        archive.add("dir/b c", std::string(1000, 'x'));
        archive.add("a", "hello\n");
        archive.finish();
    }

    /// The sample root below the current folder, with its archives and write times.
    void prepareSamples() {
        const Outcome outcome = shell(R"(set -e
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
        ASSERT_EQ(outcome.status, 0) << outcome.err;
    }
};

TEST_F(ToolTest, PacksListsAndPrints) {
    scratch.write("in/.symlinks", "b>a\n");
    scratch.write("in/sub/zero", std::string("\0\r\n", 3));
    EXPECT_EQ(pells("pack -o one.pell in").status, 0);
    EXPECT_EQ(pells("pack in/ --output two.pell").out, "");
    EXPECT_EQ(readFile("one.pell"), readFile("two.pell"));
    EXPECT_EQ(pells("list one.pell").out, "        12  .symlinks\n        11  sub/zero\n");
    EXPECT_EQ(pells("cat one.pell sub/zero").out, std::string("\0\r\n", 3));
    EXPECT_EQ(pells("cat one.pell 'sub\\zero'").out, std::string("\0\r\n", 3));
    EXPECT_EQ(pells("--version").out.substr(0, 6), "pells ");
    EXPECT_NE(pells("sheet --help").out.find("--output"), std::string::npos);
}

struct Failing {
    const char* arguments;
    int status;
    const char* err;
};

// One line that says what, where and why; nothing on standard output; no file made or changed.
TEST_F(ToolTest, FailsWithOneLineAndLeavesNothing) {
    const Failing cases[] = {
        {"", 2, "pells: A subcommand is required (see --help)"},
        {"frob", 2, "pells: unknown command 'frob' (see --help)"},
        {"--frob", 2, "pells: unknown option '--frob' (see --help)"},
        {"pack in", 2, "pells: pack: --output is required (see --help)"},
        {"pack -o out.pell", 2, "pells: pack: DIR is required (see --help)"},
        {"list good.pell x", 2,
         "pells: list: The following argument was not expected: x (see --help)"},
        {"sheet root --frob", 2, "pells: sheet: --output is required (see --help)"},
        {"resolve root", 2, "pells: resolve: NAME is required (see --help)"},
        {"pack -o out.pell missing", 1, "pells: pack: missing: No such file or directory"},
        {"pack -o out.pell text", 1, "pells: pack: text: Not a directory"},
        {"pack -o missing/out.pell in", 1,
         "pells: pack: missing/out.pell: No such file or directory"},
        {"pack -o in in", 1, "pells: pack: in: Is a directory"},
        {"pack -o in/out.pell in", 1,
         "pells: pack: in/out.pell: The archive would lie in the folder that it packs"},
        {"pack -o good.pell unpackable", 1,
         "pells: pack: good.pell: member 'a\\x0ab': the name has a line break, which ends a "
         "directory entry"},
        {"list missing.pell", 1, "pells: list: missing.pell: Can't open pell file"},
        {"list text", 1, "pells: list: text: Pell file too short for stamp"},
        {"cat good.pell nope", 1, "pells: cat: good.pell: The archive has no member 'nope'"},
        {"cat cut.pell a", 1,
         "pells: cat: cut.pell: member 'a': Can't read pell data stream for member 'a'"},
        {"resolve missing a", 1, "pells: resolve: missing: No such file or directory"},
        {"resolve text a", 1, "pells: resolve: text: Not a directory"},
        {"sheet root -o missing/s.png", 1,
         "pells: sheet: missing/s.png: No such file or directory"},
        {"sheet root -o /dev/null", 1, "pells: sheet: /dev/null: Not a regular file"},
        {"sheet in -o good.pell", 1,
         "pells: sheet: asset Data/images.xml: Couldn't open the specified file from disc: "
         "in/Data/images.xml"},
        {"sheet wrong -o good.pell", 1,
         "pells: sheet: asset Data/images.xml: ImageFallbackManager:Constructor for "
         "ImageFallbackManager opened an XML file that did not have the correct 'imagedefs' "
         "format."},
        {"sheet malformed -o good.pell", 1,
         "pells: sheet: asset Data/images.xml: Malformed XML: premature EOF"},
    };
    scratch.write("text", "text");
    scratch.write("in/sub/file", "x");
    scratch.write("unpackable/a\nb", "x");
    scratch.write("wrong/Data/images.xml", "<images></images>");
    scratch.write("malformed/Data/images.xml", "<imagedefs/>");
    scratch.write("root/Data/images.xml",
                  "<imagedefs><imageEntries><imageEntry><name>a</name><getters><getter "
                  "class=\"TGAFileLoader\"><text>a.tga</text></getter></getters></imageEntry>"
                  "</imageEntries></imagedefs>");
    writeArchive("good.pell");
    const std::string good = readFile("good.pell");
    scratch.write("cut.pell", "PELLS 00000015v1.0\r\n\x1aO99 L9 |a\r\n");
    const std::vector<std::string> before = files();
    for (const Failing& each : cases) {
        const Outcome outcome = pells(each.arguments);
        EXPECT_EQ(outcome.status, each.status) << each.arguments;
        EXPECT_EQ(outcome.err, std::string(each.err) + "\n") << each.arguments;
        EXPECT_EQ(outcome.out, "") << each.arguments;
        EXPECT_EQ(files(), before) << each.arguments;
        EXPECT_EQ(readFile("good.pell"), good) << each.arguments;
    }
}

TEST_F(ToolTest, ReportsOutputThatCannotBeWritten) {
    writeArchive("good.pell");
    scratch.write("noise/big", std::string(3000000, 'x'));
    pells("pack -o big.pell noise");
    const char full[] = "standard output: No space left on device\n";
    for (const std::string arguments : {"list good.pell", "cat good.pell a"}) {
        const Outcome outcome = pells(arguments + " >/dev/full");
        EXPECT_EQ(outcome.status, 1) << arguments;
        EXPECT_EQ(outcome.err, "pells: " + arguments.substr(0, arguments.find(' ')) + ": " + full);
    }
    EXPECT_EQ(pells("--help >/dev/full").err, std::string("pells: ") + full);
    const Outcome closed = pells("cat good.pell a >&-");
    EXPECT_EQ(closed.status, 1);
    EXPECT_EQ(closed.err, "pells: cat: standard output: Bad file descriptor\n");
    const Outcome pipe = shell("set -o pipefail; \"$PELLS\" cat big.pell big | head -c1");
    EXPECT_EQ(pipe.status, 1);
    EXPECT_EQ(pipe.err, "pells: cat: standard output: Broken pipe\n");
}

TEST_F(ToolTest, KeepsTheOldOutputWhenTheNewOneFails) {
    scratch.write("out.pell", "old");
    scratch.write("in/text", "x");
    const std::vector<std::string> before = {"in", "out.pell"};
    // A file may have 4096 bytes, which is as good as a full disk.
    const Outcome tooLarge =
        shell("head -c 100000 /dev/urandom >in/noise; ulimit -f 4; \"$PELLS\" pack -o out.pell in");
    EXPECT_EQ(tooLarge.status, 1);
    EXPECT_EQ(tooLarge.err, "pells: pack: out.pell: File too large\n");
    EXPECT_EQ(files(), before);
    // Interrupted while it is at work: the sparse file takes longer than anybody waits.
    const Outcome interrupted = shell(R"(truncate -s 20G in/noise
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
    EXPECT_EQ(files(), before);
    EXPECT_EQ(readFile("out.pell"), "old");

    prepareSamples();
    scratch.write("sheet.png", "old");
    EXPECT_EQ(pells("sheet assets -o sheet.png >/dev/full").status, 1);
    EXPECT_EQ(readFile("sheet.png"), "old");
}

TEST_F(ToolTest, ResolvesNamesToWhatServesThem) {
    prepareSamples();
    const Outcome outcome = pells(
        "resolve assets Textures/wood.tga Textures/brick.tga Textures/marble.tga Maps/height.tga "
        "Pictures/oak.tga Textures/rock.tga 'Icons\\badge.tga' Data");
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.err,
              "pells: warning: Bad .asset file: assets/broken.asset: Input file not a pell file\n"
              "pells: resolve: assets: 2 names of 8 not found\n");
    EXPECT_EQ(outcome.out,
              "Textures/wood.tga: member Textures/wood.tga of assets/textures.asset\n"
              "Textures/brick.tga: member Textures/brick.tga of assets/patch.asset, newer than "
              "assets/textures.asset\n"
              "Textures/marble.tga: plain file assets/Textures/marble.tga, newer than the copy in "
              "assets/textures.asset\n"
              "Maps/height.tga: member Maps/height.tga of assets/maps.asset\n"
              "Pictures/oak.tga: alias of Textures/wood.tga, member Textures/wood.tga of "
              "assets/textures.asset\n"
              "Textures/rock.tga: nowhere\n"
              "Icons\\badge.tga: plain file assets/Icons/badge.tga, in no archive\n"
              "Data: nowhere\n");

    fs::last_write_time("assets/patch.asset", fs::last_write_time("assets/textures.asset"));
    const Outcome tie = pells("resolve assets Textures/brick.tga");
    EXPECT_EQ(tie.status, 0);
    EXPECT_NE(tie.out.find("(equal write times: the archive that the folder lists first)"),
              std::string::npos)
        << tie.out;
}

TEST_F(ToolTest, DrawsTheSampleSheet) {
    prepareSamples();
    const Outcome outcome = pells("sheet assets -o sheet.png --log time.summary");
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.err,
              "pells: warning: Bad .asset file: assets/broken.asset: Input file not a pell file\n"
              "pells: warning: packed: TGAFileLoader Damaged/packed.tga: image type 10 is "
              "run-length encoded: packets are read as pixels\n");
    EXPECT_EQ(outcome.out,
              "flag: fell back to PellTGAFileLoader assets/Data/flag.pell\n"
              "  PellTGAFileLoader assets/Data/missing.pell: Can't read pell file: Can't open pell "
              "file\n"
              "glow: fell back to TGAFileLoader Icons/glow.tga\n"
              "  TGAFileLoader Damaged/cut.tga: tga file shorter than data\n"
              "  PellTGAFileLoader assets/Damaged/notes.pell: Can't read pell file: Input file not "
              "a pell file\n"
              "lost: not found\n"
              "  TGAFileLoader Textures/lost.tga: Couldn't open the specified file from disc: "
              "assets/Textures/lost.tga\n"
              "  TGAFileLoader Damaged/cut.tga: tga file shorter than data\n"
              "rose: fell back to PellTGAFileLoader assets/Data/rose.pell\n"
              "  TGAFileLoader Textures/rose.tga: Couldn't open the specified file from disc: "
              "assets/Textures/rose.tga\n"
              "17 of 18 pictures found, 3 of them by a fallback\n");
    EXPECT_NE(readFile("pells.log").find("\ntime.summary: Category"), std::string::npos);

    // The heart's 9 x 8 pixels are shown as squares of 19 x 19, its dark outline among them.
    unsigned width = 0;
    const std::vector<std::uint32_t> pixels = decodePng("sheet.png", width);
    const auto heart = std::count(pixels.begin(), pixels.end(), 0x780A1EU);
    EXPECT_EQ(heart % std::ptrdiff_t{361}, 0);
    EXPECT_GT(heart, 0);
    // The plate of the badge, opaque and not scaled, is there in its own colour.
    EXPECT_GT(std::count(pixels.begin(), pixels.end(), 0x2364AAU), 5000);
}

// Whatever the pictures and their names are, there is a sheet that says how each of them fared.
TEST_F(ToolTest, DrawsWhatStrangersSend) {
    scratch.write("root/thin.tga", tga(2, 1, 60000, 24, std::string(180000, 'x')));
    scratch.write("root/wide.tga", tga(3, 60000, 2, 8, std::string(120000, 'x')));
    scratch.write("root/empty.tga", tga(2, 0, 5, 32, ""));
    scratch.write("root/huge.tga", tga(2, 65535, 65535, 32, "x"));
    scratch.write("root/mapped.tga", tga(1, 2, 2, 8, "abcd"));
    {
        pells::ArchiveWriter archive("root/damaged.asset");
        archive.add("bad.tga", tga(2, 9, 9, 24, std::string(243, 'x')));
        archive.finish();
        std::string bytes = readFile("root/damaged.asset");
        bytes[24] = static_cast<char>(bytes[24] ^ 0x7F);
        scratch.write("root/damaged.asset", bytes);
    }
    std::string entries;
    const auto define = [&](const std::string& name, const std::string& file) {
        entries += "<imageEntry><name>" + name +
                   "</name><getters><getter class=\"TGAFileLoader\"><text>" + file +
                   "</text></getter></getters></imageEntry>\n";
    };
    for (const char* name : {"thin", "wide", "empty", "huge", "mapped", "bad"})
        define(name, std::string(name) + ".tga");
    define("\xFF\x1B[31m\xC3", "thin.tga");
    define(std::string(100000, 'n'), std::string(3000, 'f'));
    for (int i = 0; i < 300; ++i)
        define("many " + std::to_string(i), "mapped.tga");
    scratch.write("root/Data/images.xml",
                  "<imagedefs><imageEntries>" + entries + "</imageEntries></imagedefs>");

    const Outcome outcome = pells("sheet root -o sheet.png");
    EXPECT_EQ(outcome.status, 0);
    EXPECT_NE(outcome.out.find("\nhuge: not found\n  TGAFileLoader huge.tga: tga "),
              std::string::npos);
    EXPECT_NE(outcome.out.find("bad: not found\n  TGAFileLoader bad.tga: "), std::string::npos);
    EXPECT_NE(outcome.out.find("\n305 of 308 pictures found, 0 of them by a fallback\n"),
              std::string::npos);
    EXPECT_NE(outcome.err.find("pells: warning: mapped: TGAFileLoader mapped.tga: image type 1 is "
                               "colour-mapped: indexes are read as pixels\n"),
              std::string::npos);
    unsigned width = 0;
    EXPECT_FALSE(decodePng("sheet.png", width).empty());
    // Silence in the log takes the reasons away, and nothing else.
    const Outcome silent = pells("sheet root -o sheet.png --log -error");
    EXPECT_EQ(silent.status, 0);
    EXPECT_NE(silent.out.find("\nhuge: not found\n  TGAFileLoader huge.tga: failed without a "
                              "reason in the log\n"),
              std::string::npos);
}

}  // namespace
