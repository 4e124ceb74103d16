#pragma once

#include <string>

namespace pells {
class Material;
}

namespace pells_tool {

/// Reads a material from an XML document, whose root element may have any name.
///
/// \throws pells::FileError when the file cannot be read or is no such document.
pells::Material readMaterial(const std::string& path);

}  // namespace pells_tool
