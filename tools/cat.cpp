#include <CLI/CLI.hpp>
#include <memory>
#include <string>
#include <vector>

#include "tools/atomic_file.h"
#include "tools/commands.h"
#include "tools/open_archive.h"
#include "tools/standard_output.h"

namespace pells_tool {

namespace {

struct CatOptions {
    std::string file;
    std::string member;
};

/// Reads the next bytes of the selected member; 0 at its end.
std::size_t readSome(pells::pellistream& archive, std::vector<char>& into,
                     const CatOptions& options) {
    try {
        archive.read(into.data(), static_cast<std::streamsize>(into.size()));
        return static_cast<std::size_t>(archive.gcount());
    } catch (const std::exception& error) {
        throw pells::FileError(options.file + ": member '" + options.member + "'",
                               std::string(error.what()));
    }
}

void cat(const CatOptions& options) {
    const auto archive = openArchive(options.file);
    if (!archive->open(options.member))
        throw pells::FileError(options.file, "The archive has no member '" + options.member + "'");
    std::vector<char> block(65536);
    while (const std::size_t count = readSome(*archive, block, options))
        writeOut(block.data(), count);
}

}  // namespace

void addCat(CLI::App& app) {
    const auto options = std::make_shared<CatOptions>();
    CLI::App* const command =
        app.add_subcommand("cat", "Write the bytes of a member to standard output");
    command->add_option("FILE", options->file, "The archive")->required()->type_name("");
    command->add_option("MEMBER", options->member, "The member's name")->required()->type_name("");
    command->callback([options] { cat(*options); });
}

}  // namespace pells_tool
