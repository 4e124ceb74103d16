#pragma once

#include <istream>

#include "pells/asset/pell_archive.h"

namespace pells::detail {

/// Reads the directory that begins at the stream's position into `directory`.
///
/// It means the same as formatted extraction in the classic locale (words as operator>> reads them,
/// names as getline() does), but takes the stream in blocks. The stream ends anywhere behind the
/// directory.
///
/// \throws pellibuf::BadPellFile when an entry is malformed.
void readPellDirectory(std::istream& stream, basic_pellbuf<std::istream>::Directory& directory);

}  // namespace pells::detail
