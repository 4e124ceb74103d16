#pragma once

#include <pells/serial/serializable.h>

#include <istream>
#include <string>

namespace material_editor {

/// An object as an XML document. Floats have nine digits, so that reading them gives the same ones;
/// only the library's form of a colour keeps to six.
std::string toXml(const std::string& rootName, pells::Serializable& object);

/// Reads an object from an XML document.
///
/// \throws std::runtime_error (Serializable::LoadFail is one) for a document without that root
///         element, or one that is damaged; the object keeps what was read until then.
void fromXml(std::istream& in, const std::string& rootName, pells::Serializable& object);

/// fromXml() on a file. What is thrown begins with the file's name.
void readFile(const std::string& path, const std::string& rootName, pells::Serializable& object);

/// Writes a file, or replaces one, in whole or not at all, also where the power fails: see
/// pells::kit::AtomicFile. A symbolic link stays, and what it points to is replaced.
///
/// \throws std::runtime_error when that fails; the file is then as it was.
void writeFile(const std::string& path, const std::string& text);

}  // namespace material_editor
