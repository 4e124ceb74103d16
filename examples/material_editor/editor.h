#pragma once

#include <pells/undo/undo_redo_sequence.h>

#include <optional>
#include <ostream>
#include <string>

#include "text.h"

namespace material_editor {

class Step;

/// The commands, and the history of what they did. Knows nothing of a terminal.
class Editor {
public:
    /// \param output for what the commands print; outlives the editor.
    explicit Editor(std::ostream& output);

    /// Runs the command of one line.
    ///
    /// \throws std::runtime_error whose message is for the user; nothing has changed then.
    void run(const std::string& line);

    /// Whether the user wants to leave.
    bool isFinished() const { return finished; }

    /// What may stand behind the words of an unfinished line; nothing: the name of a file.
    std::optional<Words> completions(const Words& before) const;

private:
    struct Command;
    static const Command allCommands[];
    static const Command* findCommand(const std::string& name);
    static const Command& knownCommand(const std::string& name);
    static Words commandNames();

    // One for each command; the number of arguments has been checked.
    void create(const Words& arguments);
    void color(const Words& arguments);
    void shininess(const Words& arguments);
    void texture(const Words& arguments);
    void blend(const Words& arguments);
    void undo(const Words& arguments);
    void redo(const Words& arguments);
    void list(const Words& arguments);
    void show(const Words& arguments);
    void showHistory(const Words& arguments);
    void save(const Words& arguments);
    void load(const Words& arguments);
    void saveHistory(const Words& arguments);
    void loadHistory(const Words& arguments);
    void help(const Words& arguments);
    void quit(const Words& arguments);

    void perform(const boost::intrusive_ptr<Step>& step);

    std::ostream& out;
    pells::UndoRedoSequence history;
    bool finished = false;
};

}  // namespace material_editor
