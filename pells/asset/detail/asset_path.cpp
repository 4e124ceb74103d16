#include "pells/asset/detail/asset_path.h"

#include <boost/filesystem/operations.hpp>

#include "pells/core/prefs.h"

namespace pells::detail {

namespace fs = boost::filesystem;

std::string assetRoot() {
    return Prefs::instance().getString("assetLocation");
}

fs::path assetPath(const std::string& name) {
    return fs::path(assetRoot()) / name;
}

fs::file_type typeOf(const fs::path& path) {
    boost::system::error_code ignored;
    return fs::status(path, ignored).type();
}

fs::file_type typeOfAsset(const std::string& name) {
    return isNativeName(name) ? typeOf(assetPath(name)) : fs::file_not_found;
}

}  // namespace pells::detail
