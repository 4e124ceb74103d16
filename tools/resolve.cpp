#include <CLI/CLI.hpp>
#include <memory>
#include <string>
#include <vector>

#include "pells/asset/asset_manager.h"
#include "tools/asset_root.h"
#include "tools/atomic_file.h"
#include "tools/commands.h"
#include "tools/error_lines.h"
#include "tools/library_prefs.h"
#include "tools/standard_output.h"
#include "tools/text.h"

namespace pells_tool {

namespace {

typedef pells::AssetManager::Resolution Resolution;

struct ResolveOptions {
    std::string root;
    LibraryOptions library;
    std::vector<std::string> names;
};

std::string joined(const std::vector<std::string>& pieces) {
    std::string text;
    for (const std::string& piece : pieces) {
        text += text.empty() ? "" : ", ";
        text += piece;
    }
    return text;
}

std::string describe(const Resolution& found) {
    switch (found.source) {
        case Resolution::ARCHIVE_MEMBER:
            return "member " + found.member + " of " + found.path;
        case Resolution::NEWER_FILE:
            return "plain file " + found.path;
        case Resolution::FILE_SYSTEM:
            return "plain file " + found.path + ", in no archive";
        default:
            return "nowhere";
    }
}

std::string describeOthers(const Resolution& found) {
    if (found.overridden.empty())
        return "";
    const std::string others = joined(found.overridden);
    if (found.source == Resolution::NEWER_FILE)
        return ", newer than the copy in " + others;
    if (found.tie)
        return ", rather than " + others +
               " (equal write times: the archive that the folder lists first)";
    return ", newer than " + others;
}

std::string lineFor(const std::string& name, const Resolution& found) {
    const std::string alias = found.alias.empty() ? "" : "alias of " + found.alias + ", ";
    return name + ": " + alias + describe(found) + describeOthers(found);
}

void resolve(const ResolveOptions& options) {
    setUpLibrary(options.root, options.library);
    ErrorLines errors;
    openAssetRoot(options.root, errors);
    std::size_t missing = 0;
    for (const std::string& name : options.names) {
        const Resolution found = pells::AssetManager::instance().resolve(name);
        writeOut(printable(lineFor(name, found)) + "\n");
        missing += found.source == Resolution::NOWHERE ? 1 : 0;
    }
    flushOut();
    if (missing != 0)
        throw pells::FileError(options.root, counted(missing, "name") + " of " +
                                                 std::to_string(options.names.size()) +
                                                 " not found");
}

}  // namespace

void addResolve(CLI::App& app) {
    const auto options = std::make_shared<ResolveOptions>();
    CLI::App* const command =
        app.add_subcommand("resolve", "Say where the assets of a folder come from");
    command->add_option("ROOT", options->root, "The asset root")->required()->type_name("");
    command->add_option("NAME", options->names, "Names of assets")->required()->type_name("");
    addLogOptions(*command, options->library);
    command->footer(
        "Where archives that hold a name have equal write times, the one serves that the file\n"
        "system lists first: copying them may change the answer.");
    command->callback([options] { resolve(*options); });
}

}  // namespace pells_tool
