#include "pells/platform/counter.h"

#if defined(_WIN32)
#include <windows.h>
#else
#include <time.h>
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

std::uint64_t counter() {
    timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<std::uint64_t>(now.tv_sec) * 1000000u +
           static_cast<std::uint64_t>(now.tv_nsec) / 1000u;
}

std::uint64_t counterFrequency() {
    return 1000000u;
}

#endif

}  // namespace platform
}  // namespace pells
