#include "tools/library_prefs.h"

#include <map>

#include "pells/core/factory.h"
#include "pells/core/no_destructor.h"
#include "pells/core/prefs.h"

namespace pells_tool {

namespace {

/// Never destroyed: the log may ask while the process exits.
std::map<std::string, std::string>& values() {
    static pells::NoDestructor<std::map<std::string, std::string>> map;
    return *map;
}

class LibraryPrefs : public pells::Prefs {
public:
    LibraryPrefs() { values().emplace("logdefault", "error"); }
    std::string getString(const std::string& key) override {
        const auto value = values().find(key);
        return value != values().end() ? value->second : std::string();
    }
};

const pells::Factory<pells::Prefs, LibraryPrefs> prefsFactory("Prefs");

}  // namespace

void setLibraryPrefs(const std::string& assetRoot, const std::string& logRules) {
    values()["assetLocation"] = assetRoot;
    values()["log"] = logRules;
}

}  // namespace pells_tool
