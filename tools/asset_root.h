#pragma once

#include <string>

namespace pells_tool {

class ErrorLines;

/// Makes the library's asset manager for a folder, and prints a warning for everything in it that
/// cannot be read.
///
/// \param logRules rules for log tags, besides that errors are logged.
/// \throws pells::FileError when the folder cannot be used.
void openAssetRoot(const std::string& root, const std::string& logRules, ErrorLines& errors);

/// Prints a line "pells: warning: ..." on standard error.
void warn(const std::string& what);

}  // namespace pells_tool
