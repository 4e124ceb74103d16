#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <sstream>
#include <string>

#include "tools/commands.h"
#include "tools/process.h"
#include "tools/standard_output.h"
#include "tools/text.h"

namespace {

enum ExitStatus { done = 0, failed = 1, wrongUsage = 2 };

void addCommands(CLI::App& app) {
    app.name("pells");
    app.set_version_flag("--version", "pells " PELLS_VERSION);
    app.require_subcommand(1);
    app.footer(
        "What the library logs goes to \"pells.log\" in the current directory.\n"
        "Exit status: 0 done, 1 something failed, 2 wrong usage.");
    pells_tool::addPack(app);
    pells_tool::addList(app);
    pells_tool::addCat(app);
    pells_tool::addResolve(app);
    pells_tool::addSheet(app);
    pells_tool::addSwatch(app);
}

/// "pells", or "pells: COMMAND" once that is known.
std::string prefix(const CLI::App& app) {
    const auto commands = app.get_subcommands();
    return commands.empty() ? "pells" : "pells: " + commands.front()->get_name();
}

void report(const std::string& where, const std::string& what) {
    std::fprintf(stderr, "%s: %s\n", where.c_str(), pells_tool::printable(what).c_str());
}

/// What is wrong with the arguments. CLI11 misses the command where it does not know it.
std::string complaint(const CLI::App& app, const CLI::ParseError& error) {
    if (!app.get_subcommands().empty() || app.remaining().empty())
        return error.what();
    const std::string stranger = app.remaining().front();
    return (stranger[0] == '-' ? "unknown option '" : "unknown command '") + stranger + "'";
}

/// What --help and --version print, or a complaint about the arguments.
int answerParseError(const CLI::App& app, const CLI::ParseError& error) {
    if (error.get_exit_code() != static_cast<int>(CLI::ExitCodes::Success)) {
        report(prefix(app), complaint(app, error) + " (see --help)");
        return wrongUsage;
    }
    std::ostringstream text;
    app.exit(error, text, text);
    pells_tool::writeOut(text.str());
    pells_tool::flushOut();
    return done;
}

int run(CLI::App& app, int argc, char** argv) {
    try {
        app.parse(argc, argv);
        pells_tool::flushOut();
        return done;
    } catch (const CLI::ParseError& error) {
        return answerParseError(app, error);
    }
}

}  // namespace

int main(int argc, char** argv) {
    pells_tool::prepareProcess();
    CLI::App app(
        "Makes and looks into pell archives, shows what an asset root serves, and draws "
        "materials.");
    try {
        addCommands(app);
        return run(app, argc, argv);
    } catch (const std::exception& error) {
        report(prefix(app), error.what());
        return failed;
    }
}
