#pragma once

#include <string>

namespace pells_tool {

class ErrorLines;

/// Makes the library's asset manager for a folder, after setUpLibrary(), and prints a warning for
/// everything in it that cannot be read.
///
/// \throws pells::FileError when the folder cannot be used.
void openAssetRoot(const std::string& root, ErrorLines& errors);

/// A message of the library in words for people.
///
/// \param path of the archive that it speaks of, if it does of one.
std::string inWords(const std::string& message, const std::string& path = std::string());

/// Prints a line "pells: warning: ..." on standard error.
void warn(const std::string& what);

}  // namespace pells_tool
