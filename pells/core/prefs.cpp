#include "pells/core/prefs.h"

#include "pells/core/factory.h"

namespace pells {

template class RogueSingleton<Prefs, PrefsFactory>;
template class Singleton<Prefs, PrefsFactory>;

Prefs* PrefsFactory::create() {
    Prefs* const prefs = AbstractFactory<Prefs>::createByName("Prefs");
    if (!prefs)
        throw Prefs::NoImplementation();
    return prefs;
}

const char* Prefs::NoImplementation::what() const noexcept {
    return "nothing makes the preferences: define a static object, such as "
           "'const pells::Factory<pells::Prefs, MyPrefs> prefsFactory(\"Prefs\");'";
}

Prefs::Prefs() = default;
Prefs::~Prefs() = default;

}  // namespace pells
