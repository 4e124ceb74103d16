#pragma once

#include <memory>
#include <string>

#include "pells/asset/pell_archive.h"

namespace pells_tool {

/// Opens an archive. \throws pells::FileError, which names it, when it cannot be read.
std::unique_ptr<pells::pellistream> openArchive(const std::string& path);

}  // namespace pells_tool
