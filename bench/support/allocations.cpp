#include "bench/support/allocations.h"

#include <malloc.h>

#include <algorithm>
#include <cstdlib>
#include <new>

namespace {

bool counting = false;
std::int64_t allocations = 0;
std::int64_t heldBytes = 0;
std::int64_t mostBytes = 0;

std::int64_t sizeOf(void* memory) {
    return static_cast<std::int64_t>(malloc_usable_size(memory));
}

}  // namespace

void* operator new(std::size_t size) {
    void* const memory = std::malloc(std::max<std::size_t>(size, 1));
    if (!memory)
        throw std::bad_alloc();
    if (counting) {
        ++allocations;
        heldBytes += sizeOf(memory);
        mostBytes = std::max(mostBytes, heldBytes);
    }
    return memory;
}

void operator delete(void* memory) noexcept {
    if (counting && memory)
        heldBytes -= sizeOf(memory);
    std::free(memory);
}

void operator delete(void* memory, std::size_t /*size*/) noexcept {
    operator delete(memory);
}

namespace bench {

AllocationMeter::AllocationMeter() {
    allocations = heldBytes = mostBytes = 0;
    counting = true;
}

AllocationMeter::~AllocationMeter() {
    counting = false;
}

std::int64_t AllocationMeter::count() const {
    return allocations;
}

std::int64_t AllocationMeter::peakBytes() const {
    return mostBytes;
}

}  // namespace bench
