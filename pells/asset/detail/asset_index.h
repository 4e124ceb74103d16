#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "pells/asset/asset_manager.h"
#include "pells/asset/pell_archive.h"

namespace pells::detail {

/// What serves a name. There is one for each name in the archives, so it keeps no copy of the name,
/// and openers are made when they are asked for.
struct AssetSource {
    static constexpr std::uint32_t newerFile = static_cast<std::uint32_t>(-1);

    const std::string& name() const { return member->first; }
    bool isNewerFile() const { return archive == newerFile; }

    const pellistream::Directory::value_type* member;
    std::uint32_t archive;  ///< its place among the archives, or newerFile
};

/// The archives of an asset root, and for each name in them which one serves it, or a newer file.
class AssetIndex {
public:
    struct Archive {
        std::string path;
        std::unique_ptr<pellistream> stream;
        std::int64_t writeTime;  ///< seconds since 1970
    };

    typedef AssetSource Source;

    struct ByName {
        typedef void is_transparent;
        bool operator()(const Source& a, const Source& b) const { return a.name() < b.name(); }
        bool operator()(const Source& a, const std::string& b) const { return a.name() < b; }
        bool operator()(const std::string& a, const Source& b) const { return a < b.name(); }
    };
    typedef std::set<Source, ByName> Sources;
    typedef Sources::const_iterator Iterator;
    typedef std::pair<Iterator, Iterator> Range;

    /// Opens the archives in a folder, and looks for files below it that are newer.
    ///
    /// \throws boost::filesystem::filesystem_error when the folder cannot be listed.
    explicit AssetIndex(const std::string& root);
    ~AssetIndex();

    /// What serves a name; null when no archive has it.
    const Source* find(const std::string& name) const;

    /// The names below a folder, in byte order; all names for "".
    Range below(const std::string& folder) const;

    /// Whether archives have names below a folder.
    bool hasBelow(const std::string& folder) const;

    /// The first entry at or behind a text in byte order.
    Iterator lowerBound(const std::string& text) const { return sources.lower_bound(text); }

    const std::vector<Archive>& getArchives() const { return archives; }
    const Archive& archiveOf(const Source& source) const { return archives[source.archive]; }

    /// The path of a newer file.
    const std::string& pathOf(const Source& source) const;

    boost::intrusive_ptr<baseiStreamContainer> open(const Source& source, bool flag) const;

    /// What a name counts for beside its characters.
    static constexpr std::uint64_t nameOverhead = 32;

    /// The characters in the names of all members, and the overhead for each.
    std::uint64_t getMemberText() const { return memberText; }

private:
    class HashTable;

    void scanRoot(const std::string& root);
    void addArchive(const std::string& path);
    void addMembers(std::uint32_t archive);
    static void replace(Iterator entry, const Source& source);
    void preferNewerFiles(const std::string& root);

    std::vector<Archive> archives;
    Sources sources;
    std::map<std::string, boost::intrusive_ptr<AssetManager::Opener>> newerFiles;
    std::unique_ptr<HashTable> hashTable;
    std::uint64_t memberText = 0;
};

}  // namespace pells::detail
