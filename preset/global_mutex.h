// SPDX-License-Identifier: MIT
//
// GlobalMutex: a mutex of the `Global\` namespace together with its name and the logger that hears of trouble. It serialises the
// writers of one effect slot across processes, or stands for the life of an instance. One without a handle is legal: its users say
// so in the log and go on without the lock. Control threads; the state lock (reactive_property.h) comes first.
#pragma once

#include <cstdint>

#include "diag/debug_trace.h"
#include "platform/named_mutex.h"

namespace vxcomn {

inline constexpr uint32_t kGlobalMutexWait = 5000;  // milliseconds

class GlobalMutex {
  public:
    // `trace` outlives the mutex.
    explicit GlobalMutex(const CTraceFuncCallTarget &trace) noexcept : trace_(trace) {}

    // Makes the mutex of this name, to which "Global\" is added, without owning it. What was held before is closed.
    Status create(WideView name);
    // Closes the handle and clears the name.
    void close() noexcept;

    explicit operator bool() const noexcept { return static_cast<bool>(mutex_); }
    const WideString &name() const noexcept { return name_; }

  private:
    friend class GlobalMutexLock;
    const CTraceFuncCallTarget &trace_;
    NamedMutex mutex_;
    WideString name_;
};

// Waits for the mutex and keeps it for a scope. Goes on without it, with a line in the log, if there is no handle or the wait
// fails. Gives the mutex back at the end whatever the wait came to.
class [[nodiscard]] GlobalMutexLock {
  public:
    explicit GlobalMutexLock(GlobalMutex &mutex) noexcept;
    ~GlobalMutexLock();
    GlobalMutexLock(const GlobalMutexLock &) = delete;
    GlobalMutexLock &operator=(const GlobalMutexLock &) = delete;

    bool acquired() const noexcept { return acquired_; }

  private:
    GlobalMutex &mutex_;
    bool acquired_ = false;
};

}  // namespace vxcomn
