#include <CLI/CLI.hpp>
#include <memory>
#include <string>

#include "tools/archive_writer.h"
#include "tools/commands.h"

namespace pells_tool {

namespace {

struct PackOptions {
    std::string output;
    std::string folder;
};

void pack(const PackOptions& options) {
    pells::ArchiveWriter archive(options.output);
    archive.addFolder(options.folder);
    archive.finish();
}

}  // namespace

void addPack(CLI::App& app) {
    const auto options = std::make_shared<PackOptions>();
    CLI::App* const command =
        app.add_subcommand("pack", "Store every file below a folder in an archive");
    command->add_option("-o,--output", options->output, "The archive to make or replace")
        ->required()
        ->type_name("FILE");
    command->add_option("DIR", options->folder, "The folder; hidden files are stored, too")
        ->required()
        ->type_name("");
    command->footer(
        "Members are named by their paths relative to DIR. A symbolic link to a file below DIR is\n"
        "stored as a copy of that file; any other link, device, pipe or socket is an error.");
    command->callback([options] { pack(*options); });
}

}  // namespace pells_tool
