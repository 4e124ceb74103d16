#pragma once

#include <pells/core/prefs.h>

#include <map>
#include <string>

namespace material_editor {

/// The application's preferences, from a file of lines "key = value"; "#" begins a comment line.
///
/// The library asks for "log", "logdefault" and "assetLocation". The editor's own keys are
///  - "prompt": what the terminal shows before each command;
///  - "timing": "on" prints after each command how long it took.
class Settings : public pells::Prefs {
public:
    /// Chooses the file that the preferences are read from; call it before anything asks for them.
    ///
    /// \param mustExist false: without the file all preferences are empty.
    static void useFile(const std::string& path, bool mustExist);

    /// Reads the file. Made by the library, on the first Prefs::instance().
    ///
    /// \throws std::runtime_error for a file that cannot be read, or a line that is no "key =
    ///         value".
    Settings();

    std::string getString(const std::string& key) override;

private:
    void readLine(const std::string& line, int number);

    std::map<std::string, std::string> values;
};

}  // namespace material_editor
