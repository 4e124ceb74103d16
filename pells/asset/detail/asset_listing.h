#pragma once

#include <boost/filesystem/path.hpp>
#include <boost/system/error_code.hpp>
#include <string>
#include <vector>

#include "pells/asset/detail/asset_index.h"

namespace pells::detail {

/// Lists one folder of the asset name space: what archives have in it and what lies there on disk,
/// which is looked at once.
class AssetListing {
public:
    typedef std::vector<std::string> Names;

    /// \param assetIndex outlives the listing.
    /// \param listedDir  as it was asked for; outlives the listing.
    /// \param onDisk     false: only the archives are listed.
    AssetListing(const AssetIndex& assetIndex, const std::string& listedDir, bool onDisk);

    /// The names of the files directly inside the folder, each once. What cannot be listed is
    /// reported under "error".
    Names files() const;

    /// The same of the folders.
    Names folders() const;

private:
    class Prefix;

    void readDisk();
    void addFilesInArchives(const Prefix& prefix, Names& names) const;
    void addFoldersInArchives(const Prefix& prefix, Names& names) const;
    AssetIndex::Iterator behindFolder(AssetIndex::Iterator entry, std::string::size_type slash,
                                      const Prefix& prefix) const;
    void addFilesOnDisk(const Prefix& prefix, Names& names) const;
    void addFoldersOnDisk(const Prefix& prefix, Names& names) const;
    void reportError(const Prefix& prefix) const;

    const AssetIndex& index;
    const std::string& dir;
    /// The folder's asset name, and that with "/" behind it unless it is "".
    std::string folder;
    std::string start;
    Names diskFiles;
    Names diskFolders;
    boost::filesystem::path diskPath;
    boost::system::error_code error;
};

}  // namespace pells::detail
