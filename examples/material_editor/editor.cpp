#include "editor.h"

#include <pells/core/prefs.h>
#include <pells/log/log.h>
#include <pells/timing/timer.h>

#include <algorithm>
#include <cstddef>
#include <iomanip>
#include <iterator>
#include <sstream>
#include <stdexcept>

#include "exact_color.h"
#include "files.h"
#include "materials.h"
#include "steps.h"

namespace material_editor {

namespace {

const char materialRoot[] = "material";
const char historyRoot[] = "history";

const pells::Material& existing(const std::string& name) {
    const pells::Material* const material = Materials::instance().find(name);
    if (!material)
        throw std::runtime_error("there is no material '" + name + "'");
    return *material;
}

/// A number of the command line that may be left out.
float numberAt(const Words& words, std::size_t at, float otherwise) {
    return at < words.size() ? parseNumber(words[at]) : otherwise;
}

std::string describe(const pells::UndoableStep& step) {
    return printable(dynamic_cast<const Step&>(step).describe());
}

Words materialNames() {
    Words names;
    for (const auto& entry : Materials::instance().all())
        names.push_back(entry.first);
    return names;
}

/// Lists steps, numbered from 1; those from the first undone one on are marked.
class ListStep : public pells::UndoRedoSequence::BatchMethod {
public:
    ListStep(std::ostream& output, int doneCount) : out(output), done(doneCount) {}

    bool operator()(boost::intrusive_ptr<pells::UndoableStep> step) const override {
        ++number;
        out << std::setw(4) << number << (number > done ? " (undone) " : " ") << describe(*step)
            << '\n';
        return true;
    }

private:
    std::ostream& out;
    const int done;
    mutable int number = 0;  // the history calls the method as a const one
};

/// Tells how long a command took, however it ends.
class Stopwatch {
public:
    Stopwatch(std::ostream& output, const std::string& commandName)
        : out(output), name(commandName), start(pells::Timer::instance().now()) {}
    Stopwatch(const Stopwatch&) = delete;
    Stopwatch& operator=(const Stopwatch&) = delete;
    ~Stopwatch() {
        const int span = pells::Timer::instance().now().diffInMicrosec(start);
        PELLS_LOG("editor.time", name << " took " << span << " microseconds");
        if (pells::Prefs::instance().getString("timing") == "on")
            out << '(' << span << " microseconds)\n";
    }

private:
    std::ostream& out;
    const std::string name;
    const pells::Timestamp start;
};

}  // namespace

/// A command and what there is to know about it. The arguments are checked and completed by the
/// same words that help prints: "[...]" may be left out, MATERIAL, PART, FILE and COMMAND are known
/// kinds.
struct Editor::Command {
    const char* name;
    const char* arguments;
    const char* purpose;
    void (Editor::*run)(const Words& arguments);

    Words argumentNames() const { return splitWords(arguments); }

    bool accepts(std::size_t count) const {
        const Words names = argumentNames();
        const auto required =
            std::count_if(names.begin(), names.end(),
                          [](const std::string& each) { return each.front() != '['; });
        return count >= static_cast<std::size_t>(required) && count <= names.size();
    }

    std::string usage() const { return trimmed(std::string(name) + ' ' + arguments); }
};

const Editor::Command Editor::allCommands[] = {
    {"new", "NAME", "makes a material", &Editor::create},
    {"color", "MATERIAL PART R G B [A]", "sets a colour; channels are 0 to 1", &Editor::color},
    {"shininess", "MATERIAL VALUE", "sets the shininess, 0 to 128", &Editor::shininess},
    {"texture", "MATERIAL TEXTURE [SCALE] [ANGLE]", "sets the texture; \"\" takes it away",
     &Editor::texture},
    {"blend", "MATERIAL MATERIAL", "mixes the second material into the first", &Editor::blend},
    {"undo", "", "takes back the last step", &Editor::undo},
    {"redo", "", "does the last undone step again", &Editor::redo},
    {"list", "", "names the materials", &Editor::list},
    {"show", "MATERIAL", "prints a material", &Editor::show},
    {"history", "", "lists the steps", &Editor::showHistory},
    {"save", "MATERIAL FILE", "writes a material", &Editor::save},
    {"load", "MATERIAL FILE", "reads a material, new or in the place of one", &Editor::load},
    {"save-history", "FILE", "writes the steps that are done", &Editor::saveHistory},
    {"load-history", "FILE", "starts anew and replays the steps of a file", &Editor::loadHistory},
    {"help", "[COMMAND]", "explains the commands", &Editor::help},
    {"quit", "", "leaves", &Editor::quit},
};

const Editor::Command* Editor::findCommand(const std::string& name) {
    const auto found = std::find_if(std::begin(allCommands), std::end(allCommands),
                                    [&name](const Command& each) { return each.name == name; });
    return found == std::end(allCommands) ? nullptr : found;
}

const Editor::Command& Editor::knownCommand(const std::string& name) {
    const Command* const command = findCommand(name);
    if (!command)
        throw std::runtime_error("unknown command '" + name + "'; try help");
    return *command;
}

Words Editor::commandNames() {
    Words names;
    for (const Command& each : allCommands)
        names.emplace_back(each.name);
    return names;
}

Editor::Editor(std::ostream& output) : out(output) {}

void Editor::run(const std::string& line) {
    Words words = splitWords(line);
    if (words.empty())
        return;
    const Command& command = knownCommand(words.front());
    words.erase(words.begin());
    if (!command.accepts(words.size()))
        throw std::runtime_error("usage: " + command.usage());

    const Stopwatch stopwatch(out, command.name);
    (this->*command.run)(words);
}

std::optional<Words> Editor::completions(const Words& before) const {
    if (before.empty())
        return commandNames();
    const Command* const command = findCommand(before.front());
    const Words arguments = command ? command->argumentNames() : Words();
    if (before.size() > arguments.size())
        return Words();

    const std::string& kind = arguments[before.size() - 1];
    if (kind == "FILE")
        return std::nullopt;
    if (kind == "MATERIAL")
        return materialNames();
    if (kind == "PART")
        return colorParts();
    return kind == "[COMMAND]" ? commandNames() : Words();
}

// Commands that become steps of the history.

void Editor::perform(const StepPtr& step) {
    const std::string problem = step->problem();
    if (!problem.empty())
        throw std::runtime_error(problem);
    step->redo();
    history.addUndoable(step);
}

void Editor::create(const Words& arguments) {
    perform(createMaterial(arguments[0]));
}

void Editor::color(const Words& arguments) {
    const pells::Color color{parseNumber(arguments[2]), parseNumber(arguments[3]),
                             parseNumber(arguments[4]), numberAt(arguments, 5, 1)};
    perform(setColor(arguments[0], arguments[1], color));
}

void Editor::shininess(const Words& arguments) {
    perform(setShininess(arguments[0], parseNumber(arguments[1])));
}

void Editor::texture(const Words& arguments) {
    perform(setTexture(arguments[0], arguments[1], numberAt(arguments, 2, 1),
                       numberAt(arguments, 3, 0)));
}

void Editor::blend(const Words& arguments) {
    perform(blendMaterials(arguments[0], arguments[1]));
}

void Editor::load(const Words& arguments) {
    pells::Material material;
    readFile(arguments[1], materialRoot, material);
    perform(loadMaterial(arguments[0], material));
}

// Moving through the history.

void Editor::undo(const Words& /*arguments*/) {
    const boost::intrusive_ptr<pells::UndoableStep> last = history.getLast();
    if (!history.undo())
        throw std::runtime_error("there is nothing to undo");
    out << "undone: " << describe(*last) << '\n';
}

void Editor::redo(const Words& /*arguments*/) {
    if (!history.redo())
        throw std::runtime_error("there is nothing to redo");
    out << "redone: " << describe(*history.getLast()) << '\n';
}

void Editor::showHistory(const Words& /*arguments*/) {
    history.applyToAll(ListStep(out, history.getUndoStackSize()), true);
}

void Editor::saveHistory(const Words& arguments) {
    // The library writes nothing at all for such a history, which would be no document.
    if (history.getUndoStackSize() == 0)
        throw std::runtime_error("there is no step to save");
    writeFile(arguments[0], toXml(historyRoot, history));
}

void Editor::loadHistory(const Words& arguments) {
    // The steps replay into no materials. Those of now are kept until something has replayed.
    Materials::Map earlier;
    Materials::instance().swap(earlier);
    pells::UndoRedoSequence loaded;
    std::string failure;
    try {
        readFile(arguments[0], historyRoot, loaded);
    } catch (const std::exception& reason) {
        failure = reason.what();
    }

    const std::string count = std::to_string(loaded.getUndoStackSize());
    if (!failure.empty() && count == "0") {
        Materials::instance().swap(earlier);
        throw std::runtime_error(failure + "; nothing has changed");
    }
    history = loaded;
    if (!failure.empty())
        throw std::runtime_error(failure + "; whole steps kept: " + count);
    out << "steps replayed: " << count << '\n';
}

// The other commands.

void Editor::list(const Words& /*arguments*/) {
    for (const std::string& name : materialNames())
        out << name << '\n';
}

void Editor::show(const Words& arguments) {
    const pells::Material& material = existing(arguments[0]);
    out << "ambient    " << ExactColor{material.ambient()} << '\n'
        << "diffuse    " << ExactColor{material.diffuse()}
        << (material.ambientAndDiffuse() ? " (together with ambient)\n" : "\n") << "specular   "
        << ExactColor{material.specular()} << '\n'
        << "emissive   " << ExactColor{material.emissive()} << '\n'
        << "shininess  " << material.shininess() << '\n';
    if (material.hasTexture()) {
        out << "texture    " << printable(material.textureName()) << ", scale "
            << material.textureScale() << ", angle " << material.textureAngle() << '\n';
    }
}

void Editor::save(const Words& arguments) {
    pells::Material material = existing(arguments[0]);
    writeFile(arguments[1], toXml(materialRoot, material));
}

void Editor::help(const Words& arguments) {
    if (!arguments.empty()) {
        const Command& command = knownCommand(arguments[0]);
        out << command.usage() << ": " << command.purpose << '\n';
        return;
    }
    for (const Command& each : allCommands)
        out << std::left << std::setw(42) << each.usage() << std::right << each.purpose << '\n';
}

void Editor::quit(const Words& /*arguments*/) {
    finished = true;
}

}  // namespace material_editor
