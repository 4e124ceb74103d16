#pragma once

#include <exception>
#include <string>

#include "pells/core/singleton.h"

namespace pells {

class Prefs;

/// Creation policy that asks the factory registered under the name "Prefs".
class PELLS_API PrefsFactory {
public:
    /// \throws Prefs::NoImplementation when no such factory makes a Prefs.
    static Prefs* create();
};

extern template class PELLS_API RogueSingleton<Prefs, PrefsFactory>;
extern template class PELLS_API Singleton<Prefs, PrefsFactory>;

/// The application's preferences, through which the library reads its settings.
///
/// The application derives its own class and registers a factory for it:
///
///     const pells::Factory<pells::Prefs, MyPrefs> prefsFactory("Prefs");
///
/// The library reads "log" and "logdefault" (rules for log tags) when the log is created, and
/// "assetLocation" (the folder of assets). An implementation must not log while it is constructed
/// or asked: the log that it would write to waits for its answer.
class PELLS_API Prefs : public Singleton<Prefs, PrefsFactory> {
public:
    /// Thrown by instance() when the application registered no factory.
    class PELLS_API NoImplementation : public std::exception {
    public:
        /// Says which factory to define.
        const char* what() const noexcept override;
    };

    ~Prefs() override;

    /// The value stored under a key, or "" for a key that has none.
    virtual std::string getString(const std::string& key) = 0;

protected:
    Prefs();
};

}  // namespace pells
