#include "pells/timing/timestamp.h"

#include <limits>

#include "pells/log/log.h"

namespace pells {

namespace {

std::int32_t truncated(double value) {
    typedef std::numeric_limits<std::int32_t> Limits;
    if (value >= Limits::max())
        return Limits::max();
    if (value <= Limits::min())
        return Limits::min();
    return static_cast<std::int32_t>(value);
}

/// Beyond this upper half a value is no time that a program measured from its own start.
const std::uint32_t farAway = 1000000;
const std::uint32_t nearZero = 2;

}  // namespace

bool Timestamp::operator<(const Timestamp& other) const {
    return high != other.high ? high < other.high : low < other.low;
}

Timestamp Timestamp::addMicrosec(std::uint32_t span) const {
    const std::uint32_t sum = low + span;
    return Timestamp(sum < low ? high + 1 : high, sum);
}

Timestamp Timestamp::subtractMicrosec(std::uint32_t span) const {
    return Timestamp(low < span ? high - 1 : high, low - span);
}

std::int32_t Timestamp::operator-(const Timestamp& other) const {
    const double highUnits = static_cast<std::int32_t>(high - other.high);
    const double microseconds = highUnits * 4294967296.0 + low - other.low;
    return truncated(microseconds * 0.001 + 0.5);
}

std::int32_t Timestamp::diffInMicrosec(const Timestamp& other) const {
    if (high > farAway && other.high <= nearZero)
        return static_cast<std::int32_t>(0 - other.low);
    if (other.high > farAway && high <= nearZero)
        return static_cast<std::int32_t>(low);
    const bool adjacent = high == other.high || high == other.high - 1 || high == other.high + 1;
    if (!adjacent)
        PELLS_LOG("error", "diffInMicrosecond called with too much difference between arguments");
    return static_cast<std::int32_t>(low - other.low);
}

}  // namespace pells
