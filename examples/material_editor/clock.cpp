#include "clock.h"

#include <pells/core/factory.h>

#include <chrono>
#include <cstdint>

namespace material_editor {

namespace {

// Makes the class known, so that pells::Timer::instance() is a Clock.
const pells::Factory<pells::Timer, Clock> clockFactory(pells::Timer::TimerName);

}  // namespace

pells::Timestamp Clock::now() {
    const auto sinceStart = std::chrono::steady_clock::now().time_since_epoch();
    const auto count = static_cast<std::uint64_t>(
        std::chrono::duration_cast<std::chrono::microseconds>(sinceStart).count());
    return pells::Timestamp(static_cast<std::uint32_t>(count >> 32),
                            static_cast<std::uint32_t>(count));
}

}  // namespace material_editor
