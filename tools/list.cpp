#include <CLI/CLI.hpp>
#include <cstdint>
#include <iomanip>
#include <memory>
#include <sstream>
#include <string>

#include "tools/atomic_file.h"
#include "tools/commands.h"
#include "tools/open_archive.h"
#include "tools/standard_output.h"
#include "tools/text.h"

namespace pells_tool {

namespace {

void list(const std::string& file) {
    const auto archive = openArchive(file);
    const std::uint64_t size = sizeOfFile(file);
    std::size_t outside = 0;
    for (const auto& member : archive->getDirectory()) {
        std::ostringstream line;
        line << std::setw(10) << member.second.length << "  " << printable(member.first) << '\n';
        writeOut(line.str());
        const std::uint64_t offset = static_cast<std::uint64_t>(member.second.offset);
        outside += offset + member.second.length > size ? 1 : 0;
    }
    flushOut();
    if (outside != 0)
        throw pells::FileError(file, counted(outside, "member") + " of " +
                                         std::to_string(archive->getDirectory().size()) +
                                         " reach beyond the end of the file");
}

}  // namespace

void addList(CLI::App& app) {
    const auto file = std::make_shared<std::string>();
    CLI::App* const command =
        app.add_subcommand("list", "Show the members of an archive, one per line");
    command->add_option("FILE", *file, "The archive")->required()->type_name("");
    command->footer("Each line has the stored (compressed) size in bytes and the name.");
    command->callback([file] { list(*file); });
}

}  // namespace pells_tool
