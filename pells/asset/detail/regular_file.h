#pragma once

#include <fstream>
#include <string>

namespace pells::detail {

/// Opens a regular file for reading its bytes; sets failbit when the path names none.
///
/// Folders, pipes and devices are refused: opening or reading them could wait for ever. So are
/// paths that hold a zero byte, at which the system would cut them.
void openRegularFile(std::ifstream& stream, const std::string& path);

/// Whether openRegularFile() would try.
bool isRegularFile(const std::string& path);

}  // namespace pells::detail
