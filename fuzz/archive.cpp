// Any bytes as an archive: every member is read, in large and small pieces and by its name with
// backslashes, and reads the same each time.

#include <algorithm>
#include <vector>

#include "fuzz/support/fuzz.h"
#include "pells/asset/pell_archive.h"
#include "support/archive_bytes.h"

namespace {

// A member may inflate a thousandfold, and there may be thousands.
const std::size_t longest = 100000;
const std::size_t mostMembers = 50;

/// What a member holds, or nothing if reading it fails.
std::string contentOf(pells::pellistream& archive, const std::string& name, std::size_t piece) {
    std::string content;
    std::vector<char> into(piece);
    try {
        pells_fuzz::require(archive.open(name), "a listed member opens");
        do {
            archive.read(into.data(), static_cast<std::streamsize>(piece));
            content.append(into.data(), static_cast<std::size_t>(archive.gcount()));
        } while (archive && content.size() < longest);
    } catch (const pells::pellibuf::BadPellFile&) {
        return "";
    } catch (const pells::ZlibWrapper::ZlibError&) {
        return "";
    }
    content.resize(std::min(content.size(), longest));
    return content;
}

std::string withBackslashes(std::string name) {
    std::replace(name.begin(), name.end(), '/', '\\');
    return name;
}

void readMembers(pells::pellistream& archive) {
    const std::vector<std::string> names(archive.begin(), archive.end());
    for (std::size_t at = 0; at < std::min(names.size(), mostMembers); ++at) {
        const std::string content = contentOf(archive, names[at], 2000);
        pells_fuzz::require(contentOf(archive, names[at], 2000) == content, "reads the same again");
        // Of data that is cut off, how much comes out depends on where the reader's pieces end.
        const std::string slowly = contentOf(archive, names[at], 7);
        const std::size_t both = std::min(content.size(), slowly.size());
        pells_fuzz::require(content.compare(0, both, slowly, 0, both) == 0,
                            "reads the same in small pieces");
        if (names[at].find('\\') == std::string::npos)
            contentOf(archive, withBackslashes(names[at]), 2000);
    }
}

}  // namespace

void fuzzOne(const std::string& input) {
    try {
        pells::pellistream archive(pells_test::writeArchiveFile(pells_fuzz::scratch(), input));
        readMembers(archive);
    } catch (const pells::pellibuf::BadPellFile&) {
    }
}
