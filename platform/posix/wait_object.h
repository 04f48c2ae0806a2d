// SPDX-License-Identifier: MIT
//
// WaitObject on Linux: a word that the kernel compares with what it should hold before it lets a thread sleep (a futex). A wait
// asks each object whether it is signalled, and sleeps on all their words at once if none is. Nobody can slip in between: who
// signals changes the word, and then the kernel refuses to sleep. Internal to platform/posix/.
#pragma once

#include <atomic>
#include <cstdint>

namespace vxcomn {

struct SleepWord {
    std::atomic<uint32_t> *word;  // null: nothing will happen to this object while the wait goes on
    uint32_t expected;            // what it holds as long as the object is not signalled
    bool shared;                  // written by other processes too
};

class WaitObject {
  public:
    virtual ~WaitObject() = default;
    // Whether it is signalled. Uses the signal up where the object says so.
    virtual bool take() noexcept = 0;
    // Where to sleep. Called before every sleep; take() is asked again behind it.
    virtual SleepWord sleepWord() noexcept = 0;
    // True if somebody must look after it now and then while a thread sleeps; lookAfter() then is called every kCareMilliseconds.
    virtual bool needsCare() const noexcept { return false; }
    virtual void lookAfter() noexcept {}
};

inline constexpr int64_t kCareMilliseconds = 100;

// The futex calls. `deadline` counts nanoseconds of the monotonic clock. They return on a wake, a changed word, the deadline, or
// for no reason.
void sleepOn(const SleepWord &word, int64_t deadline) noexcept;
void wakeAll(std::atomic<uint32_t> *word, bool shared) noexcept;

}  // namespace vxcomn
