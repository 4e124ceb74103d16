#pragma once

/// \file
/// The commands of the tool, one source file each.
///
/// Each function declares its command to the command line; the parsed command runs as a callback.
/// A command that fails throws, with "WHERE: WHY" as the message.

namespace CLI {
class App;
}

namespace pells_tool {

void addPack(CLI::App& app);
void addList(CLI::App& app);
void addCat(CLI::App& app);
void addResolve(CLI::App& app);
void addSheet(CLI::App& app);
void addSwatch(CLI::App& app);

}  // namespace pells_tool
