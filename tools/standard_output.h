#pragma once

#include <cstddef>
#include <string>

namespace pells_tool {

/// Writes to standard output. Whoever reads it may be gone, or its disk full: each function throws
/// pells::FileError when the bytes cannot be written.
void writeOut(const std::string& text);
void writeOut(const char* bytes, std::size_t count);

/// Hands on everything that is still buffered.
void flushOut();

}  // namespace pells_tool
