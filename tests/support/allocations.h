#pragma once

#include <cstdint>

namespace pells_test {

/// Watches what is taken from the heap with `new`, in the library as in the program.
///
/// A program that links this replaces operator new. Memory that C code takes with malloc() is not
/// seen. One of these at a time, and one thread.
class AllocationMeter {
public:
    /// Begins to count.
    ///
    /// \param failing the allocation that throws std::bad_alloc, 0 for the next one; without it
    ///                none does.
    explicit AllocationMeter(std::int64_t failing = -1);

    /// Ends what it began.
    ~AllocationMeter();
    AllocationMeter(const AllocationMeter&) = delete;
    AllocationMeter& operator=(const AllocationMeter&) = delete;

    /// How many allocations were asked for.
    std::int64_t count() const;

    /// The most bytes that were held at a time, over what was held at the beginning.
    std::int64_t peakBytes() const;
};

}  // namespace pells_test
