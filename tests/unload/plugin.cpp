// Built twice, as two plug-ins that know nothing of each other.

#include "unload/plugin.h"

#include <string>

#include "pells/pells.h"

namespace {

std::string rules;

class PluginPrefs : public pells::Prefs {
public:
    std::string getString(const std::string& key) override { return key == "log" ? rules : ""; }
};

const pells::Factory<pells::Prefs, PluginPrefs> prefsFactory("Prefs");

void setRules(const char* newRules) {
    rules = newRules;
}

void log(const char* message) {
    PELLS_LOG("app", message);
}

void charge(const char* category, unsigned time) {
    pells::PerformanceCategory& charged = pells::PerformanceCategory::find(category);
    charged.start(0);
    charged.stop(time);
}

void throwNotFound() {
    pells::FactoryByName::find("no such class");
}

bool catchesNotFound(void (*thrower)()) {
    try {
        thrower();
    } catch (const pells::FactoryByName::NotFound&) {
        return true;
    } catch (...) {
    }
    return false;
}

const void* const* sharedObjects() {
    static const void* objects[7];
    objects[0] = &pells::Log::instance();
    objects[1] = &pells::Prefs::instance();
    objects[2] = &pells::SingletonList::instance();
    objects[3] = pells::FactoryByName::findp("Prefs");
    objects[4] = pells::FactoryByTypeID::findp(typeid(PluginPrefs).name());
    objects[5] = &pells::PerformanceCategory::find("shared");
    return objects;
}

const PluginInterface interface = {
    setRules,      log,           charge,         pells::SingletonList::freeSingletons,
    sharedObjects, throwNotFound, catchesNotFound};

}  // namespace

extern "C" PELLS_API const PluginInterface* pluginEntry() {
    return &interface;
}
