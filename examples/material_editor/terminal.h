#pragma once

#include <optional>
#include <string>

namespace material_editor {

class Editor;

/// Whether a person sits at both ends of the program.
bool isInteractive();

/// Lines that a person types, with editing, the lines typed before, and completion by the
/// editor's knowledge of its commands. At most one exists at a time.
class Terminal {
public:
    /// \param knowing outlives the terminal.
    explicit Terminal(const Editor& knowing);
    Terminal(const Terminal&) = delete;
    Terminal& operator=(const Terminal&) = delete;
    ~Terminal();

    /// The next line; nothing at the end of input (Ctrl-D).
    std::optional<std::string> readLine(const std::string& prompt);
};

}  // namespace material_editor
