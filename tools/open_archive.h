#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "pells/asset/pell_archive.h"

namespace pells_tool {

/// Opens an archive. \throws pells::FileError, which names it, when it cannot be read or is
/// damaged;
///                           also where the library sees an archive without members, because the
///                           directory would lie behind the file's end.
std::unique_ptr<pells::pellistream> openArchive(const std::string& path);

/// Why no archive can be read from a path: the system's reason, or what stands there instead of a
/// regular file; empty when it is one that can be read.
std::string whyNotReadable(const std::string& path);

/// What is wrong with the place of the directory in a file that the library takes for an archive;
/// empty when nothing is.
std::string whereDirectoryIsMissing(const std::string& path);

/// Size of a file in bytes; 0 when it cannot be told.
std::uint64_t sizeOfFile(const std::string& path);

}  // namespace pells_tool
