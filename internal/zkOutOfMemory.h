// What the library does when a node of one of its containers cannot be
// allocated: it says "out of memory" on standard error and ends the process
// with status 1. Containers are filled through zkNodeAllocator, which calls
// it, so no container operation ever throws std::bad_alloc into the caller.
#ifndef ZK_INTERNAL_OUT_OF_MEMORY_H
#define ZK_INTERNAL_OUT_OF_MEMORY_H

#include <cstddef>
#include <new>

// Writes "out of memory" and a line end to standard error, exits with status 1.
[[noreturn]] void zkOutOfMemory();

// A standard allocator whose failure ends the process through zkOutOfMemory.
template <class T>
struct zkNodeAllocator {
    using value_type = T;

    zkNodeAllocator() noexcept = default;
    template <class U>
    zkNodeAllocator(const zkNodeAllocator<U>&) noexcept {}

    T* allocate(std::size_t n) {
        if (n > static_cast<std::size_t>(-1) / sizeof(T)) zkOutOfMemory();
        void* p = ::operator new(n * sizeof(T), std::nothrow);
        if (p == nullptr) zkOutOfMemory();
        return static_cast<T*>(p);
    }

    void deallocate(T* p, std::size_t) noexcept { ::operator delete(p); }

    template <class U>
    bool operator==(const zkNodeAllocator<U>&) const noexcept {
        return true;
    }
    template <class U>
    bool operator!=(const zkNodeAllocator<U>&) const noexcept {
        return false;
    }
};

#endif
