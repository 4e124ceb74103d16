#include <algorithm>
#include <boost/intrusive_ptr.hpp>
#include <cmath>
#include <cstdint>
#include <limits>
#include <sstream>

#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/material/material.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"
#include "support/tool_runs.h"
#include "tools/sphere.h"

namespace {

using namespace pells_test;
using pells::Material;
using pells_tool::renderSphere;
using pells_tool::Thumbnail;

class Sphere : public LibraryTest {};

const int size = 64;

/// A material that gives off no light at all.
Material black() {
    Material material;
    material.setAmbientAndDiffuse(0, 0, 0, 1);
    return material;
}

std::uint32_t at(const Thumbnail& sphere, int x, int y) {
    const auto columns = static_cast<std::size_t>(sphere.width);
    return sphere.pixels.at(static_cast<std::size_t>(y) * columns + static_cast<std::size_t>(x));
}

std::uint32_t middle(const Material& material) {
    return at(renderSphere(material, nullptr, size), size / 2, size / 2);
}

TEST_F(Sphere, ShowsTheColoursOfItsMaterial) {
    Material glowing = black();
    glowing.setEmissive(1, 0.4f, 0.2f, 1);
    EXPECT_EQ(middle(glowing), 0xFFFF6633U);
    Material ambient = black();
    ambient.setAmbient(0.2f, 0.4f, 0.6f, 1);
    EXPECT_EQ(middle(ambient), 0xFF336699U);
    // The body is half there, what it gives off is there as a whole.
    ambient.setDiffuse(0, 0, 0, 0.4f);
    EXPECT_EQ(middle(ambient), 0x6614293DU);
    glowing.setDiffuse(0, 0, 0, 0);
    EXPECT_EQ(middle(glowing), 0xFFFF6633U);
}

TEST_F(Sphere, IsLitFromTheUpperLeft) {
    Material matt = black();
    matt.setDiffuse(1, 1, 1, 1);
    const Thumbnail body = renderSphere(matt, nullptr, size);
    EXPECT_GT(at(body, size / 4, size / 4) & 255, 200U);
    EXPECT_LT(at(body, size * 3 / 4, size * 3 / 4) & 255, 60U);

    std::ptrdiff_t larger = std::numeric_limits<std::ptrdiff_t>::max();
    for (const float shininess : {5.0f, 50.0f, 500.0f}) {
        Material polished = black();
        polished.setSpecular(1, 1, 1, 1);
        polished.setShininess(shininess);
        const std::vector<std::uint32_t> pixels = renderSphere(polished, nullptr, size).pixels;
        const auto brightest = std::max_element(pixels.begin(), pixels.end());
        EXPECT_GT(*brightest & 255, 200U);
        EXPECT_LT((brightest - pixels.begin()) % size, size / 2);
        EXPECT_LT((brightest - pixels.begin()) / size, size / 2);
        const auto bright = std::count_if(pixels.begin(), pixels.end(),
                                          [](std::uint32_t pixel) { return (pixel & 255) > 127; });
        EXPECT_LT(bright, larger) << shininess;
        larger = bright;
    }
}

/// Green and blue below red and white, read as every texture is.
boost::intrusive_ptr<pells::Image_base> fourColours() {
    std::istringstream file(tgaHeader(2, 2, 24, 0) +
                            std::string("\0\xFF\0\xFF\0\0\0\0\xFF\xFF\xFF\xFF", 12));
    boost::intrusive_ptr<pells::Image_base> image(new pells::Image_base(std::string()));
    EXPECT_TRUE(pells::TGAFileLoader::loadTarga(image.get(), file));
    return image;
}

TEST_F(Sphere, WearsItsTexture) {
    const auto texture = fourColours();
    Material material = black();
    material.setAmbient(1, 1, 1, 1);
    typedef std::vector<std::uint32_t> Quarters;
    // Each quarter in the clockwise order that begins at the upper left.
    const auto quarters = [&](float scale, float angle) {
        material.setTextureData("texture", scale, angle);
        const Thumbnail sphere = renderSphere(material, texture.get(), size);
        const int low = size * 3 / 8;
        const int high = size * 5 / 8;
        return Quarters{at(sphere, low, low), at(sphere, high, low), at(sphere, high, high),
                        at(sphere, low, high)};
    };
    const std::uint32_t red = 0xFFFF0000;
    const std::uint32_t white = 0xFFFFFFFF;
    const std::uint32_t blue = 0xFF0000FF;
    const std::uint32_t green = 0xFF00FF00;
    EXPECT_EQ(quarters(1, 0), (Quarters{red, white, blue, green}));
    EXPECT_EQ(quarters(3, 0), quarters(1, 0));
    EXPECT_EQ(quarters(1, 90), (Quarters{white, blue, green, red}));
    EXPECT_EQ(quarters(-1, 0), (Quarters{blue, green, red, white}));
    EXPECT_EQ(quarters(1, -360000), quarters(1, 0));
    material.setAmbient(0.4f, 0.4f, 0.4f, 1);
    EXPECT_EQ(quarters(1, 0).front(), 0xFF660000U);
}

TEST_F(Sphere, StandsAnyNumber) {
    const auto texture = fourColours();
    const float infinity = std::numeric_limits<float>::infinity();
    for (const float odd : {infinity, -infinity, std::nanf(""), 3e38f, -3e38f, 1e-44f, 0.0f}) {
        Material material;
        material.setAmbientAndDiffuse(odd, odd, odd, odd);
        material.setSpecular(odd, odd, odd, odd);
        material.setShininess(odd);
        material.setTextureData("texture", odd, odd);
        for (const std::uint32_t pixel : renderSphere(material, texture.get(), size).pixels)
            ASSERT_LE(std::max({pixel >> 16 & 255, pixel >> 8 & 255, pixel & 255}), pixel >> 24);
        material.setEmissive(odd, 1, -1, 1);
        EXPECT_EQ(middle(material) >> 8 & 255, 255U) << odd;
    }
    Material material = black();
    material.setEmissive(std::nanf(""), -infinity, infinity, 1);
    EXPECT_EQ(middle(material), 0xFF0000FFU);
}

class SwatchTest : public ToolRuns {};

TEST_F(SwatchTest, FailsWithOneLineAndLeavesNothing) {
    const Failing cases[] = {
        {"", "MATERIAL.xml or --blend is required (see --help)"},
        {"--root root", "MATERIAL.xml or --blend is required (see --help)"},
        {"--blend plain.xml", "--blend: 2 required A.xml B.xml missing (see --help)"},
        {"missing.xml", "missing.xml: No such file or directory"},
        {"plain.xml root", "root: Is a directory"},
        {"/dev/zero", "/dev/zero: Not a regular file"},
        {"empty.xml", "empty.xml: It does not begin with an XML element"},
        {"text.xml", "text.xml: It does not begin with an XML element"},
        {"cut.xml", "cut.xml: Malformed XML: premature EOF"},
        {"--blend plain.xml crossed.xml", "crossed.xml: Malformed XML: bad close tag"},
        {"colour.xml", "colour.xml: Failed to scan text value"},
        {"plain.xml wood.xml", "wood.xml: texture 'wood.tga': --root is needed to find it"},
        {"wood.xml --root missing", "missing: No such file or directory"},
        {"wood.xml --root root",
         "wood.xml: texture 'wood.tga': Couldn't open the specified file from disc: root/wood.tga"},
        {"short.xml --root root", "short.xml: texture 'short.tga': tga file shorter than data"},
        {"none.xml --root root", "none.xml: texture 'none.tga': The picture has no pixels"},
        {"short.xml --root root --log -error",
         "short.xml: texture 'short.tga': failed without a reason in the log"},
    };
    scratch.write("plain.xml", "<material/>");
    scratch.write("empty.xml", "");
    scratch.write("text.xml", "material");
    scratch.write("cut.xml", "<material><shininess>5</shininess>");
    scratch.write("crossed.xml", "<material><shininess>5</material></shininess>");
    scratch.write("colour.xml", "<material><diffuse r=\"0.5x\"/></material>");
    for (const std::string name : {"wood", "short", "none"})
        scratch.write(name + ".xml", "<m><texname>" + name + ".tga</texname></m>");
    scratch.write("root/short.tga", tgaHeader(9, 9, 24) + "x");
    scratch.write("root/none.tga", tgaHeader(0, 9, 24));
    scratch.write("out.png", "old");
    for (const Failing& each : cases)
        expectFailure(std::string("swatch -o out.png ") + each.first,
                      std::string("pells: swatch: ") + each.second, "out.png");
}

TEST_F(SwatchTest, DrawsMaterialsTheirBlendAndTheCheckerboardBehindThem) {
    const auto write = [this](const std::string& name, const std::string& alpha,
                              const std::string& red, const std::string& blue) {
        scratch.write(name, "<m><ambient r='0' g='0' b='0' a='1'/><diffuse r='0' g='0' b='0' a='" +
                                alpha + "'/><emissive r='" + red + "' g='0' b='" + blue +
                                "' a='1'/></m>");
    };
    std::vector<std::uint32_t> pixels;
    const auto draw = [&](const std::string& arguments) {
        ASSERT_EQ(pells("swatch -o out.png " + arguments).err, "");
        pixels = decodePng("out.png");
    };
    const auto count = [&](std::uint32_t colour) {
        return std::count(pixels.begin(), pixels.end(), colour);
    };
    write("red.xml", "1", "1", "0");
    write("blue.xml", "1", "0", "1");
    write("unseen.xml", "0", "0", "0");
    draw("--blend red.xml blue.xml red.xml");
    // A sphere of 196 pixels has 30172 of them. Red was drawn twice.
    EXPECT_GT(count(0xFF0000), 2 * 29500);
    EXPECT_GT(count(0x0000FF), 29500);
    EXPECT_LT(count(0x0000FF), 2 * 29500);
    EXPECT_GT(count(0xFF00FF), 29500);
    EXPECT_LT(count(0xD9DDE3), 4000);
    draw("unseen.xml");
    EXPECT_GT(count(0xD9DDE3), 20000);
}

// Numbers that no surface has, names of any bytes, and a document from a pipe.
TEST_F(SwatchTest, DrawsSamplesAndWhatStrangersSend) {
    const std::string arguments =
        "swatch '" PELLS_SAMPLES "'/materials/*.xml --root '" PELLS_SAMPLES "/root' -o ";
    EXPECT_EQ(pells(arguments + "one.png --log asset").err,
              "pells: warning: Bad .asset file: " PELLS_SAMPLES
              "/root/broken.asset: Input file not a pell file\n");
    EXPECT_EQ(pells(arguments + "two.png").status, 0);
    EXPECT_EQ(readFile("one.png"), readFile("two.png"));

    scratch.write("odd.xml",
                  "<m><ambient r='1e38' g='-1e38' b='nan' a='1e999'/><diffuse r='-3e38' a='-2'/>"
                  "<shininess>-1e30</shininess><texname>\xFF\x1B[31m.tga</texname>"
                  "<texscale>1e-40</texscale><texangle>1e38</texangle></m>");
    scratch.write("root/\xFF\x1B[31m.tga", tgaHeader(2, 2, 24, 0, 10) + std::string(12, 'x'));
    const Outcome outcome = pells("swatch --blend odd.xml <(cat odd.xml) --root root -o out.png");
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.err.substr(0, outcome.err.find('\n')),
              "pells: warning: odd.xml: texture '\xFF\\x1b[31m.tga': image type 10 is run-length "
              "encoded: packets are read as pixels");
    EXPECT_FALSE(decodePng("out.png").empty());
}

}  // namespace
