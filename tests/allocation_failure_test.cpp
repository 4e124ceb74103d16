// Memory that runs out, at every allocation in turn, in whatever reads, saves, logs, times, undoes
// or frees.

#include <gtest/gtest.h>

#include <functional>
#include <iterator>
#include <new>
#include <sstream>

#include "pells/image/image_base.h"
#include "pells/image/image_fallback_manager.h"
#include "pells/image/image_loaders.h"
#include "pells/timing/performance.h"
#include "support/allocations.h"
#include "support/asset_root.h"
#include "support/debugger_text.h"
#include "support/everything.h"
#include "support/tga_file.h"

namespace {

using namespace pells_test;

const char document[] =
    "<root><f>2.5</f><s>text longer than a short string</s><c r='0.5'/>"
    "<material><texname>Textures/some/long/name.tga</texname></material>"
    "<history><stack><stackItem class='CountingStep'><label>the first of two "
    "steps</label></stackItem>"
    "<stackItem class='CountingStep'/></stack></history><child class='Everything'><i>2</i></child>"
    "<unknown><element/></unknown>"
    "<matrices><matrice><matriceItem>1</matriceItem></matrice></matrices></root>";

std::string loadAndSave() {
    Everything object;
    load(object, document);
    EXPECT_EQ(object.history.getUndoStackSize(), 2);
    EXPECT_EQ(object.matrices.size(), 1u);
    return saved(object);
}

std::string failToLoad() {
    Everything object;
    return failure(object, "<root><f>1</f><words><word>some words of a text</word></root>");
}

std::string readAnArchive() {
    pells::pellistream archive("a.pell");
    archive.open("some/folder/and/name");
    return std::string(std::istreambuf_iterator<char>(archive), std::istreambuf_iterator<char>());
}

std::string readADamagedArchive() {
    pells::pellistream archive("bad.pell");
    archive.open("name");
    try {
        archive.get();
    } catch (const pells::ZlibWrapper::ZlibError&) {
        return "damaged";
    }
    return "";
}

std::string readPictures() {
    std::string pixels;
    for (const int depth : {8, 24, 32}) {
        std::istringstream in(tgaFile(70, 50, depth));
        pells::Image_base image(1, 1);
        if (!pells::TGAFileLoader::loadTarga(&image, in))
            return std::string();
        pixels.append(reinterpret_cast<const char*>(image.getData()),
                      std::size_t{70} * 50 * static_cast<std::size_t>(image.getNumComponents()));
    }
    return pixels;
}

std::string makeTheManagers() {
    pells::Image_base image(1, 1);
    auto& table = pells::ImageFallbackManager::instance();
    const int result = table.setupNewImage(&image, "an image of the table");
    return result == table.FILLED ? "filled with " + std::to_string(image.getWidth()) : "";
}

std::string logTimeAndFree() {
    {
        const pells::Performance outer("a region with a long label",
                                       &pells::PerformanceCategory::find("a category of the test"));
        PELLS_LOG("app", "a line of the application, " << 1 << " of " << 2.5);
        const pells::Performance inner("another region with a long label",
                                       &pells::PerformanceCategory::find("parser"));
    }
    pells::Log::instance().dumpTags();
    pells::SingletonList::freeSingletons();
    return "freed";
}

std::string undoAndRedo() {
    pells::UndoRedoSequence history;
    pells::UndoRedoSequence other;
    for (int i = 0; i < 4; ++i) {
        history.addUndoable(new CountingStep);
        other.addRedoable(new CountingStep);
    }
    history.undo();
    other.redo();
    other.redo();
    history.merge(&other, pells::IdHandler());
    history.undo();
    return std::to_string(history.getUndoStackSize()) + " done, " +
           std::to_string(history.getRedoStackSize()) + " undone";
}

struct EntryPoint {
    const char* name;
    std::string (*work)();
};

const EntryPoint entryPoints[] = {
    {"LoadsAndSaves", loadAndSave},        {"FailsToLoad", failToLoad},
    {"ReadsAnArchive", readAnArchive},     {"ReadsADamagedArchive", readADamagedArchive},
    {"ReadsPictures", readPictures},       {"MakesTheManagers", makeTheManagers},
    {"LogsTimesAndFrees", logTimeAndFree}, {"UndoesAndRedoes", undoAndRedo}};

/// What is done, and the rules for the log meanwhile: a process has them once and for all.
typedef std::tuple<EntryPoint, const char*> Case;

class AllocationFailure : public AssetRootTest, public ::testing::WithParamInterface<Case> {
protected:
    AllocationFailure() {
        prefs()["log"] = std::get<1>(GetParam());
        scratch.write("a.pell", archiveOf({{"some/folder/and/name", std::string(5000, 'x')}}));
        scratch.write("bad.pell", archiveWithDirectory("O15 L4 |name\r\n", "JUNK"));
        writeArchive("a.asset", {{"Textures/.symlinks", "the second name.tga>wood.tga\n"},
                                 {"Textures/wood.tga", tgaFile(2, 2, 24)}});
        write("Data/images.xml",
              "<imagedefs><imageEntries><imageEntry><name>an image of the table</name><getters>"
              "<getter class='TGAFileLoader'><text>Textures/the second name.tga</text></getter>"
              "</getters></imageEntry></imageEntries></imagedefs>");
    }

    const DebuggerText debugger;
};

// Whichever allocation fails, the work gives its result or throws, works when it is done once more,
// and leaves a log that takes lines.
TEST_P(AllocationFailure, LeavesEverythingUsable) {
    std::string (*const work)() = std::get<0>(GetParam()).work;
    const std::string wanted = work();
    ASSERT_NE(wanted, "");
    bool failed = true;
    for (std::int64_t at = 0; failed; ++at) {
        pells::SingletonList::freeSingletons();
        std::string result = "";
        {
            const AllocationMeter meter(at);
            try {
                result = work();
            } catch (const std::exception&) {
            }
            failed = meter.count() > at;
        }
        EXPECT_TRUE(result.empty() || result == wanted) << "allocation " << at << ": " << result;
        EXPECT_EQ(work(), wanted) << "after allocation " << at;
    }
    static const pells::LogKey key("app");
    pells::Log::instance().beginLine(key) << "still here\n";
    EXPECT_EQ(logLines("app: ").back(), "still here");
}

INSTANTIATE_TEST_SUITE_P(EntryPoint, AllocationFailure,
                         ::testing::Combine(::testing::ValuesIn(entryPoints),
                                            ::testing::Values("", "* -log.flush", "*")),
                         [](const auto& each) {
                             const std::string rules = std::get<1>(each.param);
                             return std::string(std::get<0>(each.param).name) +
                                    (rules.empty()  ? "Silently"
                                     : rules == "*" ? "Flushing"
                                                    : "Loudly");
                         });

}  // namespace
