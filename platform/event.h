// SPDX-License-Identifier: MIT
//
// Events and waits. An event is local to its process: set and unset, and waited for, alone or together with others and with change
// signals (change_signal.h), in one call. Any thread but the block path's.
#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <span>

#include "platform/status.h"

namespace vxcomn {

inline constexpr uint32_t kForever = 0xFFFFFFFF;  // milliseconds
inline constexpr size_t kMaxWaitObjects = 64;

// What a wait rests on: a handle on Windows, a word to sleep on elsewhere.
class WaitObject;

// Something that can be waited for. Empty if the system could not make it.
class Waitable {
  public:
    Waitable(Waitable &&) noexcept;
    Waitable &operator=(Waitable &&) noexcept;
    ~Waitable();
    explicit operator bool() const noexcept { return object_ != nullptr; }
    WaitObject *object() const noexcept { return object_.get(); }

  protected:
    Waitable() noexcept;
    explicit Waitable(std::unique_ptr<WaitObject> object) noexcept;
    void adopt(std::unique_ptr<WaitObject> object) noexcept;

  private:
    std::unique_ptr<WaitObject> object_;
};

// A manual event stays set until it is reset; an automatic one lets one wait through for each time it is set, at most one in
// advance.
enum class EventReset : uint8_t { automatic, manual };

class Event : public Waitable {
  public:
    explicit Event(EventReset reset, bool set = false);

    void set() noexcept;
    void reset() noexcept;
    // What the audio client takes as event handle.
    void *handle() const noexcept;
};

enum class WaitOutcome : uint8_t { signalled, timedOut, failed };

struct WaitAnswer {
    WaitOutcome outcome;
    size_t index;  // of what was signalled
};

// Waits until one of the objects is signalled, the first in the list if several are. A time of 0 only looks. Fails if the list is
// empty, longer than kMaxWaitObjects, or holds an empty one.
WaitAnswer waitForAny(std::span<const Waitable *const> objects, uint32_t milliseconds) noexcept;
inline WaitAnswer waitForAny(std::initializer_list<const Waitable *> objects, uint32_t milliseconds) noexcept {
    return waitForAny(std::span<const Waitable *const>(objects.begin(), objects.size()), milliseconds);
}
inline WaitOutcome waitForOne(const Waitable &object, uint32_t milliseconds) noexcept {
    return waitForAny({&object}, milliseconds).outcome;
}

}  // namespace vxcomn
