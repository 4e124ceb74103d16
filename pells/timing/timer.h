#pragma once

#include <exception>
#include <string>

#include "pells/core/singleton.h"
#include "pells/timing/timestamp.h"

namespace pells {

class Timer;

/// Creation policy that asks a factory registered by name.
class PELLS_API TimerFactory {
public:
    /// A new Timer of the factory registered under Timer::TimerName.
    /// \throws Timer::NoImplementation when no such factory makes a Timer.
    static Timer* create();

    /// The same for any name; null when there is none.
    static Timer* create(const std::string& name);
};

extern template class PELLS_API RogueSingleton<Timer, TimerFactory>;
extern template class PELLS_API Singleton<Timer, TimerFactory>;

/// The application's source of time. The library declares it and never reads it.
///
/// The application derives its own class and registers a factory for it:
///
///     const pells::Factory<pells::Timer, MyTimer> timerFactory(pells::Timer::TimerName);
class PELLS_API Timer : public Singleton<Timer, TimerFactory> {
public:
    /// Thrown by instance() when the application registered no factory.
    class PELLS_API NoImplementation : public std::exception {
    public:
        /// Says which factory to define.
        const char* what() const noexcept override;
    };

    /// "Timer": the class name under which the application registers its factory.
    static const std::string TimerName;

    ~Timer() override;

    /// The time, from a zero of the application's choice.
    virtual Timestamp now() = 0;

protected:
    Timer();
};

}  // namespace pells
