#pragma once

#include <cstddef>
#include <string>

namespace pells_tool {

/// The text with its control characters, and those that turn the direction of writing, as \xNN:
/// one line, harmless to a terminal. Names in any alphabet stay as they are.
std::string printable(const std::string& text);

/// The printable text as valid UTF-8: bytes that are none become U+FFFD.
std::string printableUtf8(const std::string& text);

/// "1 picture", "2 pictures".
std::string counted(std::size_t number, const std::string& singular);

}  // namespace pells_tool
