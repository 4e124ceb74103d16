#include "steps.h"

#include <pells/core/factory.h>
#include <pells/serial/member_field.h>

#include <algorithm>
#include <cctype>
#include <initializer_list>
#include <iterator>
#include <limits>
#include <sstream>
#include <utility>

#include "exact_color.h"
#include "files.h"
#include "materials.h"

namespace material_editor {

using pells::ClassDesc;
using pells::Color;
using pells::Field;
using pells::makeComposite;
using pells::makeField;
using pells::Material;

namespace {

/// The colours of a material that can be set.
struct Part {
    const char* name;
    void (Material::*set)(const Color& color);
};
const Part allParts[] = {
    {"ambient", &Material::setAmbient},   {"ambient-and-diffuse", &Material::setAmbientAndDiffuse},
    {"diffuse", &Material::setDiffuse},   {"emissive", &Material::setEmissive},
    {"specular", &Material::setSpecular},
};

const Part* findPart(const std::string& name) {
    const auto found = std::find_if(std::begin(allParts), std::end(allParts),
                                    [&name](const Part& part) { return part.name == name; });
    return found == std::end(allParts) ? nullptr : found;
}

// Functions that look for a problem return its text, or an empty one.

std::string firstOf(std::initializer_list<std::string> problems) {
    const auto found = std::find_if(problems.begin(), problems.end(),
                                    [](const std::string& problem) { return !problem.empty(); });
    return found == problems.end() ? std::string() : *found;
}

std::string outside(const std::string& what, float value, float least, float most) {
    // Asked this way round, so that a value that is no number is outside.
    if (value >= least && value <= most)
        return std::string();
    std::ostringstream problem;
    problem << what << " goes from " << least << " to " << most << ", not " << value;
    return problem.str();
}

std::string badColor(const Color& color) {
    const std::string channel = "a colour's channel";
    return firstOf({outside(channel, color.r, 0, 1), outside(channel, color.g, 0, 1),
                    outside(channel, color.b, 0, 1), outside(channel, color.a, 0, 1)});
}

std::string badShininess(float shininess) {
    return outside("shininess", shininess, 0, 128);
}

std::string badTexture(const std::string& name, float scale, float angle) {
    // Reading a document drops white space at the start of a text.
    if (!name.empty() && std::isspace(static_cast<unsigned char>(name.front())))
        return "a texture's name does not begin with white space";
    return firstOf({outside("a texture's scale", scale, 0.001f, 1000),
                    outside("a texture's angle", angle, -360, 360)});
}

std::string badName(const std::string& name) {
    const auto allowed = [](unsigned char c) {
        return c < 0x80 && (std::isalnum(c) || c == '_' || c == '-' || c == '.');
    };
    if (!name.empty() && std::all_of(name.begin(), name.end(), allowed))
        return std::string();
    return "a material's name is made of letters, digits, '_', '-' and '.', not '" + name + "'";
}

std::string unknown(const std::string& materialName) {
    if (Materials::instance().find(materialName))
        return std::string();
    return "there is no material '" + materialName + "'";
}

/// Words and values with a blank between them.
template <class... Values>
std::string command(const char* name, const Values&... values) {
    std::ostringstream text;
    text << name;
    ((text << ' ' << values), ...);
    return text.str();
}

}  // namespace

// What all steps share.

void Step::load(pells::InTag& tag, boost::intrusive_ptr<Field> field) {
    UndoableStep::load(tag, field);  // calls redo(), and does not mind its failing
    if (!isValid())
        throw LoadFail("cannot replay '" + describe() + "': " + problem());
}

boost::intrusive_ptr<Field> Step::getField(const std::string& name) {
    // The base class's fields come first, as an element "super".
    return makeComposite(
        name, ClassDesc(UndoableStep::getField("super"), makeField("material", &Step::material)));
}

bool Step::undo() {
    if (!done)  // its redo was suppressed
        return true;
    if (before)
        Materials::instance().put(material, *before);
    else
        Materials::instance().remove(material);
    done = false;
    return true;
}

bool Step::redo() {
    if (!problem().empty())
        return false;
    const Material* const now = Materials::instance().find(material);
    before = now ? std::optional<Material>(*now) : std::nullopt;
    Material edited = before.value_or(Material());
    change(edited);
    Materials::instance().put(material, edited);
    done = true;
    return true;
}

bool Step::isValid() const {
    return done || redoSuppressed();
}

std::string Step::missingMaterial() const {
    return unknown(material);
}

namespace {

// Each kind of step is a class of its own. The default constructors are for the factories, which
// make a step before its fields are read: numbers begin as NaN, so that a field that a file lacks
// is found by problem().

const float unset = std::numeric_limits<float>::quiet_NaN();

class CreateMaterial : public Step {
public:
    CreateMaterial() = default;
    explicit CreateMaterial(const std::string& materialName) : Step(materialName) {}

    // Without fields of its own, it is saved as a Step is.

    std::string problem() const override {
        if (Materials::instance().find(materialName()))
            return "there is a material '" + materialName() + "' already";
        return badName(materialName());
    }

    std::string describe() const override { return command("new", materialName()); }

    void change(Material& /*edited*/) const override {}
};

class SetColor : public Step {
public:
    SetColor() = default;
    SetColor(const std::string& materialName, const std::string& partName, const Color& newColor)
        : Step(materialName), part(partName), color{newColor} {}

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name,
                             ClassDesc(Step::getField("super"), makeField("part", &SetColor::part),
                                       makeField("color", &SetColor::color)));
    }

    std::string problem() const override {
        const std::string badPart = findPart(part) ? "" : "a material has no colour '" + part + "'";
        return firstOf({missingMaterial(), badPart, badColor(color.value)});
    }

    std::string describe() const override { return command("color", materialName(), part, color); }

    void change(Material& edited) const override { (edited.*findPart(part)->set)(color.value); }

private:
    std::string part;
    ExactColor color;
};

class SetShininess : public Step {
public:
    SetShininess() = default;
    SetShininess(const std::string& materialName, float newShininess)
        : Step(materialName), shininess(newShininess) {}

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(Step::getField("super"),
                                             makeField("shininess", &SetShininess::shininess)));
    }

    std::string problem() const override {
        return firstOf({missingMaterial(), badShininess(shininess)});
    }

    std::string describe() const override {
        return command("shininess", materialName(), shininess);
    }

    void change(Material& edited) const override { edited.setShininess(shininess); }

private:
    float shininess = unset;
};

class SetTexture : public Step {
public:
    SetTexture() = default;
    SetTexture(const std::string& materialName, const std::string& textureName, float textureScale,
               float textureAngle)
        : Step(materialName), texture(textureName), scale(textureScale), angle(textureAngle) {}

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(
            name, ClassDesc(Step::getField("super"), makeField("texture", &SetTexture::texture),
                            makeField("scale", &SetTexture::scale),
                            makeField("angle", &SetTexture::angle)));
    }

    std::string problem() const override {
        return firstOf({missingMaterial(), badTexture(texture, scale, angle)});
    }

    std::string describe() const override {
        return command("texture", materialName(), '"' + texture + '"', scale, angle);
    }

    void change(Material& edited) const override { edited.setTextureData(texture, scale, angle); }

private:
    std::string texture;
    float scale = unset;
    float angle = unset;
};

class BlendMaterials : public Step {
public:
    BlendMaterials() = default;
    BlendMaterials(const std::string& materialName, const std::string& otherName)
        : Step(materialName), other(otherName) {}

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(
            name, ClassDesc(Step::getField("super"), makeField("other", &BlendMaterials::other)));
    }

    std::string problem() const override { return firstOf({missingMaterial(), unknown(other)}); }

    std::string describe() const override { return command("blend", materialName(), other); }

    void change(Material& edited) const override {
        edited.blendWith(*Materials::instance().find(other));
    }

private:
    // A name will do: when the step is redone, the other material is again what it was.
    std::string other;
};

class LoadMaterial : public Step {
public:
    LoadMaterial() = default;
    LoadMaterial(const std::string& materialName, const Material& loadedMaterial)
        : Step(materialName) {
        // A material's document rounds colours. Going through one now makes the step hold what its
        // saved form will say, so that replaying gives the same material.
        Material original = loadedMaterial;
        std::istringstream document(toXml("material", original));
        fromXml(document, "material", loaded);
    }

    boost::intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(
            name, ClassDesc(Step::getField("super"), makeField("loaded", &LoadMaterial::loaded)));
    }

    std::string problem() const override {
        return firstOf(
            {badName(materialName()), badColor(loaded.ambient()), badColor(loaded.diffuse()),
             badColor(loaded.specular()), badColor(loaded.emissive()),
             badShininess(loaded.shininess()),
             badTexture(loaded.textureName(), loaded.textureScale(), loaded.textureAngle())});
    }

    std::string describe() const override { return command("load", materialName()); }

    void change(Material& edited) const override { edited = loaded; }

private:
    Material loaded;
};

// The names are what saved histories call the classes, so they never change.
const pells::SerializableFactory<CreateMaterial> createMaterialFactory("CreateMaterial");
const pells::SerializableFactory<SetColor> setColorFactory("SetColor");
const pells::SerializableFactory<SetShininess> setShininessFactory("SetShininess");
const pells::SerializableFactory<SetTexture> setTextureFactory("SetTexture");
const pells::SerializableFactory<BlendMaterials> blendMaterialsFactory("BlendMaterials");
const pells::SerializableFactory<LoadMaterial> loadMaterialFactory("LoadMaterial");

}  // namespace

StepPtr createMaterial(const std::string& material) {
    return new CreateMaterial(material);
}

StepPtr setColor(const std::string& material, const std::string& part, const Color& color) {
    return new SetColor(material, part, color);
}

std::vector<std::string> colorParts() {
    std::vector<std::string> names;
    for (const Part& each : allParts)
        names.emplace_back(each.name);
    return names;
}

StepPtr setShininess(const std::string& material, float shininess) {
    return new SetShininess(material, shininess);
}

StepPtr setTexture(const std::string& material, const std::string& texture, float scale,
                   float angle) {
    return new SetTexture(material, texture, scale, angle);
}

StepPtr blendMaterials(const std::string& material, const std::string& other) {
    return new BlendMaterials(material, other);
}

StepPtr loadMaterial(const std::string& material, const Material& loaded) {
    return new LoadMaterial(material, loaded);
}

}  // namespace material_editor
