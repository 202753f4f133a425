// What the library does when a node of one of its containers or a record it
// owns cannot be allocated: it says "out of memory" on standard error and
// ends the process with status 1. Containers are filled through
// zkNodeAllocator or zkAppendNode and records made through zkNewRecord, so no
// container operation ever throws std::bad_alloc into the caller.
#ifndef ZK_INTERNAL_OUT_OF_MEMORY_H
#define ZK_INTERNAL_OUT_OF_MEMORY_H

#include <cstddef>
#include <new>
#include <utility>

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

// Appends value to a standard list; a node that cannot be allocated ends the
// process. Returns the new element.
template <class List, class... Args>
typename List::reference zkAppendNode(List& list, Args&&... args) {
    try {
        list.emplace_back(std::forward<Args>(args)...);
    } catch (const std::bad_alloc&) {
        zkOutOfMemory();
    }
    return list.back();
}

// A new T built from args; a record that cannot be allocated ends the process.
template <class T, class... Args>
T* zkNewRecord(Args&&... args) {
    T* record = new (std::nothrow) T(std::forward<Args>(args)...);
    if (record == nullptr) zkOutOfMemory();
    return record;
}

#endif
