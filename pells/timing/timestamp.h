#pragma once

#include <cstdint>

#include "pells/core/export.h"

namespace pells {

/// A point in time, or a span, counted in microseconds in 64 unsigned bits.
class PELLS_API Timestamp {
public:
    /// Zero.
    Timestamp() = default;

    /// \param highHalf upper 32 bits of the count; one unit is 2^32 microseconds (71.6 minutes).
    /// \param lowHalf  lower 32 bits of the count.
    Timestamp(std::uint32_t highHalf, std::uint32_t lowHalf) : high(highHalf), low(lowHalf) {}

    /// A lower half of 0.
    explicit Timestamp(std::uint32_t highHalf) : high(highHalf) {}

    /// The halves of the count.
    std::uint32_t getHigh() const { return high; }
    std::uint32_t getLow() const { return low; }

    /// Whether this is the earlier time.
    bool operator<(const Timestamp& other) const;

    /// This plus a span in microseconds, modulo 2^64.
    Timestamp addMicrosec(std::uint32_t span) const;

    /// This minus a span in microseconds, modulo 2^64.
    Timestamp subtractMicrosec(std::uint32_t span) const;

    /// This minus other in milliseconds: half a millisecond is added and the fraction dropped, so
    /// 1.5 gives 2, -1.7 gives -1 and -1.2 gives 0. A difference that 32 bits cannot hold gives the
    /// nearest number that they can.
    std::int32_t operator-(const Timestamp& other) const;

    /// This minus other in microseconds, for values less than 2^31 microseconds (35.8 minutes)
    /// apart.
    ///
    /// Where one value's upper half exceeds 1000000 and the other's is at most 2, the first counts
    /// as the zero of time. Other values too far apart leave a line under the tag "error", and the
    /// difference of the lower halves is returned.
    std::int32_t diffInMicrosec(const Timestamp& other) const;

private:
    std::uint32_t high = 0;
    std::uint32_t low = 0;
};

}  // namespace pells
