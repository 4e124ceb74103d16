#pragma once

#include <pells/material/material.h>
#include <pells/serial/field.h>
#include <pells/undo/undoable_step.h>

#include <optional>
#include <string>
#include <vector>

namespace material_editor {

/// One edit of one material, named by the material's name in Materials.
///
/// A derived class says what may be wrong with it, how it changes a material, and what its fields
/// are. This class does, undoes and replays it.
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

typedef boost::intrusive_ptr<Step> StepPtr;

/// Makes a material with the default values.
StepPtr createMaterial(const std::string& material);

/// Sets one of the colours. \param part one of colorParts().
StepPtr setColor(const std::string& material, const std::string& part, const pells::Color& color);

/// What can be coloured: "ambient", "ambient-and-diffuse", and so on.
std::vector<std::string> colorParts();

StepPtr setShininess(const std::string& material, float shininess);

/// Sets the texture's name, scale and angle in degrees; an empty name takes the texture away.
StepPtr setTexture(const std::string& material, const std::string& texture, float scale,
                   float angle);

/// Mixes another material into one, half and half.
StepPtr blendMaterials(const std::string& material, const std::string& other);

/// Puts a whole material, read from a file, in the place of one or beside the others.
///
/// The step holds the material itself: a history replays without the file.
StepPtr loadMaterial(const std::string& material, const pells::Material& loaded);

}  // namespace material_editor
