// SPDX-License-Identifier: MIT
#include "platform/event.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <ctime>

#include <linux/futex.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "platform/clock.h"
#include "platform/posix/wait_object.h"

namespace vxcomn {
namespace {

constexpr int64_t kMillisecond = 1000000;  // ns, as performanceCounter counts on Linux
constexpr int64_t kNever = INT64_MAX;

class EventObject final : public WaitObject {
  public:
    EventObject(EventReset reset, bool set) : reset_(reset), word_(set ? 1 : 0) {}

    bool take() noexcept override {
        if (reset_ == EventReset::manual) return word_.load() != 0;
        uint32_t set = 1;
        return word_.compare_exchange_strong(set, 0);
    }
    SleepWord sleepWord() noexcept override { return {&word_, 0, false}; }

    void set() noexcept {
        if (word_.exchange(1) == 0) wakeAll(&word_, false);
    }
    void reset() noexcept { word_.store(0); }

  private:
    const EventReset reset_;
    std::atomic<uint32_t> word_;  // 1 is set
};

timespec timeOf(int64_t deadline) noexcept {
    constexpr int64_t kSecond = 1000 * kMillisecond;
    return {static_cast<time_t>(deadline / kSecond), static_cast<long>(deadline % kSecond)};
}

// Kernels before 5.16, and some sandboxes, cannot wait for several words at once; there they are looked at every millisecond.
void sleepOnAll(std::span<const SleepWord> words, int64_t deadline) noexcept {
    static std::atomic<bool> oneAtATime{false};
    if (words.size() > 1 && !oneAtATime.load(std::memory_order_relaxed)) {
        std::array<futex_waitv, kMaxWaitObjects> waits;
        for (size_t i = 0; i < words.size(); ++i) {
            waits[i] = {words[i].expected, reinterpret_cast<uintptr_t>(words[i].word),
                        FUTEX_32 | (words[i].shared ? 0u : FUTEX_PRIVATE_FLAG), 0};
        }
        const timespec until = timeOf(deadline);
        if (syscall(SYS_futex_waitv, waits.data(), words.size(), 0, deadline == kNever ? nullptr : &until, CLOCK_MONOTONIC) >= 0 ||
            (errno != ENOSYS && errno != EPERM)) {
            return;
        }
        oneAtATime.store(true, std::memory_order_relaxed);
    }
    if (words.size() > 1) deadline = std::min(deadline, performanceCounter() + kMillisecond);
    static std::atomic<uint32_t> nothing{0};
    sleepOn(words.empty() ? SleepWord{&nothing, 0, false} : words.front(), deadline);
}

int64_t deadlineAfter(uint32_t milliseconds) noexcept {
    return milliseconds == kForever ? kNever : performanceCounter() + milliseconds * kMillisecond;
}

}  // namespace

void sleepOn(const SleepWord &word, int64_t deadline) noexcept {
    const timespec until = timeOf(deadline);
    syscall(SYS_futex, word.word, FUTEX_WAIT_BITSET | (word.shared ? 0 : FUTEX_PRIVATE_FLAG), word.expected,
            deadline == kNever ? nullptr : &until, nullptr, FUTEX_BITSET_MATCH_ANY);
}

void wakeAll(std::atomic<uint32_t> *word, bool shared) noexcept {
    syscall(SYS_futex, word, FUTEX_WAKE | (shared ? 0 : FUTEX_PRIVATE_FLAG), INT_MAX, nullptr, nullptr, 0);
}

Waitable::Waitable() noexcept = default;
Waitable::Waitable(std::unique_ptr<WaitObject> object) noexcept : object_(std::move(object)) {}
Waitable::Waitable(Waitable &&) noexcept = default;
Waitable &Waitable::operator=(Waitable &&) noexcept = default;
Waitable::~Waitable() = default;

void Waitable::adopt(std::unique_ptr<WaitObject> object) noexcept {
    object_ = std::move(object);
}

Event::Event(EventReset reset, bool set) : Waitable(std::make_unique<EventObject>(reset, set)) {}

void Event::set() noexcept {
    if (object() != nullptr) static_cast<EventObject *>(object())->set();
}

void Event::reset() noexcept {
    if (object() != nullptr) static_cast<EventObject *>(object())->reset();
}

void *Event::handle() const noexcept {
    return object();
}

WaitAnswer waitForAny(std::span<const Waitable *const> objects, uint32_t milliseconds) noexcept {
    if (objects.empty() || objects.size() > kMaxWaitObjects) return {WaitOutcome::failed, 0};
    bool care = false;
    for (const Waitable *object : objects) {
        if (object == nullptr || !*object) return {WaitOutcome::failed, 0};
        care |= object->object()->needsCare();
    }
    const int64_t deadline = deadlineAfter(milliseconds);
    int64_t nextCare = care ? performanceCounter() + kCareMilliseconds * kMillisecond : kNever;
    std::array<SleepWord, kMaxWaitObjects> words;
    for (;;) {
        for (size_t i = 0; i < objects.size(); ++i) {
            if (objects[i]->object()->take()) return {WaitOutcome::signalled, i};
        }
        const int64_t now = performanceCounter();
        if (now >= deadline) return {WaitOutcome::timedOut, 0};
        if (now >= nextCare) {
            for (const Waitable *object : objects) object->object()->lookAfter();
            nextCare = now + kCareMilliseconds * kMillisecond;
            continue;
        }
        size_t count = 0;
        for (const Waitable *object : objects) {
            const SleepWord word = object->object()->sleepWord();
            if (word.word != nullptr) words[count++] = word;
        }
        sleepOnAll(std::span(words).first(count), std::min(deadline, nextCare));
    }
}

}  // namespace vxcomn
