#include "pells/material/material.h"

#include <cmath>

#include "support/documents.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

void expectColor(const Color& actual, const Color& expected) {
    EXPECT_FLOAT_EQ(actual.r, expected.r);
    EXPECT_FLOAT_EQ(actual.g, expected.g);
    EXPECT_FLOAT_EQ(actual.b, expected.b);
    EXPECT_FLOAT_EQ(actual.a, expected.a);
}

TEST(PackedColors, ConvertBothWaysWithTruncation) {
    const struct {
        std::uint32_t rgb, hsv, back;
    } colors[] = {{0xFF8000, 0x1EFFFF, 0xFF7F00},
                  {0x40C020, 0x6CD4C0, 0x40C020},
                  {0x00FF80, 0x96FFFF, 0x00FF7F},
                  {0x123456, 0xD2C956, 0x123456},
                  {0x8000FF, 0x10EFFFF, 0x7F00FF},
                  {0xC02040, 0x15CD4C0, 0xC02040},
                  {0xAB0000FF, 0xF0FFFF, 0x0000FF},
                  {0xFFFFFF, 0xFF, 0xFFFFFF},
                  {0, 0, 0}};
    for (const auto& each : colors) {
        EXPECT_EQ(rgb2hsv(each.rgb), each.hsv);
        EXPECT_EQ(hsv2rgb(each.hsv), each.back);
    }
    EXPECT_EQ(hsv2rgb(0xF168FFFF), 0xFF0000U) << "a hue of 360 degrees, in twelve bits";
    EXPECT_EQ(hsv2rgb(0x169FFFF), 0xFFFFFFU) << "a hue of 361 degrees";
}

TEST(Colors, OfNoHueAreWhite) {
    for (const float hue : {-60.0F, 1e30F, -1e30F, std::nanf("")}) {
        Color rgb;
        HSVtoRGB(hue, 0.5F, 0.5F, rgb.r, rgb.g, rgb.b);
        expectColor(rgb, {1, 1, 1, 0});
    }
}

TEST(Blending, TakesTheShortWayAndFollowsTheStrongerColor) {
    const struct {
        Color from, to;
        double t;
        Color expected;
    } blends[] = {
        {{350, 1, 1, 0}, {10, 1, 1, 0}, 0.5, {360, 1, 1, 0}},
        {{10, 1, 1, 0}, {350, 1, 1, 0}, 0.25, {5, 1, 1, 0}},
        {{0, 1, 1, 0}, {240, 0.5F, 1, 0}, 0.5, {320, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 1, 1, 0}, 0.25, {60, 0.25F, 1, 0}},
        {{200, 1, 1, 0}, {60, 0, 1, 0}, 0.25, {200, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 0, 0, 0}, 0.5, {60, 0, 0.5F, 0}},
        {{0, 1, 0, 0}, {0, 1, 0, 0}, 0.5, {0, 0, 0, 0}},
    };
    for (const auto& each : blends)
        expectColor(HSVInterpolate(each.from.r, each.from.g, each.from.b, each.to.r, each.to.g,
                                   each.to.b, each.t),
                    each.expected);
}

class MaterialTest : public LibraryTest {};

TEST_F(MaterialTest, ComesBackAsItWasSaved) {
    Material material;
    EXPECT_EQ(compact(saved(material)),
              "<root><ambient a=\"1\" b=\"0.2\" g=\"0.2\" r=\"0.2\"/>"
              "<diffuse a=\"1\" b=\"0.8\" g=\"0.8\" r=\"0.8\"/>"
              "<specular a=\"1\" b=\"0\" g=\"0\" r=\"0\"/>"
              "<emissive a=\"1\" b=\"0\" g=\"0\" r=\"0\"/><shininess>100</shininess>"
              "<ambdiff>0</ambdiff><texname></texname><texscale>1</texscale>"
              "<texangle>0</texangle></root>");
    material.setAmbientAndDiffuse(0.125f, 0.25f, 0.5f, 1);
    material.setSpecular(1, 0.5f, 0.25f, 0.75f);
    material.setEmissive(0, 0.0625f, 0, 0);
    material.setShininess(1.0f / 3);
    material.setTextureData("Images/a & b <c>.tga", 2.5f, -45);
    Material copy;
    load(copy, saved(material, 9));
    EXPECT_EQ(saved(copy, 9), saved(material, 9));
    EXPECT_EQ(copy.textureName(), "Images/a & b <c>.tga");
    EXPECT_TRUE(copy.ambientAndDiffuse());
    expectColor(copy.emissive(), Color{0, 0.0625f, 0, 0});

    // What a document leaves out stays, and the flag copies no colour.
    load(copy, "<m><ambdiff>0</ambdiff><ambient r='0.75'/><texname/></m>");
    EXPECT_FALSE(copy.ambientAndDiffuse());
    EXPECT_FALSE(copy.hasTexture());
    expectColor(copy.ambient(), Color{0.75f, 0.25f, 0.5f, 1});
    expectColor(copy.diffuse(), Color{0.125f, 0.25f, 0.5f, 1});
}

TEST_F(MaterialTest, BlendsHalfwayInHueAndKeepsItsTexture) {
    const struct {
        Color a, b, blend;
    } cases[] = {{{1, 0, 0, 1}, {0, 0, 1, 0}, {1, 0, 1, 0.5f}},
                 {{0, 0, 1, 0}, {1, 1, 0, 1}, {0, 1, 0.5f, 0.5f}},
                 {{1, 0, 0.5f, 1}, {1, 1, 1, 1}, {1, 0.5f, 0.625f, 1}}};
    for (const auto& each : cases) {
        Material first;
        first.setAmbientAndDiffuse(each.a);
        first.setSpecular(each.a);
        first.setTextureData("mine", 2, 3);
        Material second = first;
        first.blendWith(second);
        EXPECT_TRUE(first.ambientAndDiffuse());
        second.setDiffuse(each.a);
        EXPECT_FALSE(second.ambientAndDiffuse());
        second.setSpecular(each.b);
        second.setShininess(50);
        second.setTextureData("other", 4, 5);
        first.blendWith(second);
        expectColor(first.diffuse(), each.a);
        expectColor(first.specular(), each.blend);
        EXPECT_FALSE(first.ambientAndDiffuse());
        EXPECT_EQ(first.shininess(), 75);
        EXPECT_EQ(first.textureName(), "mine");
        EXPECT_EQ(first.textureScale(), 2);
        EXPECT_EQ(first.textureAngle(), 3);
        first.setAmbientAndDiffuse(each.b);
        first.setAmbient(each.a);
        EXPECT_FALSE(first.ambientAndDiffuse());
    }
}

TEST(Materials, AreAssignedWhole) {
    pells::Material brass;
    brass.setShininess(7);
    brass.setTextureData("grain", 2, 90);
    pells::Material other;
    other = brass;
    EXPECT_EQ(other.shininess(), 7);
    EXPECT_EQ(other.textureName(), "grain");
    EXPECT_EQ(other.textureAngle(), 90);
}

}  // namespace
