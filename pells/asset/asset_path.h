#pragma once

#include <boost/filesystem/path.hpp>
#include <string>

namespace pells {

/// The asset root as the preferences name it now.
std::string assetRoot();

/// The path of an asset below the root. An asset name that begins with "/" stays below it.
boost::filesystem::path assetPath(const std::string& name);

/// Whether a name can be one of the file system's: those cannot hold a zero byte.
inline bool isNativeName(const std::string& name) {
    return name.find('\0') == std::string::npos;
}

}  // namespace pells
