#pragma once

#include <string>

#include "support/scratch_directory.h"

/// What the fuzzers share. Each one defines fuzzOne().
namespace pells_fuzz {

/// Ends the process with a report unless the condition holds.
void require(bool condition, const std::string& what);

/// The folder that the process runs in, for its files and its log; removed at its end.
const pells_test::ScratchDirectory& scratch();

}  // namespace pells_fuzz

/// Tries one input. The log is off, and all singletons are freed afterwards.
void fuzzOne(const std::string& input);
