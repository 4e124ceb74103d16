#pragma once

#include <new>
#include <utility>

#include "pells/core/export.h"

namespace pells {

/// Holds a function-local static that is never destroyed.
///
/// Static destructors, the library's exit hooks among them, may still use such an object, whatever
/// order they run in. Memory that the object owns is left to the end of the process.
template <class T>
class NoDestructor {
public:
    /// Constructs the object from the arguments.
    template <class... Args>
    explicit NoDestructor(Args&&... args) {
        ::new (static_cast<void*>(storage)) T(std::forward<Args>(args)...);
    }
    NoDestructor(const NoDestructor&) = delete;
    NoDestructor& operator=(const NoDestructor&) = delete;

    /// The object.
    T& operator*() { return *get(); }
    const T& operator*() const { return *get(); }
    T* operator->() { return get(); }
    const T* operator->() const { return get(); }

private:
    T* get() { return std::launder(reinterpret_cast<T*>(storage)); }
    const T* get() const { return std::launder(reinterpret_cast<const T*>(storage)); }

    alignas(T) unsigned char storage[sizeof(T)];
};

}  // namespace pells
