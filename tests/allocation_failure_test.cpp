// Memory that runs out, at every allocation in turn.

#include <gtest/gtest.h>

#include <functional>
#include <iterator>
#include <new>
#include <sstream>

#include "pells/image/image_base.h"
#include "pells/image/image_fallback_manager.h"
#include "pells/image/image_loaders.h"
#include "support/allocations.h"
#include "support/asset_root.h"
#include "support/everything.h"
#include "support/tga_file.h"

namespace {

const char document[] =
    "<root><f>2.5</f><s>text longer than a short string</s><c r='0.5'/>"
    "<material><texname>Textures/some/long/name.tga</texname></material>"
    "<history><stack><stackItem class='CountingStep'><label>the first of two "
    "steps</label></stackItem>"
    "<stackItem class='CountingStep'/></stack></history><child class='Everything'><i>2</i></child>"
    "<matrices><matrice><matriceItem>1</matriceItem></matrice></matrices></root>";

class AllocationFailure : public pells_test::AssetRootTest {
protected:
    typedef std::function<std::string()> Work;

    /// Does a piece of work again and again, each time with a later allocation that fails, until it
    /// needs no more of them. It gives its result, or throws, and works when it is done once more.
    static void expectRecovery(const Work& work) {
        const std::string wanted = work();
        bool failed = true;
        for (std::int64_t at = 0; failed; ++at) {
            pells::SingletonList::freeSingletons();
            std::string result = "";
            {
                const pells_test::AllocationMeter meter(at);
                try {
                    result = work();
                } catch (const std::exception&) {
                }
                failed = meter.count() > at;
            }
            EXPECT_TRUE(result.empty() || result == wanted)
                << "allocation " << at << ": " << result;
            EXPECT_EQ(work(), wanted) << "after allocation " << at;
        }
    }
};

TEST_F(AllocationFailure, WhileADocumentLoads) {
    expectRecovery([] {
        pells_test::Everything object;
        pells_test::load(object, document);
        EXPECT_EQ(object.history.getUndoStackSize(), 2);
        EXPECT_EQ(object.matrices.size(), 1u);
        return pells_test::saved(object);
    });
}

TEST_F(AllocationFailure, WhileAnArchiveOpensAndIsRead) {
    const std::string path = scratch.write(
        "a.pell", pells_test::archiveOf({{"some/folder/and/name", std::string(5000, 'x')}}));
    expectRecovery([&path] {
        pells::pellistream archive(path);
        archive.open("some/folder/and/name");
        return std::string(std::istreambuf_iterator<char>(archive),
                           std::istreambuf_iterator<char>());
    });
}

TEST_F(AllocationFailure, WhileAPictureIsRead) {
    for (const int depth : {8, 24, 32}) {
        const std::string file = pells_test::tgaFile(70, 50, depth);
        expectRecovery([&file] {
            pells::Image_base image(1, 1);
            std::istringstream in(file);
            if (!pells::TGAFileLoader::loadTarga(&image, in))
                return std::string();
            return std::string(reinterpret_cast<const char*>(image.getData()),
                               std::size_t(70 * 50 * image.getNumComponents()));
        });
    }
}

TEST_F(AllocationFailure, WhileTheManagersAreMade) {
    writeArchive("a.asset", {{"Textures/.symlinks", "the second name.tga>wood.tga\n"},
                             {"Textures/wood.tga", pells_test::tgaFile(2, 2, 24)}});
    write("Data/images.xml",
          "<imagedefs><imageEntries><imageEntry><name>an image of the table</name><getters>"
          "<getter class='TGAFileLoader'><text>Textures/the second name.tga</text></getter>"
          "</getters></imageEntry></imageEntries></imagedefs>");
    expectRecovery([] {
        pells::Image_base image(1, 1);
        auto& table = pells::ImageFallbackManager::instance();
        if (table.setupNewImage(&image, "an image of the table") != table.FILLED)
            return std::string();
        return "filled with " + std::to_string(image.getWidth()) + " columns";
    });
}

}  // namespace
