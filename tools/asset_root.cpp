#include "tools/asset_root.h"

#include <boost/filesystem/exception.hpp>
#include <boost/filesystem/operations.hpp>
#include <cstdio>
#include <regex>

#include "pells/asset/asset_manager.h"
#include "tools/atomic_file.h"
#include "tools/error_lines.h"
#include "tools/open_archive.h"
#include "tools/text.h"

namespace pells_tool {

namespace {

/// Every folder is asked for its ".symlinks", and most have none.
bool isMissingSymlinks(const std::string& message) {
    const std::string ending = ".symlinks";
    return message.compare(0, 14, "Couldn't open ") == 0 && message.size() > ending.size() &&
           message.compare(message.size() - ending.size(), ending.size(), ending) == 0;
}

/// The archive that a message of the scan names.
std::string archiveOf(const std::string& message) {
    static const std::regex refusal("Bad \\.asset file: ([^]*\\.asset): [^]*");
    std::smatch match;
    return std::regex_match(message, match, refusal) ? match[1].str() : "";
}

/// The library takes archives that are cut off for archives without members.
void warnOfCutArchives(const std::string& root) {
    boost::system::error_code ignored;
    for (const auto& entry : boost::filesystem::directory_iterator(root, ignored)) {
        const std::string path = entry.path().string();
        if (entry.path().extension() != ".asset" || !whyNotReadable(path).empty())
            continue;
        const std::string reason = whereDirectoryIsMissing(path);
        if (!reason.empty())
            warn(pells::FileError("Bad .asset file: " + path, reason).what());
    }
}

}  // namespace

void openAssetRoot(const std::string& root, ErrorLines& errors) {
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
            warn(inWords(message, archiveOf(message)));
    }
    warnOfCutArchives(root);
}

std::string inWords(const std::string& message, const std::string& path) {
    static const std::regex damage(
        "(?:std::exception error was thrown!!)?ZlibInflater::read\\(\\): bad pell data stream for "
        "member '([^]*)': Z_\\w+ \\(-?\\d+\\)(: [^]*)?");
    static const std::regex cut("Can't read pell data stream for member '([^]*)'");
    static const std::string closed = "Can't open pell file";
    std::string text = std::regex_replace(message, damage, "The data of member '$1' is damaged$2");
    text = std::regex_replace(text, cut, "The file ends inside the data of member '$1'");
    const std::string::size_type at = text.find(closed);
    const std::string reason = at == std::string::npos ? "" : whyNotReadable(path);
    if (!reason.empty())
        text.replace(at, closed.size(), reason);
    if (text == "tga image too large")
        text += " (--max-pixels sets the limit)";
    if (text.compare(0, 4, "XML ") == 0)
        text += " (--max-document sets the limit)";
    return text;
}

void warn(const std::string& what) {
    std::fprintf(stderr, "pells: warning: %s\n", printable(what).c_str());
}

}  // namespace pells_tool
