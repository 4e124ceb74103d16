#pragma once

#include <cstddef>
#include <exception>
#include <string>

namespace pells_tool {

/// The reader of standard output has gone away, which ends the work and is no failure.
class ReaderGone : public std::exception {};

/// Writes to standard output. Its disk may be full, or its reader gone: each function throws
/// pells::FileError when the bytes cannot be written, or ReaderGone.
void writeOut(const std::string& text);
void writeOut(const char* bytes, std::size_t count);

/// Hands on everything that is still buffered.
void flushOut();

}  // namespace pells_tool
