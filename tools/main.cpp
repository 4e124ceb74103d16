#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdio>
#include <exception>
#include <functional>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include "tools/commands.h"
#include "tools/process.h"
#include "tools/standard_output.h"
#include "tools/text.h"

namespace {

enum ExitStatus { done = 0, failed = 1, wrongUsage = 2 };

/// CLI11 takes "[a,b]" for a list of two arguments wherever an option takes several. Here they are
/// names like any other, which a mark in front keeps it from looking into.
const char listMark = '\x01';

bool looksLikeList(const std::string& argument) {
    const std::size_t begin = argument.find_first_not_of(listMark);
    return begin != std::string::npos && argument[begin] == '[' && argument.back() == ']';
}

std::string withoutMark(const std::string& argument) {
    return argument[0] == listMark && looksLikeList(argument) ? argument.substr(1) : argument;
}

/// The arguments of main() in the order that CLI11 parses, last one first.
std::vector<std::string> markedArguments(int argc, char** argv) {
    std::vector<std::string> arguments(std::make_reverse_iterator(argv + argc),
                                       std::make_reverse_iterator(argv + std::min(argc, 1)));
    for (std::string& each : arguments) {
        if (looksLikeList(each))
            each.insert(each.begin(), listMark);
    }
    return arguments;
}

void removeMarks(CLI::App& app) {
    for (CLI::App* const command : app.get_subcommands({})) {
        for (CLI::Option* const option : command->get_options())
            option->transform(std::function<std::string(std::string)>(withoutMark));
    }
}

void addCommands(CLI::App& app) {
    app.name("pells");
    app.set_version_flag("--version", "pells " PELLS_VERSION);
    app.require_subcommand(1);
    app.footer("Exit status: 0 done, 1 something failed, 2 wrong usage.");
    pells_tool::addPack(app);
    pells_tool::addList(app);
    pells_tool::addCat(app);
    pells_tool::addResolve(app);
    pells_tool::addSheet(app);
    pells_tool::addSwatch(app);
    removeMarks(app);
}

/// "pells", or "pells: COMMAND" once that is known.
std::string prefix(const CLI::App& app) {
    const auto commands = app.get_subcommands();
    return commands.empty() ? "pells" : "pells: " + commands.front()->get_name();
}

void report(const std::string& where, const std::string& what) {
    std::fprintf(stderr, "%s: %s\n", where.c_str(), pells_tool::printable(what).c_str());
}

bool isOption(const std::string& argument) {
    return argument.size() > 1 && argument[0] == '-';
}

/// What is wrong with the arguments. CLI11 misses the command where it does not know it, and the
/// positional arguments where it does not know an option.
std::string complaint(const CLI::App& app, const CLI::ParseError& error) {
    const std::vector<std::string> strangers = app.remaining(true);
    const auto option = std::find_if(strangers.begin(), strangers.end(), isOption);
    if (option != strangers.end())
        return "unknown option '" + *option + "'";
    if (!app.get_subcommands().empty() || strangers.empty())
        return error.what();
    return "unknown command '" + strangers.front() + "'";
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
        app.parse(markedArguments(argc, argv));
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
    } catch (const pells_tool::ReaderGone&) {
        pells_tool::endByClosedPipe();
        return failed;
    } catch (const std::exception& error) {
        report(prefix(app), error.what());
        return failed;
    }
}
