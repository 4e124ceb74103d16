#include <unistd.h>

#include <CLI/CLI.hpp>
#include <boost/filesystem/operations.hpp>
#include <memory>
#include <string>
#include <vector>

#include "tools/archive_writer.h"
#include "tools/commands.h"
#include "tools/folder_files.h"
#include "tools/standard_output.h"

namespace pells_tool {

namespace {

namespace fs = boost::filesystem;

struct PackOptions {
    std::string output;
    std::string folder;
};

void packInto(const std::string& output, const std::string& folder) {
    pells::ArchiveWriter archive(output);
    archive.addFolder(folder);
    archive.finish();
}

/// An archive's header holds what is known at its end, so it cannot be written to a pipe as it
/// comes: it is made in a file without a name first.
void packToStandardOutput(const std::string& folder) {
    if (::isatty(STDOUT_FILENO) == 1)
        throw pells::FileError("standard output", std::string("It is a terminal"));
    const fs::path path = fs::temp_directory_path() / fs::unique_path(".pells-%%%%-%%%%-%%%%.tmp");
    packInto(path.string(), folder);
    pells::SourceFile archive(path.string());
    fs::remove(path);
    std::vector<char> block(65536);
    while (const std::size_t count = archive.read(block.data(), block.size()))
        writeOut(block.data(), count);
}

void pack(const PackOptions& options) {
    if (options.output == "-")
        packToStandardOutput(options.folder);
    else
        packInto(options.output, options.folder);
}

}  // namespace

void addPack(CLI::App& app) {
    const auto options = std::make_shared<PackOptions>();
    CLI::App* const command =
        app.add_subcommand("pack", "Store every file below a folder in an archive");
    command
        ->add_option("-o,--output", options->output,
                     "The archive to make or replace; - for standard output")
        ->required()
        ->type_name("FILE");
    command->add_option("DIR", options->folder, "The folder; hidden files are stored, too")
        ->required()
        ->type_name("");
    command->footer(
        "Members are named by their paths relative to DIR. A symbolic link to a file below DIR is\n"
        "stored as a copy of that file; any other link, device, pipe or socket is an error. Files\n"
        "that are being written by this tool, .pells-XXXX-XXXX-XXXX.tmp, are left out.");
    command->callback([options] { pack(*options); });
}

}  // namespace pells_tool
