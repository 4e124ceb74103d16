// A material editor for the terminal: what an application of the library looks like.
//
//     material_editor [--prefs FILE] [SCRIPT]
//
// Start reading at steps.cpp, the undoable steps, and editor.cpp, the commands. settings.h and
// clock.h supply what the library wants from every application.

#include <pells/core/prefs.h>
#include <pells/core/singleton.h>

#include <exception>
#include <fstream>
#include <iostream>
#include <optional>
#include <stdexcept>
#include <string>

#include "editor.h"
#include "settings.h"
#include "terminal.h"
#include "text.h"

namespace {

using material_editor::Editor;
using material_editor::Settings;
using material_editor::Terminal;

const int success = 0;
const int commandFailed = 1;
const int wrongUsage = 2;

const char usage[] =
    "usage: material_editor [--prefs FILE] [SCRIPT]\n"
    "Edits materials by commands from the terminal, from a script or from a pipe; try 'help'.\n"
    "Preferences are read from material_editor.prefs unless another file is given.\n";

struct Options {
    std::string script;
    std::string prefs;
    bool help = false;
};

/// \throws std::runtime_error
Options parseOptions(int argc, char** argv) {
    Options options;
    for (int i = 1; i < argc; ++i) {
        const std::string word = argv[i];
        if (word == "--help")
            options.help = true;
        else if (word == "--prefs" && i + 1 < argc)
            options.prefs = argv[++i];
        else if (word.empty() || word[0] == '-' || !options.script.empty())
            throw std::runtime_error("unexpected '" + word + "'; try --help");
        else
            options.script = word;
    }
    return options;
}

/// Runs one command; what went wrong is one line on standard error.
bool runLine(Editor& editor, const std::string& line, const std::string& place) {
    try {
        editor.run(line);
        return true;
    } catch (const std::exception& failure) {
        std::cout.flush();
        std::cerr << place << material_editor::printable(failure.what()) << '\n';
        return false;
    }
}

int runTerminal() {
    const std::string wanted = pells::Prefs::instance().getString("prompt");
    const std::string prompt = (wanted.empty() ? "material>" : wanted) + ' ';
    Editor editor(std::cout);
    Terminal terminal(editor);
    while (!editor.isFinished()) {
        const std::optional<std::string> line = terminal.readLine(prompt);
        if (!line)
            break;
        runLine(editor, *line, "");
        std::cout.flush();
    }
    return success;
}

/// Goes on after a command that failed, as a person would.
int runScript(std::istream& in, const std::string& name) {
    Editor editor(std::cout);
    bool allRan = true;
    std::string line;
    for (int number = 1; !editor.isFinished() && std::getline(in, line); ++number)
        allRan = runLine(editor, line, name + ":" + std::to_string(number) + ": ") && allRan;
    std::cout.flush();
    if (in.bad() || !std::cout)
        throw std::runtime_error(in.bad() ? "cannot read " + name : "cannot write the output");
    return allRan ? success : commandFailed;
}

int runScriptFile(const std::string& path) {
    std::ifstream script(path);
    if (!script) {
        std::cerr << "material_editor: cannot read '" << path << "'\n";
        return wrongUsage;
    }
    return runScript(script, path);
}

int runEditor(const Options& options) {
    if (!options.script.empty())
        return runScriptFile(options.script);
    return material_editor::isInteractive() ? runTerminal() : runScript(std::cin, "input");
}

/// Frees what the library and the editor hold as singletons, newest first.
struct SingletonsEnd {
    ~SingletonsEnd() { pells::SingletonList::freeSingletons(); }
};

}  // namespace

int main(int argc, char** argv) {
    const SingletonsEnd singletonsEnd{};
    Options options;
    try {
        options = parseOptions(argc, argv);
        Settings::useFile(options.prefs.empty() ? "material_editor.prefs" : options.prefs,
                          !options.prefs.empty());
        pells::Prefs::instance();  // reads the file now, while a mistake in it can be told
    } catch (const std::exception& mistake) {
        std::cerr << "material_editor: " << mistake.what() << '\n';
        return wrongUsage;
    }
    if (options.help) {
        std::cout << usage;
        return success;
    }
    try {
        return runEditor(options);
    } catch (const std::exception& failure) {
        std::cerr << "material_editor: " << failure.what() << '\n';
        return commandFailed;
    }
}
