#include "pells/image/image_loaders.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

#include "pells/core/factory.h"
#include "pells/image/image_base.h"
#include "pells/image/image_fallback_manager.h"
#include "pells/xml/tag.h"
#include "support/archive_bytes.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

using pells::Image_base;
using pells::ImageFallbackManager;
using pells_test::archiveOf;
using pells_test::archiveWithDirectory;
using pells_test::tgaFile;

/// A loader of the application, which counts how many of them live.
class CountedLoader : public pells::TGAFileLoader {
public:
    CountedLoader() { ++alive; }
    ~CountedLoader() override { --alive; }
    static int alive;
};
int CountedLoader::alive = 0;
const pells::SerializableFactory<CountedLoader> countedLoaderFactory("CountedLoader");

/// An image that loads TGA assets.
class TgaImage : public Image_base {
public:
    explicit TgaImage(const std::string& name) : Image_base(name) { loadTarga(name); }
};

/// A stream that is cut off, and one that zlib refuses, under the name "tga".
const std::string unreachable = archiveWithDirectory("Offff L10 |tga\r\n");
const std::string damaged = archiveWithDirectory("O15 L4 |tga\r\n", "JUNK");

class ImageLoading : public pells_test::LibraryTest {
protected:
    ImageLoading() {
        pells_test::prefs() = {{"log", "error"}, {"assetLocation", scratch.path()}};
        scratch.write("good.pell", archiveOf({{"tga", tgaFile(2, 2, 24)}}));
        scratch.write("good.tga", tgaFile(2, 2, 32));
    }

    static bool logged(const std::string& line) {
        const std::vector<std::string> lines = pells_test::logLines();
        return std::find(lines.begin(), lines.end(), "error: " + line) != lines.end();
    }

    Image_base image{1, 1};
};

TEST_F(ImageLoading, ByNameReadsArchivesOnly) {
    const Image_base good("good.pell");
    EXPECT_EQ(good.getNumComponents(), 3);
    EXPECT_EQ(good.getFileName(), "") << "reading clears the image";

    const Image_base missing("no.such.pell");
    EXPECT_TRUE(missing.isBogusImage());
    EXPECT_EQ(missing.getFileName(), "no.such.pell");

    for (const char* const name : {"good.PELL", "good.tga", "dir.pell/file", "pell", ""}) {
        const Image_base other(name);
        EXPECT_FALSE(other.isValid()) << name;
        EXPECT_EQ(other.getFileName(), name);
    }
}

TEST_F(ImageLoading, ByDerivedClassesGivesThePictureOrTheSubstitute) {
    scratch.write("cut.tga", tgaFile(2, 2, 32).substr(0, 20));
    scratch.write("unreachable.asset", archiveWithDirectory("Offff L10 |far.tga\r\n"));
    scratch.write("damaged.asset", archiveWithDirectory("O15 L4 |bad.tga\r\n", "JUNK"));
    EXPECT_FALSE(TgaImage("good.tga").isBogusImage());
    for (const char* const name : {"cut.tga", "far.tga", "bad.tga", "missing.tga", ""}) {
        TgaImage substitute(name);
        EXPECT_TRUE(substitute.isBogusImage()) << name;
        EXPECT_EQ(substitute.getColorAsARGB(1, 1), 0xFF00FF00U) << name;
    }
    EXPECT_TRUE(logged("tga file shorter than data"));
    EXPECT_TRUE(logged(
        "Image(far.tga): Can't read image: Can't read pell data stream for member 'far.tga'"));
}

struct BadArchive {
    std::string bytes;  // "" for no file
    std::string line;
};

TEST_F(ImageLoading, FromArchivesSaysWhyItFailed) {
    const std::string prefix = "Image(bad.pell): Can't read pell file: ";
    const BadArchive archives[] = {
        {"", prefix + "Can't open pell file"},
        {unreachable, prefix + "Can't read pell data stream for member 'tga'"},
        {damaged, prefix + "std::exception error was thrown!!ZlibInflater::read(): bad pell data "
                           "stream for member 'tga': Z_DATA_ERROR (-3): incorrect header check"},
        {archiveOf({{"picture", "x"}}), "tga file shorter than header (0 bytes)"},
    };
    pells::PellTGAFileLoader loader("bad.pell");
    for (const BadArchive& each : archives) {
        if (!each.bytes.empty())
            scratch.write("bad.pell", each.bytes);
        EXPECT_FALSE(loader.uploadImage(&image)) << each.line;
        EXPECT_TRUE(logged(each.line)) << each.line;
    }
}

TEST_F(ImageLoading, NeedsANameAndAnImage) {
    EXPECT_FALSE(pells::TGAFileLoader().uploadImage(&image));
    EXPECT_FALSE(pells::PellTGAFileLoader(nullptr).uploadImage(&image));
    EXPECT_FALSE(pells::FileLoader("good.tga").uploadImage(&image));
    EXPECT_TRUE(image.isValid()) << "nothing touched it";
    EXPECT_FALSE(pells::TGAFileLoader("good.tga").uploadImage(nullptr));

    pells::PellTGAFileLoader loader("d.pell");
    loader.appendPathInfo("goo");
    EXPECT_TRUE(loader.uploadImage(&image));
    std::ostringstream out;
    pells::OutTag tag(out, "getter");
    loader.save(tag);
    EXPECT_EQ(out.str(), "<getter>\n    <text>good.pell</text>\n</getter>\n");
}

std::string getter(const std::string& loader, const std::string& file) {
    return "<getter class='" + loader + "'><text>" + file + "</text></getter>";
}

std::string entry(const std::string& name, const std::string& getters) {
    return "<imageEntry><getters>" + getters + "</getters><name>" + name + "</name></imageEntry>";
}

std::string definitions(const std::string& entries) {
    return "<imagedefs><imageEntries>" + entries + "</imageEntries></imagedefs>";
}

TEST_F(ImageLoading, ThroughTheManagerTriesTheLoadersInOrder) {
    const std::string counted = getter("CountedLoader", "missing.tga");
    scratch.write("Data/images.xml",
                  definitions(entry("wall", counted) + entry("empty", "") +
                              "<imageEntry><name>bare</name></imageEntry>" +
                              entry("wall", getter("TGAFileLoader", "missing.tga") +
                                                getter("PellTGAFileLoader", "good.pell")) +
                              entry("lost", counted + counted) +
                              entry("tga", getter("TGAFileLoader", "good.tga"))));
    ImageFallbackManager& manager = ImageFallbackManager::instance();
    EXPECT_EQ(manager.getImageNames(), (std::vector<std::string>{"lost", "tga", "wall"}));
    EXPECT_EQ(manager.getLoaders("wall").size(), 2U);
    EXPECT_TRUE(manager.getLoaders("empty").empty());

    EXPECT_EQ(manager.getFallbackImage(&image, "wall", 0), ImageFallbackManager::LOADER_FAILED);
    EXPECT_EQ(manager.getFallbackImage(&image, "wall", 1), ImageFallbackManager::FILLED);
    EXPECT_EQ(manager.getFallbackImage(&image, "wall", 2), ImageFallbackManager::NO_MORE_LOADERS);
    EXPECT_EQ(manager.setupNewImage(&image, "tga"), ImageFallbackManager::FILLED);
    EXPECT_EQ(image.getNumComponents(), 4);
    EXPECT_EQ(manager.setupNewImage(&image, "wall"), ImageFallbackManager::FILLED);
    EXPECT_EQ(image.getNumComponents(), 3);
    EXPECT_EQ(manager.setupNewImage(&image, "lost"), ImageFallbackManager::NO_MORE_LOADERS);
    for (const char* const name : {"Wall", "empty", "bare"})
        EXPECT_EQ(manager.setupNewImage(&image, name), ImageFallbackManager::NO_SUCH_NAME) << name;

    EXPECT_EQ(CountedLoader::alive, 3) << "the replaced entry's loader is kept, too";
    pells::SingletonList::freeSingletons();
    EXPECT_EQ(CountedLoader::alive, 0);
}

struct BadDefinitions {
    std::string document;  // "" for no file
    std::string line;
    bool throws;
};

TEST_F(ImageLoading, DefinitionsThatCannotBeReadLeaveNothingBehind) {
    const std::string good = entry("wall", getter("CountedLoader", "good.tga"));
    const std::string constructor = "ImageFallbackManager:Constructor for ImageFallbackManager ";
    const std::string format =
        constructor + "opened an XML file that did not have the correct 'imagedefs' format.";
    const BadDefinitions documents[] = {
        {"", constructor + "could not find the XML file 'images.xml'.", false},
        {"<images>" + good + "</images>", format, false},
        {"imagedefs", format, false},
        {"</imagedefs>", format, false},
        {"<imagedefs/>", "LoadFail: Malformed XML: premature EOF", true},
        {definitions(good).substr(0, 120), "LoadFail: Malformed XML: premature EOF", true},
        {definitions(good + entry("x", getter("CountedLoader", "") + "</text>")),
         "LoadFail: Malformed XML: bad close tag", true},
        {definitions(good + entry("x", getter("NoLoader", ""))),
         "LoadFail: Bad class='NoLoader' in element <getter>", true},
    };
    for (const BadDefinitions& each : documents) {
        SCOPED_TRACE(each.document);
        if (!each.document.empty())
            scratch.write("Data/images.xml", each.document);
        if (each.throws) {
            EXPECT_THROW(ImageFallbackManager::instance(), pells::Serializable::LoadFail);
            EXPECT_FALSE(ImageFallbackManager::singleton);
        } else {
            EXPECT_EQ(ImageFallbackManager::instance().setupNewImage(&image, "wall"), 3);
        }
        EXPECT_EQ(CountedLoader::alive, 0);
        EXPECT_TRUE(logged(each.line));
        pells::SingletonList::freeSingletons();
    }
}

}  // namespace
