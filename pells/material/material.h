#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>

#include "pells/material/color.h"
#include "pells/serial/serializable.h"

namespace pells {

/// How the surface of a modelled object looks: four colours of the usual lighting model, a
/// shininess, and an optional texture.
///
/// Saved as the elements "ambient", "diffuse", "specular", "emissive", "shininess", "ambdiff",
/// "texname", "texscale" and "texangle". Loading sets the members as they stand there: "ambdiff"
/// copies no colour.
class PELLS_API Material : public Serializable {
public:
    Material();
    Material(const Material&);
    Material& operator=(const Material&);
    ~Material() override;

    /// The colours that the surface gives back of light from everywhere, of light from a side, and
    /// as highlights, and the one it shines in by itself. A new material has 0.2, 0.8, 0 and 0 for
    /// their channels and alpha 1.
    const Color& ambient() const { return ambientColor; }
    const Color& diffuse() const { return diffuseColor; }
    const Color& specular() const { return specularColor; }
    const Color& emissive() const { return emissiveColor; }

    /// The exponent of highlights: the greater, the smaller they are. 0 to 128 by convention; 100
    /// for a new material.
    float shininess() const { return shininessValue; }

    /// Whether ambient and diffuse were last set together.
    bool ambientAndDiffuse() const { return ambientIsDiffuse; }

    /// The name of the texture's picture; empty without one.
    const std::string& textureName() const { return texName; }

    /// How large the texture is on the surface: 2 shows it twice as large. 1 for a new material.
    float textureScale() const { return texScale; }

    /// Rotation of the texture, in degrees, counterclockwise.
    float textureAngle() const { return texAngle; }

    /// Whether there is a texture's name.
    bool hasTexture() const { return !texName.empty(); }

    /// These two end ambientAndDiffuse(). Here and below channels are 0 to 1 by convention; nothing
    /// checks or clamps them, and nothing in a document either.
    void setAmbient(float r, float g, float b, float a);
    void setAmbient(const Color& color);
    void setDiffuse(float r, float g, float b, float a);
    void setDiffuse(const Color& color);

    /// Sets both and makes ambientAndDiffuse() true.
    void setAmbientAndDiffuse(float r, float g, float b, float a);
    void setAmbientAndDiffuse(const Color& color);

    /// Setters of what the getters above give, in their units and ranges, which are not checked.
    void setSpecular(float r, float g, float b, float a);
    void setSpecular(const Color& color);
    void setEmissive(float r, float g, float b, float a);
    void setEmissive(const Color& color);
    void setShininess(float shininess);
    void setTextureData(const std::string& name, float scale, float angle);

    /// Mixes another material into this one, half and half.
    ///
    /// Colours meet halfway in hue (along the shorter arc), saturation and value; alpha and
    /// shininess are averaged; ambientAndDiffuse() stays only if both have it; the texture stays
    /// this one's. Grey counts as hue 0, so blending it with a colour pulls the hue toward red.
    void blendWith(const Material& other);

    boost::intrusive_ptr<Field> getField(const std::string& name) override;

private:
    Color ambientColor{0.2f, 0.2f, 0.2f, 1};
    Color diffuseColor{0.8f, 0.8f, 0.8f, 1};
    Color specularColor{0, 0, 0, 1};
    Color emissiveColor{0, 0, 0, 1};
    float shininessValue = 100;
    bool ambientIsDiffuse = false;
    std::string texName;
    float texScale = 1;
    float texAngle = 0;
};

}  // namespace pells
