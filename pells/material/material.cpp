#include "pells/material/material.h"

#include <algorithm>
#include <utility>

#include "pells/serial/member_field.h"

namespace pells {

namespace {

struct HsvColor {
    explicit HsvColor(const Color& color) { RGBtoHSV(color.r, color.g, color.b, h, s, v); }

    float h;
    float s;
    float v;
};

/// The middle of the shorter arc between two hues in degrees.
float middleHue(float a, float b) {
    const float low = std::min(a, b);
    const float high = std::max(a, b);
    float middle = (low + high) * 0.5f;
    if (high - low > 180)
        middle -= 180;
    return middle < 0 ? middle + 360 : middle;
}

Color blended(const Color& first, const Color& second) {
    const HsvColor a(first);
    const HsvColor b(second);
    Color result;
    HSVtoRGB(middleHue(a.h, b.h), (a.s + b.s) * 0.5f, (a.v + b.v) * 0.5f, result.r, result.g,
             result.b);
    result.a = (first.a + second.a) * 0.5f;
    return result;
}

}  // namespace

Material::Material() = default;
Material::Material(const Material&) = default;
Material& Material::operator=(const Material&) = default;
Material::~Material() = default;

void Material::setAmbient(float r, float g, float b, float a) {
    setAmbient(Color{r, g, b, a});
}

void Material::setAmbient(const Color& color) {
    ambientColor = color;
    ambientIsDiffuse = false;
}

void Material::setDiffuse(float r, float g, float b, float a) {
    setDiffuse(Color{r, g, b, a});
}

void Material::setDiffuse(const Color& color) {
    diffuseColor = color;
    ambientIsDiffuse = false;
}

void Material::setAmbientAndDiffuse(float r, float g, float b, float a) {
    setAmbientAndDiffuse(Color{r, g, b, a});
}

void Material::setAmbientAndDiffuse(const Color& color) {
    ambientColor = diffuseColor = color;
    ambientIsDiffuse = true;
}

void Material::setSpecular(float r, float g, float b, float a) {
    setSpecular(Color{r, g, b, a});
}

void Material::setSpecular(const Color& color) {
    specularColor = color;
}

void Material::setEmissive(float r, float g, float b, float a) {
    setEmissive(Color{r, g, b, a});
}

void Material::setEmissive(const Color& color) {
    emissiveColor = color;
}

void Material::setShininess(float shininess) {
    shininessValue = shininess;
}

void Material::setTextureData(const std::string& name, float scale, float angle) {
    texName = name;
    texScale = scale;
    texAngle = angle;
}

void Material::blendWith(const Material& other) {
    ambientColor = blended(ambientColor, other.ambientColor);
    diffuseColor = blended(diffuseColor, other.diffuseColor);
    specularColor = blended(specularColor, other.specularColor);
    emissiveColor = blended(emissiveColor, other.emissiveColor);
    ambientIsDiffuse = ambientIsDiffuse && other.ambientIsDiffuse;
    shininessValue = (other.shininessValue + shininessValue) * 0.5f;
}

boost::intrusive_ptr<Field> Material::getField(const std::string& name) {
    ClassDesc desc(
        makeField("ambient", &Material::ambientColor),
        makeField("diffuse", &Material::diffuseColor),
        makeField("specular", &Material::specularColor),
        makeField("emissive", &Material::emissiveColor),
        makeField("shininess", &Material::shininessValue),
        makeField("ambdiff", &Material::ambientIsDiffuse), makeField("texname", &Material::texName),
        makeField("texscale", &Material::texScale), makeField("texangle", &Material::texAngle));
    return makeComposite(name, std::move(desc));
}

}  // namespace pells
