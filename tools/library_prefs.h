#pragma once

#include <string>

namespace pells_tool {

/// Sets what the library asks its preferences for; to be called before anything logs.
///
/// \param assetRoot the folder of assets.
/// \param logRules  rules for log tags, added to the default that errors are logged.
void setLibraryPrefs(const std::string& assetRoot, const std::string& logRules);

}  // namespace pells_tool
