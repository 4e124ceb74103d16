#include "settings.h"

#include <pells/core/factory.h>

#include <fstream>
#include <stdexcept>

#include "text.h"

namespace material_editor {

namespace {

// The library makes the Settings, with the default constructor: what they need is left here.
std::string settingsPath;
bool settingsMustExist = false;

// This one object makes the class known. The library finds it by the name "Prefs".
const pells::Factory<pells::Prefs, Settings> settingsFactory("Prefs");

}  // namespace

void Settings::useFile(const std::string& path, bool mustExist) {
    settingsPath = path;
    settingsMustExist = mustExist;
}

Settings::Settings() {
    std::ifstream file(settingsPath);
    if (!file && settingsMustExist)
        throw std::runtime_error("cannot read '" + settingsPath + "'");
    std::string line;
    for (int number = 1; std::getline(file, line); ++number)
        readLine(line, number);
    if (file.bad())
        throw std::runtime_error("cannot read '" + settingsPath + "'");
}

void Settings::readLine(const std::string& line, int number) {
    const std::string text = trimmed(line);
    if (text.empty() || text.front() == '#')
        return;
    const std::string::size_type equals = text.find('=');
    if (equals == std::string::npos) {
        throw std::runtime_error(settingsPath + ":" + std::to_string(number) +
                                 ": a line is 'key = value', not '" + text + "'");
    }
    values[trimmed(text.substr(0, equals))] = trimmed(text.substr(equals + 1));
}

std::string Settings::getString(const std::string& key) {
    // The library relies on this: a key without a value gives an empty string.
    const auto found = values.find(key);
    return found == values.end() ? std::string() : found->second;
}

}  // namespace material_editor
