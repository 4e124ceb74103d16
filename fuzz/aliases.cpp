// Any tree of members with ".symlinks" files among them. The input is a list of members, each "NAME
// LF CONTENT", with zero bytes between them.

#include <cstdio>
#include <vector>

#include "fuzz/support/fuzz.h"
#include "pells/asset/asset_manager.h"
#include "pells/core/strings.h"
#include "support/archive_bytes.h"
#include "support/test_prefs.h"

namespace {

using pells_test::Members;

Members membersOf(const std::string& input) {
    std::vector<std::string> pieces;
    pells::string_split(input, std::string(1, '\0'), pieces);
    Members members;
    for (const std::string& piece : pieces) {
        const std::size_t end = piece.find('\n');
        const std::string name = piece.substr(0, end);
        if (name.find('\r') == std::string::npos)
            members.emplace_back(name, end == std::string::npos ? "" : piece.substr(end + 1));
    }
    return members;
}

/// Asks for everything that a line of a ".symlinks" file may have made a name of.
void askForLinks(const std::string& folder, const std::string& lines) {
    auto& manager = pells::AssetManager::instance();
    std::vector<std::string> names;
    pells::string_split(lines, ">\n", names);
    for (const std::string& name : names) {
        for (const char* const below : {"", "/f", "/g/f"}) {
            const std::string asked = folder + name + below;
            const auto found = manager.resolve(asked);
            const bool opens = manager.getFileStream(asked, true) != nullptr;
            pells_fuzz::require(opens == (found.source != pells::AssetManager::Resolution::NOWHERE),
                                "what resolves can be opened");
            pells_fuzz::require(found.alias.empty() || opens, "an alias stands for an asset");
        }
    }
}

}  // namespace

void fuzzOne(const std::string& input) {
    const Members members = membersOf(input);
    std::remove("root/tree.asset");
    pells_fuzz::scratch().write("root/tree.asset", pells_test::archiveOf(members));
    pells_test::prefs()["assetLocation"] = "root";
    pells::AssetManager::setAliasLimit(1000);
    for (const auto& member : members) {
        const std::string marker = ".symlinks";
        if (member.first.size() < marker.size())
            continue;
        const std::size_t end = member.first.size() - marker.size();
        if (member.first.compare(end, marker.size(), marker) == 0)
            askForLinks(member.first.substr(0, end), member.second);
    }
    pells::AssetManager::instance().listfiles("", true);
}
