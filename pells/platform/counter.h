#pragma once

#include <cstdint>

#include "pells/core/export.h"

namespace pells {
namespace platform {

/// The system's high-resolution counter, which never goes back; its zero is arbitrary.
///
/// On POSIX systems it ticks in microseconds: a nanosecond counter times 1,000,000 would leave 64
/// bits after five hours. It follows the monotonic clock, on x86-64 Linux to within a millisecond.
/// One thread.
PELLS_API std::uint64_t counter();

/// Ticks of counter() a second.
PELLS_API std::uint64_t counterFrequency();

}  // namespace platform
}  // namespace pells
