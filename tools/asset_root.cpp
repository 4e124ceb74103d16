#include "tools/asset_root.h"

#include <boost/filesystem/exception.hpp>
#include <cstdio>

#include "pells/asset/asset_manager.h"
#include "tools/atomic_file.h"
#include "tools/error_lines.h"
#include "tools/library_prefs.h"
#include "tools/text.h"

namespace pells_tool {

namespace {

/// Every folder is asked for its ".symlinks", and most have none.
bool isMissingSymlinks(const std::string& message) {
    const std::string ending = ".symlinks";
    return message.compare(0, 14, "Couldn't open ") == 0 && message.size() > ending.size() &&
           message.compare(message.size() - ending.size(), ending.size(), ending) == 0;
}

}  // namespace

void openAssetRoot(const std::string& root, const std::string& logRules, ErrorLines& errors) {
    setLibraryPrefs(root, logRules);
    try {
        pells::AssetManager::instance();
    } catch (const boost::filesystem::filesystem_error& error) {
        throw pells::FileError(error.path1().empty() ? root : error.path1().string(),
                               error.code().message());
    } catch (const std::exception& error) {
        throw pells::FileError(root, std::string(error.what()));
    }
    for (const std::string& message : errors.take()) {
        if (!isMissingSymlinks(message))
            warn(message);
    }
}

void warn(const std::string& what) {
    std::fprintf(stderr, "pells: warning: %s\n", printable(what).c_str());
}

}  // namespace pells_tool
