#include "pells/platform/counter.h"

#include <algorithm>

#if defined(_WIN32)
#include <windows.h>
#else
#include <time.h>
#endif

#if defined(__linux__) && defined(__x86_64__)
#define PELLS_PROCESSOR_TICKS
#include <x86intrin.h>
#endif

namespace pells {
namespace platform {

#if defined(_WIN32)

std::uint64_t counter() {
    LARGE_INTEGER ticks;
    QueryPerformanceCounter(&ticks);
    return static_cast<std::uint64_t>(ticks.QuadPart);
}

std::uint64_t counterFrequency() {
    LARGE_INTEGER frequency;
    QueryPerformanceFrequency(&frequency);
    return static_cast<std::uint64_t>(frequency.QuadPart);
}

#else

namespace {

std::uint64_t systemNanoseconds() {
    timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<std::uint64_t>(now.tv_sec) * 1000000000u +
           static_cast<std::uint64_t>(now.tv_nsec);
}

#ifdef PELLS_PROCESSOR_TICKS

/// The system's clock, asked once a millisecond; in between the processor's ticks are counted on.
///
/// The system waits for all instructions under way whenever it is asked, which takes longer than
/// reading an XML token that is being timed. Ticks are trusted for no longer than that millisecond,
/// so whatever happens to them (a sleep, another processor, another rate) shifts the time by no
/// more.
class TickingClock {
public:
    std::uint64_t nanoseconds() {
        const std::uint64_t elapsed = __rdtsc() - start.ticks;
        const std::uint64_t now =
            elapsed < trusted ? start.nanoseconds + (elapsed * rate >> rateBits) : synchronize();
        return latest = std::max(latest, now);
    }

private:
    struct Moment {
        std::uint64_t ticks = 0;
        std::uint64_t nanoseconds = 0;
    };

    static constexpr unsigned rateBits = 32;
    static constexpr std::uint64_t period = 1000000;  // nanoseconds

    std::uint64_t synchronize() {
        const Moment now{__rdtsc(), systemNanoseconds()};
        const std::uint64_t between = __rdtsc() - now.ticks;
        const std::uint64_t elapsed = now.nanoseconds - start.nanoseconds;
        trusted = 0;
        if (elapsed < period)
            return now.nanoseconds;
        // The rate comes from a stretch that is long beside the readings, and free of sleep.
        const std::uint64_t ticks = now.ticks - start.ticks;
        const bool plausible = elapsed < 1000 * period && between < ticks / 256 &&
                               ticks / 16 < elapsed && elapsed / 16 < ticks;
        if (plausible) {
            rate = (elapsed << rateBits) / ticks;
            trusted = (period << rateBits) / rate;
        }
        start = now;
        return now.nanoseconds;
    }

    Moment start;
    std::uint64_t rate = 0;     // nanoseconds a tick, times 2 to the power of rateBits
    std::uint64_t trusted = 0;  // how many ticks from the start the rate holds for
    std::uint64_t latest = 0;
};

std::uint64_t nanoseconds() {
    static TickingClock clock;
    return clock.nanoseconds();
}

#else

std::uint64_t nanoseconds() {
    return systemNanoseconds();
}

#endif

}  // namespace

std::uint64_t counter() {
    return nanoseconds() / 1000u;
}

std::uint64_t counterFrequency() {
    return 1000000u;
}

#endif

}  // namespace platform
}  // namespace pells
