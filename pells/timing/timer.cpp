#include "pells/timing/timer.h"

#include "pells/core/factory.h"

namespace pells {

template class RogueSingleton<Timer, TimerFactory>;
template class Singleton<Timer, TimerFactory>;

#if defined(__GNUC__)
// A program that links the library statically may name it in a static factory of its own, whose
// place in the order of construction is unknown; 101 comes before all that ask for none.
__attribute__((init_priority(101)))
#endif
const std::string Timer::TimerName("Timer");

Timer* TimerFactory::create() {
    Timer* const timer = create(Timer::TimerName);
    if (!timer)
        throw Timer::NoImplementation();
    return timer;
}

Timer* TimerFactory::create(const std::string& name) {
    return AbstractFactory<Timer>::createByName(name);
}

const char* Timer::NoImplementation::what() const noexcept {
    return "nothing makes the timer: define a static object, such as "
           "'const pells::Factory<pells::Timer, MyTimer> timerFactory(\"Timer\");'";
}

Timer::Timer() = default;
Timer::~Timer() = default;

}  // namespace pells
