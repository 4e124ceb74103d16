#pragma once

namespace pells_tool {

/// Makes the process fit to report its failures and to leave nothing behind.
///
/// A closed pipe and a file-size limit become write errors instead of signals that end the process;
/// a signal that ends the process removes the unfinished output file; a standard stream that is
/// closed is opened on the null device, so that no file that the tool opens takes its place.
void prepareProcess();

/// Ends the process as a closed pipe ends one that does not ask for errors.
void endByClosedPipe();

}  // namespace pells_tool
