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
    Material material = black();
    material.setAmbient(0.2f, 0.4f, 0.6f, 1);
    EXPECT_EQ(middle(material), 0xFF336699U);
    // The body is half there, what it gives off is there as a whole.
    material.setDiffuse(0, 0, 0, 0.4f);
    EXPECT_EQ(middle(material), 0x6614293DU);
    material.setEmissive(1, 0.4f, 0.2f, 1);
    material.setDiffuse(0, 0, 0, 0);
    EXPECT_EQ(middle(material), 0xFFFF6633U);
}

TEST_F(Sphere, IsLitFromTheUpperLeft) {
    Material matt = black();
    matt.setDiffuse(1, 1, 1, 1);
    const Thumbnail body = renderSphere(matt, nullptr, size);
    EXPECT_GT(at(body, size / 4, size / 4) & 255, 200U);
    EXPECT_LT(at(body, size * 3 / 4, size * 3 / 4) & 255, 60U);

    Material polished = black();
    polished.setSpecular(1, 1, 1, 1);
    const auto brightPixels = [&polished](float shininess) {
        polished.setShininess(shininess);
        const std::vector<std::uint32_t> pixels = renderSphere(polished, nullptr, size).pixels;
        return std::count_if(pixels.begin(), pixels.end(),
                             [](std::uint32_t pixel) { return (pixel & 255) > 127; });
    };
    EXPECT_GT(brightPixels(500), 0);
    EXPECT_GT(brightPixels(5), 2 * brightPixels(500));
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
    const Quarters upright = {0xFFFF0000, 0xFFFFFFFF, 0xFF0000FF, 0xFF00FF00};
    EXPECT_EQ(quarters(1, 0), upright);
    EXPECT_EQ(quarters(1, 90), (Quarters{upright[1], upright[2], upright[3], upright[0]}));
    EXPECT_EQ(quarters(-1, 0), (Quarters{upright[2], upright[3], upright[0], upright[1]}));
    EXPECT_EQ(quarters(1, -360000), upright);
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
        material.setEmissive(odd, 1, -1, 1);
        const Thumbnail sphere = renderSphere(material, texture.get(), size);
        EXPECT_EQ(at(sphere, size / 2, size / 2) >> 8 & 255, 255U) << odd;
    }
}

typedef ToolRuns SwatchTest;

TEST_F(SwatchTest, FailsWithOneLineAndLeavesNothing) {
    const Failing cases[] = {
        {"", "MATERIAL.xml or --blend is required (see --help)"},
        {"--blend plain.xml", "--blend: 2 required A.xml B.xml missing (see --help)"},
        {"missing.xml", "missing.xml: No such file or directory"},
        {"/dev/zero", "/dev/zero: Not a regular file"},
        {"text.xml", "text.xml: It does not begin with an XML element"},
        {"--blend plain.xml cut.xml", "cut.xml: Malformed XML: premature EOF"},
        {"colour.xml", "colour.xml: Failed to scan text value"},
        {"plain.xml wood.xml", "wood.xml: texture 'wood.tga': --root is needed to find it"},
        {"wood.xml --root root",
         "wood.xml: texture 'wood.tga': Couldn't open the specified file from disc: root/wood.tga"},
        {"none.xml --root root", "none.xml: texture 'none.tga': The picture has no pixels"},
        {"short.xml --root root --log -error",
         "short.xml: texture 'short.tga': failed without a reason in the log"},
    };
    scratch.write("plain.xml", "<material/>");
    scratch.write("text.xml", "material");
    scratch.write("cut.xml", "<material><shininess>5</shininess>");
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
TEST_F(SwatchTest, DrawsSamplesAndWhatStrangersSend) {
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
