// The samples of the pages in docs/, as they stand there. They are taken out of the pages when the
// build is configured; here stands what surrounds them.

#include <gtest/gtest.h>
#include <pells/pells.h>

#include <sstream>

#include "support/archive_bytes.h"
#include "support/scratch_directory.h"

#include "samples/core_2.inc"  // the preferences of this program
#include "samples/core_3.inc"

namespace {

using namespace pells_test;

class Page : public ::testing::Test {
protected:
    Page() { scratch.enter(); }
    ~Page() override { pells::SingletonList::freeSingletons(); }

    ScratchDirectory scratch;
};

/// A sample that is no program.
std::string sample(const std::string& name) {
    return readFile(PELLS_SAMPLES "/" + name);
}

std::string saved(pells::Serializable& object, const std::string& element) {
    std::ostringstream out;
    pells::OutTag tag(out, element);
    object.save(tag);
    return out.str();
}

void load(pells::Serializable& object, const std::string& document) {
    std::istringstream in(document);
    pells::XMLTokenizer tokenizer(in);
    pells::OpenTag root(tokenizer, tokenizer.getToken());
    object.load(root, nullptr);
}

TEST_F(Page, Core) {
#include "samples/core_1.inc"
    EXPECT_EQ(Renderer::singleton, nullptr);
    EXPECT_EQ(&SharedRenderer::instance(), SharedRenderer::singleton);
    EXPECT_EQ(pells::Prefs::instance().getString("assetLocation"), "assets");
}

TEST_F(Page, Logging) {
    scratch.write("pells.log.prefs", "app");
    const int count = 12;
    const std::string name = "wheel";
#include "samples/logging_1.inc"
    pells::Log::instance().close();
    EXPECT_NE(readFile("pells.log").find("\napp.load: read 12 parts of wheel\n"),
              std::string::npos);
}

TEST_F(Page, Assets) {
    scratch.write("assets/Images/wall.tga", "stones");
    scratch.write("assets/fonts.asset",
                  archiveOf({{"fonts/large.txt", "large"}, {"fonts/small.txt", "small"}}));
    std::string text;
    const auto read = [&text](std::istream& in) { text = readAll(in); };
#include "samples/assets_1.inc"
    EXPECT_EQ(text, "stones");
    const auto& load = read;
#include "samples/assets_2.inc"
    EXPECT_EQ(text, "small");
}

TEST_F(Page, Xml) {
#include "samples/xml_1.inc"
    Part part;
    load(part, "<part><weight>2.5</weight><title>wheel</title></part>");
    EXPECT_EQ(saved(part, "part"),
              "<part>\n    <title>wheel</title>\n    <weight>2.5</weight>\n</part>\n");
}

struct Base : pells::Serializable {
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override {
        return pells::makeComposite(name, pells::ClassDesc(pells::makeField("y", &Base::y)));
    }
    bool y = true;
};

struct Derived : Base {
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override {
        return pells::makeComposite(
            name, pells::ClassDesc(Base::getField("super"), pells::makeField("x", &Derived::x),
                                   pells::makeField("s", &Derived::s)));
    }
    float x = 0.5;
    std::string s = "hi";
};

TEST_F(Page, XmlDocument) {
    Derived object;
    EXPECT_EQ(saved(object, "root"), sample("xml_1.xml"));
}

struct {
    std::string title = "Cellar";
} document;

TEST_F(Page, Editing) {
#include "samples/editing_1.inc"
    EXPECT_EQ(document.title, "Hall");
    EXPECT_EQ(saved(history, "history"), sample("editing_1.xml"));
    pells::UndoRedoSequence replayed;
    load(replayed, sample("editing_1.xml"));
    EXPECT_EQ(document.title, "Hall");
    EXPECT_EQ(replayed.getUndoStackSize(), 1);
#include "samples/editing_2.inc"
}

TEST_F(Page, Images) {
    scratch.write("assets/Data/images.xml", sample("images_1.xml"));
    EXPECT_EQ(pells::ImageFallbackManager::instance().getLoaders("wall").size(), 2U);
}

}  // namespace
