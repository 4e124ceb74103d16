#include "pells/material/material.h"

#include <gtest/gtest.h>

#include <sstream>

#include "pells/xml/tag.h"
#include "support/test_prefs.h"

namespace {

using pells::Color;
using pells::Material;

class MaterialTest : public pells_test::LibraryTest {};

std::string saved(Material& material, int precision = 6) {
    std::ostringstream out;
    out.precision(precision);
    pells::OutTag root(out, "material");
    material.save(root);
    return out.str();
}

void load(Material& material, const std::string& document) {
    std::istringstream in(document);
    pells::XMLTokenizer tokenizer(in);
    pells::OpenTag root(tokenizer, tokenizer.getToken());
    material.load(root, nullptr);
}

void expectColor(const Color& actual, const Color& expected) {
    EXPECT_FLOAT_EQ(actual.r, expected.r);
    EXPECT_FLOAT_EQ(actual.g, expected.g);
    EXPECT_FLOAT_EQ(actual.b, expected.b);
    EXPECT_FLOAT_EQ(actual.a, expected.a);
}

TEST_F(MaterialTest, IsSavedInTheOrderOfItsMembers) {
    Material material;
    EXPECT_EQ(saved(material),
              "<material>\n"
              "    <ambient a=\"1\" b=\"0.2\" g=\"0.2\" r=\"0.2\"/>\n"
              "    <diffuse a=\"1\" b=\"0.8\" g=\"0.8\" r=\"0.8\"/>\n"
              "    <specular a=\"1\" b=\"0\" g=\"0\" r=\"0\"/>\n"
              "    <emissive a=\"1\" b=\"0\" g=\"0\" r=\"0\"/>\n"
              "    <shininess>100</shininess>\n"
              "    <ambdiff>0</ambdiff>\n"
              "    <texname></texname>\n"
              "    <texscale>1</texscale>\n"
              "    <texangle>0</texangle>\n"
              "</material>\n");
}

TEST_F(MaterialTest, ComesBackAsItWasSaved) {
    Material material;
    material.setAmbientAndDiffuse(0.125f, 0.25f, 0.5f, 1);
    material.setSpecular(1, 0.5f, 0.25f, 0.75f);
    material.setEmissive(Color{0, 0.0625f, 0, 0});
    material.setShininess(1.0f / 3);
    material.setTextureData("Images/a & b <c>.tga", 2.5f, -45);
    Material copy;
    load(copy, saved(material, 9));
    EXPECT_EQ(saved(copy, 9), saved(material, 9));
    EXPECT_EQ(copy.shininess(), material.shininess());
    EXPECT_EQ(copy.textureName(), "Images/a & b <c>.tga");
    EXPECT_TRUE(copy.hasTexture());
    EXPECT_TRUE(copy.ambientAndDiffuse());

    // What a document leaves out stays, and the flag copies no colour.
    load(copy, "<m><ambdiff>0</ambdiff><ambient r='0.75' x='1'/><texname/></m>");
    EXPECT_FALSE(copy.ambientAndDiffuse());
    EXPECT_FALSE(copy.hasTexture());
    expectColor(copy.ambient(), Color{0.75f, 0.25f, 0.5f, 1});
    expectColor(copy.diffuse(), Color{0.125f, 0.25f, 0.5f, 1});
    EXPECT_THROW(load(copy, "<m><diffuse r='0.5cm'/></m>"), pells::Serializable::LoadFail);
    expectColor(copy.diffuse(), Color{0.125f, 0.25f, 0.5f, 1});
}

TEST_F(MaterialTest, KnowsWhetherAmbientAndDiffuseWereSetTogether) {
    Material material;
    material.setAmbientAndDiffuse(Color{1, 0, 0, 1});
    EXPECT_TRUE(material.ambientAndDiffuse());
    material.setDiffuse(Color{0, 1, 0, 1});
    EXPECT_FALSE(material.ambientAndDiffuse());
    expectColor(material.ambient(), Color{1, 0, 0, 1});
    material.setAmbientAndDiffuse(0, 0, 1, 1);
    material.setAmbient(0, 1, 0, 1);
    EXPECT_FALSE(material.ambientAndDiffuse());
    expectColor(material.diffuse(), Color{0, 0, 1, 1});
}

TEST_F(MaterialTest, BlendsColoursHalfwayInHue) {
    const struct {
        Color a, b, blend;
    } cases[] = {{{1, 0, 0, 1}, {0, 1, 0, 1}, {1, 1, 0, 1}},
                 {{1, 0, 0, 1}, {0, 0, 1, 0}, {1, 0, 1, 0.5f}},
                 {{0, 0, 1, 0}, {1, 0, 0, 1}, {1, 0, 1, 0.5f}},
                 {{1, 1, 1, 1}, {0, 0, 1, 1}, {1, 0.5f, 1, 1}},
                 {{0.8f, 0.8f, 0.8f, 1}, {0, 0, 0, 1}, {0.4f, 0.4f, 0.4f, 1}},
                 {{0.2f, 0.2f, 0.2f, 1}, {0.2f, 0.2f, 0.2f, 1}, {0.2f, 0.2f, 0.2f, 1}}};
    for (const auto& each : cases) {
        Material first;
        Material second;
        first.setSpecular(each.a);
        second.setSpecular(each.b);
        first.blendWith(second);
        expectColor(first.specular(), each.blend);
    }
}

TEST_F(MaterialTest, BlendsTheRestAndKeepsItsTexture) {
    Material first;
    Material second;
    first.setAmbientAndDiffuse(1, 0, 0, 1);
    first.setTextureData("mine", 2, 3);
    second.setShininess(50);
    second.setTextureData("other", 4, 5);
    Material both = first;
    both.blendWith(first);
    EXPECT_TRUE(both.ambientAndDiffuse());
    first.blendWith(second);
    EXPECT_FALSE(first.ambientAndDiffuse());
    EXPECT_EQ(first.shininess(), 75);
    EXPECT_EQ(first.textureName(), "mine");
    EXPECT_EQ(first.textureScale(), 2);
    EXPECT_EQ(first.textureAngle(), 3);
}

}  // namespace
