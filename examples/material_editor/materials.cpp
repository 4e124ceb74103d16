#include "materials.h"

namespace material_editor {

const pells::Material* Materials::find(const std::string& name) const {
    const auto found = materials.find(name);
    return found == materials.end() ? nullptr : &found->second;
}

void Materials::put(const std::string& name, const pells::Material& material) {
    materials[name] = material;
}

void Materials::remove(const std::string& name) {
    materials.erase(name);
}

}  // namespace material_editor
