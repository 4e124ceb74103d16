#pragma once

#include <cstddef>
#include <string>

namespace pells_tool {

/// The text with its control characters written as \xNN: one line, harmless to a terminal.
std::string printable(const std::string& text);

/// The printable text as valid UTF-8: bytes that are none become U+FFFD.
std::string printableUtf8(const std::string& text);

/// "1 picture", "2 pictures".
std::string counted(std::size_t number, const std::string& singular);

}  // namespace pells_tool
