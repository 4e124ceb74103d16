#pragma once

#include <cstdint>
#include <string>

namespace CLI {
class App;
}

namespace pells_tool {

/// How a command wants the library: what it logs and where, and how much it reads.
struct LibraryOptions {
    std::string logRules;  ///< beside that errors are logged
    std::string logFile;   ///< "" for none: the folder that the tool is started in is not its own
    std::uint64_t maximumDocument = std::uint64_t{16} << 20;  ///< bytes of an XML document
    std::uint64_t maximumPixels = std::uint64_t{64} << 20;    ///< of a picture
};

/// Adds --log and --log-file to a command.
void addLogOptions(CLI::App& command, LibraryOptions& options);

/// Adds --max-document and --max-pixels.
void addLimitOptions(CLI::App& command, LibraryOptions& options);

/// Sets what the library asks its preferences for, and its limits; to be called before anything
/// logs. Without a file, rules send the lines to standard error.
///
/// \param assetRoot the folder of assets.
void setUpLibrary(const std::string& assetRoot, const LibraryOptions& options);

}  // namespace pells_tool
