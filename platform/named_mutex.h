// SPDX-License-Identifier: MIT
//
// Named mutexes of the machine: locks between processes, and tokens of life, since the name vanishes with the last process that
// holds it, also when that is killed. Names are the system's, with their `Global\` in front, and compare exactly; behind it no
// further backslash is allowed. On Linux they stand in the machine folder's `tokens`, and `Local\` is as wide as `Global\`. A
// thread owns a mutex as often as it has acquired it. Control threads; one object may be used by several.
#pragma once

#include <cstdint>
#include <memory>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// `abandoned` is acquired too, but the last owner died, or its thread ended, without a release. Told once, to the next owner.
enum class MutexWait : uint8_t { acquired, abandoned, timedOut, failed };

enum class MutexOwner : uint8_t { none, caller };

class NamedMutex {
  public:
    NamedMutex() noexcept;
    NamedMutex(NamedMutex &&) noexcept;
    NamedMutex &operator=(NamedMutex &&) noexcept;
    ~NamedMutex();

    // Makes the mutex, for everybody, or opens the one of that name. The caller owns it at once if that was asked for and it is
    // new; `created` (if given) tells whether it is.
    static Status create(WideView name, NamedMutex &mutex, MutexOwner owner = MutexOwner::none, bool *created = nullptr);
    // Opens one that exists; 2 if none of that name does.
    static Status open(WideView name, NamedMutex &mutex);
    // Whether anybody holds one of that name.
    static bool exists(WideView name);

    explicit operator bool() const noexcept;
    // Lets go of the name. What the caller still owns is abandoned.
    void close() noexcept;

    // Waits for ownership; kForever (event.h) has no end, 0 only tries.
    [[nodiscard]] MutexWait acquire(uint32_t milliseconds) noexcept;
    // Gives one acquisition back; 288 (not the owner) if the calling thread has none.
    Status release() noexcept;

  private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

// Ownership for a scope. The outcome stays to be seen, so that going on without the lock is a visible branch.
class [[nodiscard]] MutexLock {
  public:
    MutexLock(NamedMutex &mutex, uint32_t milliseconds) noexcept : mutex_(mutex), outcome_(mutex.acquire(milliseconds)) {}
    ~MutexLock() {
        if (owns()) mutex_.release();
    }
    MutexLock(const MutexLock &) = delete;
    MutexLock &operator=(const MutexLock &) = delete;

    MutexWait outcome() const noexcept { return outcome_; }
    bool owns() const noexcept { return outcome_ == MutexWait::acquired || outcome_ == MutexWait::abandoned; }

  private:
    NamedMutex &mutex_;
    const MutexWait outcome_;
};

}  // namespace vxcomn
