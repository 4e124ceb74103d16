#pragma once

#include <boost/filesystem/path.hpp>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace pells::detail {

/// What a walk over the folders of assets remembers: the folders that it is in, and how much more
/// it may do.
class FolderWalk {
public:
    /// \param memberText see AssetIndex::getMemberText().
    /// \param aliasLimit see AssetManager::getAliasLimit().
    FolderWalk(std::uint64_t memberText, std::size_t aliasLimit);

    /// Goes into a child of the current folder; false when that is not to be searched.
    ///
    /// \param path       asset name of the child.
    /// \param inArchives archives have members in it.
    /// \param linked     a link stands for it.
    bool enter(const std::string& path, const std::string& name, bool inArchives, bool linked);

    void leave() { chain.pop_back(); }

    /// Whether the real folder is to be listed, too.
    bool isOnDisk() const { return chain.back().onDisk; }

    /// Whether the name of the current folder goes through "..", as only an archive's members can:
    /// they must not make the walk read the folders around the root.
    bool isOutside() const { return chain.back().outside; }

    /// Whether a link stands for the current folder or for one that it is in.
    bool isLinked() const { return chain.back().linked; }

    /// Charges a line of a ".symlinks" file; false when there has been too much text.
    bool chargeLine(std::size_t length) { return spend(textLeft, 128 + length); }

    /// Charges a name that goes through a link; false when there have been too many.
    bool chargeName(std::size_t length) { return spend(namesLeft, 16 + length); }

    /// Whether one more alias may be added; if not, there will be no more at all.
    bool mayGrow(std::size_t aliasCount) { return aliasCount < limit || exhaust(namesLeft); }

private:
    struct Folder {
        boost::filesystem::path real;
        bool onDisk;
        bool behindLink;
        bool linked;
        bool outside;
    };

    bool isEntered(const boost::filesystem::path& path) const;
    bool chargeLinkedFolder();
    bool chargePath(const std::string& path);
    void reportDepth(const std::string& path);
    bool spend(std::uint64_t& left, std::uint64_t cost);
    bool exhaust(std::uint64_t& left);
    std::uint64_t inProportion(std::uint64_t bytesPerAlias) const;

    std::vector<Folder> chain;
    const std::size_t limit;
    std::uint64_t textLeft;
    std::uint64_t namesLeft;
    std::uint64_t linkedFoldersLeft;
    std::uint64_t pathsLeft;
    bool depthReported = false;
    bool excessReported = false;
};

}  // namespace pells::detail
