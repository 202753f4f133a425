// Single system calls made to misbehave through the library's call table
// (zkSystem): a fault armed on one entry fails or shortens that call, and
// zkFaultTest puts the real calls back after each test.
#pragma once

#include <errno.h>
#include <gtest/gtest.h>

#include <type_traits>

#include "internal/zkFileSystem.h"
#include "support/zkTempDir.h"

inline const zkSystemCalls kRealCalls = zkSystem;

// How one entry misbehaves: its nth call (0: every call) answers result with
// errno set to error; the other calls reach the entry it replaced.
struct Fault {
    long nth, result;
    int error;
};

// Calls whose failure may come after they took effect: Linux releases the
// descriptor even when close reports a failure, and a reservation that runs
// out of space may already have made the file longer.
template <auto Entry>
inline constexpr bool kTakesEffectFirst = false;
template <>
inline constexpr bool kTakesEffectFirst<&zkSystemCalls::close> = true;
template <>
inline constexpr bool kTakesEffectFirst<&zkSystemCalls::allocate> = true;

// Arms one entry at a time: arming it twice before the table is put back
// would make it call itself.
template <auto Entry, typename Call = std::remove_reference_t<decltype(zkSystem.*Entry)>>
struct Faulty;

template <auto Entry, typename R, typename... A>
struct Faulty<Entry, R (*)(A...)> {
    static inline Fault fault;
    static inline long calls;
    static inline R (*next)(A...);
    static R call(A... args) {
        ++calls;
        if (fault.nth != 0 && fault.nth != calls) return next(args...);
        if constexpr (kTakesEffectFirst<Entry>) next(args...);
        errno = fault.error;
        return static_cast<R>(fault.result);
    }
    static void arm(Fault f) {
        fault = f;
        calls = 0;
        next = zkSystem.*Entry;
        zkSystem.*Entry = &call;
    }
};

using Arm = void (*)(Fault);
#define ZK_FAULTY(entry) &Faulty<&zkSystemCalls::entry>::arm

// Reads and writes that move at most three bytes a call; armed before the
// faults that count those calls.
inline void armShortTransfers(Fault) {
    zkSystem.write = [](int fd, const void* data, size_t size) {
        return kRealCalls.write(fd, data, size < 3 ? size : 3);
    };
    zkSystem.pread = [](int fd, void* data, size_t size, off_t at) {
        return kRealCalls.pread(fd, data, size < 3 ? size : 3, at);
    };
    zkSystem.pwrite = [](int fd, const void* data, size_t size, off_t at) {
        return kRealCalls.pwrite(fd, data, size < 3 ? size : 3, at);
    };
}

// One call made to misbehave.
struct Step {
    Arm arm;
    Fault fault;
};

// Puts the calls of base in place and arms steps (empty ones skipped).
template <size_t N>
void zkArm(const Step (&steps)[N], const zkSystemCalls& base = kRealCalls) {
    zkSystem = base;
    for (const Step& step : steps)
        if (step.arm != nullptr) step.arm(step.fault);
}

// A test in its own directory that ends with the real calls in place.
class zkFaultTest : public ::testing::Test {
protected:
    void TearDown() override { zkSystem = kRealCalls; }
    zkTempDir m_dir;
};
