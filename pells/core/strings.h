#pragma once

#include <string>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// Splits a text at runs of separator characters.
///
/// \param text       may hold any bytes.
/// \param separators each character is one separator; empty: the text is one piece.
/// \param out        emptied, then filled with the pieces in order; no piece is empty.
/// \return the number of pieces.
PELLS_API unsigned string_split(const std::string& text, const std::string& separators,
                                std::vector<std::string>& out);

/// The element name of one item of a sequence of that name.
///
/// "files" gives "file", "entries" gives "entry"; a name without a final "s" gets "Item" appended,
/// as in "stackItem".
PELLS_API std::string getSingularName(const std::string& name);

}  // namespace pells
