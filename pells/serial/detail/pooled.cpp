#include "pells/serial/detail/pooled.h"

namespace pells::detail {

namespace {

// An address sanitizer sees the use of freed objects only where they are really freed.
#if defined(__SANITIZE_ADDRESS__)
const bool pooling = false;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
const bool pooling = false;
#else
const bool pooling = true;
#endif
#else
const bool pooling = true;
#endif

const std::size_t poolStep = 16;
const std::size_t largest = 256;
const unsigned keptOfASize = 256;

class FreeLists {
public:
    constexpr FreeLists() = default;
    FreeLists(const FreeLists&) = delete;
    FreeLists& operator=(const FreeLists&) = delete;

    /// Objects that static destructors free later go straight to the heap.
    ~FreeLists() {
        for (List& list : lists) {
            while (Block* const block = list.first) {
                list.first = block->next;
                ::operator delete(block);
            }
            list.room = 0;
        }
    }

    void* take(std::size_t size) {
        List& list = lists[(size - 1) / poolStep];
        Block* const block = list.first;
        if (!block)
            return ::operator new((size + poolStep - 1) / poolStep * poolStep);
        list.first = block->next;
        ++list.room;
        return block;
    }

    void give(void* memory, std::size_t size) noexcept {
        List& list = lists[(size - 1) / poolStep];
        if (list.room == 0) {
            ::operator delete(memory);
            return;
        }
        --list.room;
        list.first = ::new (memory) Block{list.first};
    }

private:
    struct Block {
        Block* next;
    };
    struct List {
        Block* first = nullptr;
        unsigned room = keptOfASize;
    };

    List lists[largest / poolStep];
};

FreeLists freeLists;

bool isPooled(std::size_t size) {
    return pooling && size - 1 < largest;
}

}  // namespace

void* allocatePooled(std::size_t size) {
    return isPooled(size) ? freeLists.take(size) : ::operator new(size);
}

void freePooled(void* memory, std::size_t size) noexcept {
    if (!memory)
        return;
    if (isPooled(size))
        freeLists.give(memory, size);
    else
        ::operator delete(memory);
}

}  // namespace pells::detail
