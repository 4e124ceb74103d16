#pragma once

#include <pells/material/material.h>
#include <pells/serial/field.h>
#include <pells/undo/undoable_step.h>

#include <limits>
#include <optional>
#include <string>
#include <vector>

#include "exact_color.h"

namespace material_editor {

/// One edit of one material, named by the material's name in Materials.
///
/// A derived class says what may be wrong with it, how it changes a material, and what its fields
/// are. This class does, undoes and replays it. The default constructors are for the factories,
/// which make a step before its fields are read: numbers begin as NaN, so that a field that a file
/// lacks is found by problem().
class Step : public pells::UndoableStep {
public:
    /// Reads the step, which replays it.
    ///
    /// \throws Serializable::LoadFail for a step that cannot be replayed, too. The library would
    ///         drop it in silence, and what follows would build on the gap.
    void load(pells::InTag& tag, boost::intrusive_ptr<pells::Field> field) override;
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;

    /// Puts the material back as it was before the step, or removes the one that the step made.
    bool undo() override;

    /// Does the step, also for the first time. False, and nothing changes, when there is a
    /// problem().
    bool redo() override;

    /// False for a step that was never done; histories drop it.
    bool isValid() const override;

    /// Why the step cannot be done to the materials as they are; empty when it can.
    virtual std::string problem() const = 0;

    /// The step as a command, for people.
    virtual std::string describe() const = 0;

protected:
    Step() = default;
    explicit Step(const std::string& materialName) : material(materialName) {}

    const std::string& materialName() const { return material; }

    /// The problem of a step that needs its material to exist.
    std::string missingMaterial() const;

    /// Changes the material, a new one if there was none. Called only without a problem().
    virtual void change(pells::Material& edited) const = 0;

private:
    std::string material;

    // What undo() needs. All of the material is kept: setting a colour also changes whether ambient
    // and diffuse go together, which no setter could put back. Not saved: replaying finds it again.
    std::optional<pells::Material> before;
    bool done = false;
};

/// Makes a material with the default values.
class CreateMaterial : public Step {
public:
    CreateMaterial() = default;
    explicit CreateMaterial(const std::string& materialName) : Step(materialName) {}

    // Without fields of its own, it is saved as a Step is.
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;
};

/// Sets one of the colours.
class SetColor : public Step {
public:
    SetColor() = default;
    SetColor(const std::string& materialName, const std::string& partName,
             const pells::Color& newColor);

    /// What can be coloured: "ambient", "ambient-and-diffuse", and so on.
    static std::vector<std::string> parts();

    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;

private:
    std::string part;
    ExactColor color;
};

class SetShininess : public Step {
public:
    SetShininess() = default;
    SetShininess(const std::string& materialName, float newShininess);

    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;

private:
    float shininess = std::numeric_limits<float>::quiet_NaN();
};

/// Sets the texture's name, scale and angle in degrees; an empty name takes the texture away.
class SetTexture : public Step {
public:
    SetTexture() = default;
    SetTexture(const std::string& materialName, const std::string& textureName, float textureScale,
               float textureAngle);

    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;

private:
    std::string texture;
    float scale = std::numeric_limits<float>::quiet_NaN();
    float angle = std::numeric_limits<float>::quiet_NaN();
};

/// Mixes another material into one, half and half.
class BlendMaterials : public Step {
public:
    BlendMaterials() = default;
    BlendMaterials(const std::string& materialName, const std::string& otherName);

    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;

private:
    // A name will do: when the step is redone, the other material is again what it was.
    std::string other;
};

/// Puts a whole material, read from a file, in the place of one or beside the others.
///
/// The step holds the material itself: a history replays without the file.
class LoadMaterial : public Step {
public:
    LoadMaterial() = default;
    LoadMaterial(const std::string& materialName, const pells::Material& loadedMaterial);

    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;
    std::string problem() const override;
    std::string describe() const override;

protected:
    void change(pells::Material& edited) const override;

private:
    pells::Material loaded;
};

}  // namespace material_editor
