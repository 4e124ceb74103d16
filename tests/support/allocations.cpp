#include "support/allocations.h"

#include <malloc.h>

#include <algorithm>
#include <cstdlib>
#include <new>

namespace {

bool counting = false;
std::int64_t allocations = 0;
std::int64_t failingAllocation = -1;
std::int64_t heldBytes = 0;
std::int64_t mostBytes = 0;

std::int64_t sizeOf(void* memory) {
    return static_cast<std::int64_t>(malloc_usable_size(memory));
}

}  // namespace

void* operator new(std::size_t size) {
    if (counting && allocations++ == failingAllocation)
        throw std::bad_alloc();
    void* const memory = std::malloc(std::max<std::size_t>(size, 1));
    if (!memory)
        throw std::bad_alloc();
    if (counting) {
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

// The others come down to those two by the standard, but a sanitizer brings its own of each.

void* operator new(std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    try {
        return operator new(size);
    } catch (const std::bad_alloc&) {
        return nullptr;
    }
}

void* operator new[](std::size_t size) {
    return operator new(size);
}

void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept {
    return operator new(size, tag);
}

void operator delete(void* memory, std::size_t /*size*/) noexcept {
    operator delete(memory);
}

void operator delete[](void* memory) noexcept {
    operator delete(memory);
}

void operator delete[](void* memory, std::size_t /*size*/) noexcept {
    operator delete(memory);
}

namespace pells_test {

AllocationMeter::AllocationMeter(std::int64_t failing) {
    allocations = heldBytes = mostBytes = 0;
    failingAllocation = failing;
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

}  // namespace pells_test
