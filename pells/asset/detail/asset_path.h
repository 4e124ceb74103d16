#pragma once

#include <boost/filesystem/operations.hpp>
#include <boost/filesystem/path.hpp>
#include <string>

namespace pells::detail {

/// The asset root as the preferences name it now.
std::string assetRoot();

/// The path of an asset below the root. An asset name that begins with "/" stays below it.
boost::filesystem::path assetPath(const std::string& name);

/// What there is at a path, behind links; file_not_found or status_error when that is nothing.
boost::filesystem::file_type typeOf(const boost::filesystem::path& path);

/// What exists below the root under an asset's name.
boost::filesystem::file_type typeOfAsset(const std::string& name);

/// Whether a name can be one of the file system's: those cannot hold a zero byte.
inline bool isNativeName(const std::string& name) {
    return name.find('\0') == std::string::npos;
}

}  // namespace pells::detail
