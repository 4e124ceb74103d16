#pragma once

namespace pells::detail {

/// Arranges for the time summary to be written when the library is unloaded. Calling it again does
/// nothing. Implementation detail of the library's tear-down; not installed.
void installTimeSummaryHook();

}  // namespace pells::detail
