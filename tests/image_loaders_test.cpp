#include "pells/image/image_loaders.h"

#include <chrono>
#include <cstdio>
#include <thread>

#include "pells/core/factory.h"
#include "pells/image/image_base.h"
#include "pells/image/image_fallback_manager.h"
#include "support/archive_bytes.h"
#include "support/documents.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

using namespace pells;
using namespace pells_test;

/// A loader of the application, which counts how many of them live.
struct CountedLoader : TGAFileLoader {
    CountedLoader() { ++alive; }
    ~CountedLoader() override { --alive; }
    static inline int alive = 0;
};
const SerializableFactory<CountedLoader> countedLoaderFactory("CountedLoader");

/// An image that loads TGA assets.
struct TgaImage : Image_base {
    explicit TgaImage(const std::string& name) : Image_base(name) { loadTarga(name); }
};

class ImageLoading : public LibraryTest {
protected:
    ImageLoading() {
        prefs() = {{"log", "error"}, {"assetLocation", "."}};
        scratch.write("good.pell", archiveOf({{"tga", tgaFile(2, 2, 24)}}));
        scratch.write("good.tga", tgaFile(2, 2, 32));
        scratch.write("cut.asset",
                      archiveWithDirectory("Offff L10 |far.tga\r\nOffff L10 |tga\r\n"));
        scratch.write("bad.asset",
                      archiveWithDirectory("O15 L4 |bad.tga\r\nO15 L4 |tga\r\n", "JUNK"));
    }

    static bool logged(const std::string& line) { return !logLines("error: " + line).empty(); }

    Image_base image{1, 1};
};

TEST_F(ImageLoading, ByNameReadsArchivesOnly) {
    const Image_base good("good.pell");
    EXPECT_EQ(good.getNumComponents(), 3);
    EXPECT_EQ(good.getFileName(), "") << "reading clears the image";
    const Image_base missing("no.such.pell");
    EXPECT_TRUE(missing.isBogusImage());
    EXPECT_EQ(missing.getFileName(), "no.such.pell");
    for (const char* const name : {"good.PELL", "good.tga", "dir.pell/file"}) {
        const Image_base other(name);
        EXPECT_FALSE(other.isValid()) << name;
        EXPECT_EQ(other.getFileName(), name);
    }
}

TEST_F(ImageLoading, ByDerivedClassesGivesThePictureOrTheSubstitute) {
    scratch.write("cut.tga", tgaFile(2, 2, 32).substr(0, 20));
    EXPECT_FALSE(TgaImage("good.tga").isBogusImage());
    for (const char* const name : {"cut.tga", "far.tga", "bad.tga", "missing.tga"})
        EXPECT_TRUE(TgaImage(name).isBogusImage()) << name;
    EXPECT_TRUE(logged(
        "Image(far.tga): Can't read image: Can't read pell data stream for member 'far.tga'"));
    EXPECT_FALSE(logged("Image(bad.tga)")) << "zlib logged its error itself";
}

// What is remembered of a file that is old enough serves for just that file in that state.
TEST_F(ImageLoading, FromAnArchiveAgainAndAgainSeesEveryChange) {
    const auto archive = [](int width, const std::string& member = "tga") {
        return archiveOf(
            {{"before", noise(static_cast<std::size_t>(width))}, {member, tgaFile(width, 1, 24)}});
    };
    const auto widthNow = [this] {
        return PellTGAFileLoader("a.pell").uploadImage(&image) ? image.getWidth() : 0;
    };
    const auto expectRepeatedly = [&](int width) {
        EXPECT_EQ(widthNow(), width);
        std::this_thread::sleep_for(std::chrono::seconds(4));
        for (int i = 0; i < 3; ++i)
            EXPECT_EQ(widthNow(), width);
    };
    scratch.write("a.pell", archive(11));
    expectRepeatedly(11);
    scratch.write("new.pell", archive(12));
    std::rename("new.pell", "a.pell");
    EXPECT_EQ(widthNow(), 12);
    scratch.write("a.pell", archive(13, "xyz"));
    expectRepeatedly(0);
    EXPECT_TRUE(logged("tga file shorter than header (0 bytes)"));
    std::remove("a.pell");
    EXPECT_EQ(widthNow(), 0);
    EXPECT_TRUE(logged("Image(a.pell): Can't read pell file: Can't open pell file"));
}

TEST_F(ImageLoading, FromArchivesSaysWhyItFailed) {
    const std::pair<std::string, std::string> archives[] = {
        {"missing.pell", "Can't open pell file"},
        {"cut.asset", "Can't read pell data stream for member 'tga'"},
        {"bad.asset",
         "std::exception error was thrown!!ZlibInflater::read(): bad pell data stream "
         "for member 'tga': Z_DATA_ERROR (-3): incorrect header check"},
    };
    for (const auto& each : archives) {
        EXPECT_FALSE(PellTGAFileLoader(each.first.c_str()).uploadImage(&image)) << each.first;
        EXPECT_TRUE(logged("Image(" + each.first + "): Can't read pell file: " + each.second))
            << each.second;
    }
}

TEST_F(ImageLoading, NeedsANameAndAnImage) {
    EXPECT_FALSE(TGAFileLoader().uploadImage(&image));
    EXPECT_FALSE(PellTGAFileLoader(nullptr).uploadImage(&image));
    EXPECT_FALSE(TGAFileLoader("good.tga").uploadImage(nullptr));
    EXPECT_FALSE(PellTGAFileLoader("good.pell").uploadImage(nullptr));
    EXPECT_TRUE(image.isValid()) << "nothing touched it";
    PellTGAFileLoader loader("d.pell");
    loader.appendPathInfo("goo");
    EXPECT_TRUE(loader.uploadImage(&image));
    EXPECT_EQ(compact(saved(loader)), "<root><text>good.pell</text></root>");
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
                              entry("wall", getter("TGAFileLoader", "missing.tga") +
                                                getter("PellTGAFileLoader", "good.pell")) +
                              entry("lost", counted + counted) +
                              entry("tga", getter("TGAFileLoader", "good.tga"))));
    ImageFallbackManager& manager = ImageFallbackManager::instance();
    EXPECT_EQ(manager.getImageNames(), (Lines{"lost", "tga", "wall"}));
    EXPECT_EQ(manager.getLoaders("wall").size(), 2U);
    EXPECT_TRUE(manager.getLoaders("empty").empty());
    EXPECT_EQ(manager.getFallbackImage(&image, "wall", 0), ImageFallbackManager::LOADER_FAILED);
    EXPECT_EQ(manager.getFallbackImage(&image, "wall", 2), ImageFallbackManager::NO_MORE_LOADERS);
    EXPECT_EQ(manager.setupNewImage(&image, "wall"), ImageFallbackManager::FILLED);
    EXPECT_EQ(image.getNumComponents(), 3);
    EXPECT_EQ(manager.setupNewImage(&image, "tga"), ImageFallbackManager::FILLED);
    EXPECT_EQ(image.getNumComponents(), 4);
    EXPECT_EQ(manager.setupNewImage(&image, "lost"), ImageFallbackManager::NO_MORE_LOADERS);
    for (const char* const name : {"Wall", "empty"})
        EXPECT_EQ(manager.setupNewImage(&image, name), ImageFallbackManager::NO_SUCH_NAME) << name;

    EXPECT_EQ(CountedLoader::alive, 3) << "the replaced entry's loader is kept, too";
    SingletonList::freeSingletons();
    EXPECT_EQ(CountedLoader::alive, 0);
}

TEST_F(ImageLoading, DefinitionsThatCannotBeReadLeaveNothingBehind) {
    const std::string good = entry("wall", getter("CountedLoader", "good.tga"));
    const std::string constructor = "ImageFallbackManager:Constructor for ImageFallbackManager ";
    const std::string format =
        constructor + "opened an XML file that did not have the correct 'imagedefs' format.";
    EXPECT_EQ(ImageFallbackManager::instance().setupNewImage(&image, "wall"), 3);
    EXPECT_TRUE(logged(constructor + "could not find the XML file 'images.xml'."));
    for (const std::string& wrong : {"<images>" + good + "</images>", std::string("imagedefs")}) {
        SingletonList::freeSingletons();
        scratch.write("Data/images.xml", wrong);
        EXPECT_EQ(ImageFallbackManager::instance().setupNewImage(&image, "wall"), 3);
        EXPECT_TRUE(logged(format)) << wrong;
    }
    for (const std::string& damaged :
         {std::string("<imagedefs/>"), definitions(good + entry("x", getter("NoLoader", "")))}) {
        SingletonList::freeSingletons();
        scratch.write("Data/images.xml", damaged);
        EXPECT_THROW(ImageFallbackManager::instance(), Serializable::LoadFail) << damaged;
        EXPECT_FALSE(ImageFallbackManager::singleton);
        EXPECT_EQ(CountedLoader::alive, 0);
    }
}

struct PlacelessLoader : pells::ImageLoaderBase {
    bool uploadImage(pells::Image_base* /*image*/) override { return true; }
};

TEST(ImageLoaders, WithoutAPlaceIgnoreWhereItBegins) {
    pells::Image_base image(1, 1);
    PlacelessLoader placeless;
    placeless.appendPathInfo("folder/");
    EXPECT_TRUE(placeless.uploadImage(&image));
    pells::FileLoader file("name");
    file.appendPathInfo("folder/");
    EXPECT_EQ(file.getFileName(), "folder/name");
    EXPECT_FALSE(file.uploadImage(&image));
}

}  // namespace
