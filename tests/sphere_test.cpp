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

}  // namespace
