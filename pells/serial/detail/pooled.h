#pragma once

#include <cstddef>
#include <new>

#include "pells/core/export.h"

namespace pells::detail {

/// Memory of small objects that come and go in great numbers. What is freed is kept for the next
/// object of its size, up to a limit, and returned when the library is unloaded. One thread only.
///
/// \throws std::bad_alloc
PELLS_API void* allocatePooled(std::size_t size);
PELLS_API void freePooled(void* memory, std::size_t size) noexcept;

/// Base of classes whose objects live in pooled memory: descriptions are built for every object
/// that is saved or loaded, and the allocator would cost more than all else they do.
struct Pooled {
    static void* operator new(std::size_t size) { return allocatePooled(size); }
    static void operator delete(void* memory, std::size_t size) noexcept {
        freePooled(memory, size);
    }

    static void* operator new(std::size_t size, std::align_val_t alignment) {
        return ::operator new(size, alignment);
    }
    static void operator delete(void* memory, std::align_val_t alignment) noexcept {
        ::operator delete(memory, alignment);
    }

    static void* operator new(std::size_t /*size*/, void* place) noexcept { return place; }
    static void operator delete(void* /*memory*/, void* /*place*/) noexcept {}
};

/// Gives containers pooled memory.
template <class T>
class PooledAllocator {
public:
    typedef T value_type;

    PooledAllocator() = default;
    template <class U>
    PooledAllocator(const PooledAllocator<U>& /*other*/) noexcept {}  // NOLINT

    T* allocate(std::size_t count) {
        if (count > static_cast<std::size_t>(-1) / itemSize)
            throw std::bad_array_new_length();
        return static_cast<T*>(allocatePooled(count * itemSize));
    }
    void deallocate(T* memory, std::size_t count) noexcept { freePooled(memory, count * itemSize); }

    friend bool operator==(const PooledAllocator&, const PooledAllocator&) { return true; }
    friend bool operator!=(const PooledAllocator&, const PooledAllocator&) { return false; }

private:
    static constexpr std::size_t itemSize = sizeof(T);  // NOLINT: of pointers, too
};

}  // namespace pells::detail
