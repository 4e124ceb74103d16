#pragma once

#include <cstdint>

namespace bench {

/// Counts what a piece of work takes from the heap with `new`, in the library as in the program.
///
/// A program that links this replaces operator new. Memory that C code takes with malloc() is not
/// seen. One meter at a time, and one thread.
class AllocationMeter {
public:
    /// Begins to count.
    AllocationMeter();

    /// Stops counting.
    ~AllocationMeter();
    AllocationMeter(const AllocationMeter&) = delete;
    AllocationMeter& operator=(const AllocationMeter&) = delete;

    /// How many allocations were made.
    std::int64_t count() const;

    /// The most bytes that were held at a time, over what was held at the beginning.
    std::int64_t peakBytes() const;
};

}  // namespace bench
