// Single system calls made to misbehave through the library's call table
// (zkSystem): a fault armed on one entry fails or shortens that call, and
// zkFaultTest puts the real calls back after each test.
#pragma once

#include <errno.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <sstream>
#include <string>
#include <type_traits>
#include <vector>

#include "internal/zkFileSystem.h"
#include "support/zkTableFile.h"
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

// Reads and writes that move at most the Fault's result in bytes a call, or
// three when it is 0; armed before the faults that count those calls.
inline size_t gTransferCap = 3;
inline void armShortTransfers(Fault f) {
    gTransferCap = f.result > 0 ? static_cast<size_t>(f.result) : 3;
    zkSystem.write = [](int fd, const void* data, size_t size) {
        return kRealCalls.write(fd, data, std::min(size, gTransferCap));
    };
    zkSystem.pread = [](int fd, void* data, size_t size, off_t at) {
        return kRealCalls.pread(fd, data, std::min(size, gTransferCap), at);
    };
    zkSystem.pwrite = [](int fd, const void* data, size_t size, off_t at) {
        return kRealCalls.pwrite(fd, data, std::min(size, gTransferCap), at);
    };
}

// One call made to misbehave.
struct Step {
    Arm arm;
    Fault fault;
};

// An errno name of the fault tables, or a number.
inline long zkNumber(const std::string& field) {
    // clang-format off
    static const std::map<std::string, long> names = {{"EINTR", EINTR}, {"EEXIST", EEXIST}, {"EIO", EIO},
        {"EPERM", EPERM}, {"EACCES", EACCES}, {"ENOSPC", ENOSPC}, {"EOPNOTSUPP", EOPNOTSUPP},
        {"ENAMETOOLONG", ENAMETOOLONG}, {"EINVAL", EINVAL}};
    // clang-format on
    const auto name = names.find(field);
    return name != names.end() ? name->second : std::stol(field);
}

// The steps written in the fields of a fault table from index `from` on:
// "CALL:NTH:RESULT:ERRNO" arms the entry CALL with that Fault, "short" (or
// "short:0:N") arms armShortTransfers.
inline std::vector<Step> zkSteps(const std::vector<std::string>& fields, size_t from) {
    // clang-format off
    static const std::map<std::string, Arm> entries = {{"open", ZK_FAULTY(open)}, {"close", ZK_FAULTY(close)},
        {"read", ZK_FAULTY(read)}, {"write", ZK_FAULTY(write)}, {"pread", ZK_FAULTY(pread)},
        {"pwrite", ZK_FAULTY(pwrite)}, {"fsync", ZK_FAULTY(fsync)}, {"ftruncate", ZK_FAULTY(ftruncate)},
        {"allocate", ZK_FAULTY(allocate)}, {"rename", ZK_FAULTY(rename)}, {"mkdir", ZK_FAULTY(mkdir)},
        {"readlink", ZK_FAULTY(readlink)}, {"fchown", ZK_FAULTY(fchown)}, {"fchmod", ZK_FAULTY(fchmod)},
        {"short", armShortTransfers}};
    // clang-format on
    std::vector<Step> steps;
    for (size_t i = from; i < fields.size(); ++i) {
        std::istringstream in(fields[i] + ":0:0:0");
        std::string call, nth, result, error;
        std::getline(std::getline(std::getline(std::getline(in, call, ':'), nth, ':'), result, ':'), error, ':');
        steps.push_back({entries.at(call), {std::stol(nth), zkNumber(result), static_cast<int>(zkNumber(error))}});
    }
    return steps;
}

// Puts the calls of base in place and arms steps (empty ones skipped).
inline void zkArm(const std::vector<Step>& steps, const zkSystemCalls& base = kRealCalls) {
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
