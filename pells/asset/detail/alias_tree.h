#pragma once

#include <boost/shared_ptr.hpp>
#include <map>
#include <string>

#include "pells/asset/asset_manager.h"
#include "pells/asset/detail/asset_index.h"
#include "pells/asset/detail/folder_walk.h"

namespace pells::detail {

/// The tree of asset folders that exists while an asset manager is constructed, and the aliases
/// that its ".symlinks" files declare.
class AliasTree {
public:
    /// The name of an asset by its alias.
    typedef std::map<std::string, std::string> Aliases;

    /// Both outlive the tree.
    AliasTree(const AssetIndex& assetIndex, AssetManager& linkFileManager);

    /// Walks over all folders. Throws what reading a damaged ".symlinks" file throws.
    ///
    /// \param limit see AssetManager::getAliasLimit().
    Aliases build(std::size_t limit);

private:
    struct Folder;

    boost::shared_ptr<Folder> readFolder(const std::string& path, const std::string& name,
                                         const std::string& separator, FolderWalk& walk);
    void readLinks(Folder& folder, FolderWalk& walk);
    void addAliases(const boost::shared_ptr<Folder>& folder, const std::string& prefix, bool linked,
                    FolderWalk& walk);
    bool addAlias(const std::string& from, const std::string& to, FolderWalk& walk);

    const AssetIndex& index;
    AssetManager& manager;
    Aliases aliases;
};

}  // namespace pells::detail
