#pragma once

#include <pells/core/singleton.h>
#include <pells/material/material.h>

#include <map>
#include <string>

namespace material_editor {

/// The materials that are being edited, by name.
///
/// A singleton, because steps that are read from a file are made by factories, which hand them
/// nothing: a step knows a material's name and finds it here.
class Materials : public pells::Singleton<Materials> {
public:
    typedef std::map<std::string, pells::Material> Map;

    /// The material of a name, or null. Valid until it is put or removed.
    const pells::Material* find(const std::string& name) const;

    /// Adds a material or replaces the one of that name.
    void put(const std::string& name, const pells::Material& material);
    void remove(const std::string& name);

    const Map& all() const { return materials; }

    /// Exchanges all materials.
    void swap(Map& others) { materials.swap(others); }

private:
    friend class pells::SingletonFactory<Materials>;
    Materials() = default;

    Map materials;
};

}  // namespace material_editor
