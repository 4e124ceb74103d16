#include <CLI/CLI.hpp>
#include <memory>
#include <string>
#include <vector>

#include "pells/asset/asset_manager.h"
#include "tools/atomic_file.h"
#include "tools/commands.h"
#include "tools/member_reader.h"
#include "tools/open_archive.h"
#include "tools/standard_output.h"

namespace pells_tool {

namespace {

struct CatOptions {
    std::string file;
    std::string member;
};

/// The entry of a member; like the library, takes "\\" for "/" where no name has it.
const pells::pellistream::Directory::value_type& findMember(const pells::pellistream& archive,
                                                            const CatOptions& options) {
    const auto& directory = archive.getDirectory();
    auto entry = directory.find(options.member);
    if (entry == directory.end())
        entry = directory.find(pells::AssetManager::fixName(options.member));
    if (entry == directory.end())
        throw pells::FileError(options.file, "The archive has no member '" + options.member + "'");
    return *entry;
}

void cat(const CatOptions& options) {
    const auto archive = openArchive(options.file);
    MemberReader member(options.file, findMember(*archive, options));
    std::vector<char> block(65536);
    // What comes before a damage is of use to whoever looks for it.
    try {
        while (const std::size_t count = member.read(block.data(), block.size()))
            writeOut(block.data(), count);
    } catch (const pells::FileError&) {
        flushOut();
        throw;
    }
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
