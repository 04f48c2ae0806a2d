// SPDX-License-Identifier: MIT
#include "platform/event.h"

#include <array>

#include "platform/windows/wait_object.h"

namespace vxcomn {

static_assert(kForever == INFINITE && kMaxWaitObjects == MAXIMUM_WAIT_OBJECTS);

Waitable::Waitable() noexcept = default;
Waitable::Waitable(std::unique_ptr<WaitObject> object) noexcept : object_(std::move(object)) {}
Waitable::Waitable(Waitable &&) noexcept = default;
Waitable &Waitable::operator=(Waitable &&) noexcept = default;
Waitable::~Waitable() = default;

void Waitable::adopt(std::unique_ptr<WaitObject> object) noexcept {
    object_ = std::move(object);
}

namespace {

std::unique_ptr<WaitObject> makeEvent(EventReset reset, bool set) {
    SystemHandle handle(CreateEventW(nullptr, reset == EventReset::manual, set, nullptr));
    return handle ? std::make_unique<WaitObject>(std::move(handle)) : nullptr;
}

}  // namespace

Event::Event(EventReset reset, bool set) : Waitable(makeEvent(reset, set)) {}

void Event::set() noexcept {
    if (object() != nullptr) SetEvent(object()->get());
}

void Event::reset() noexcept {
    if (object() != nullptr) ResetEvent(object()->get());
}

void *Event::handle() const noexcept {
    return object() != nullptr ? object()->get() : nullptr;
}

WaitAnswer waitForAny(std::span<const Waitable *const> objects, uint32_t milliseconds) noexcept {
    if (objects.empty() || objects.size() > kMaxWaitObjects) return {WaitOutcome::failed, 0};
    std::array<HANDLE, kMaxWaitObjects> handles;
    for (size_t i = 0; i < objects.size(); ++i) {
        if (objects[i] == nullptr || !*objects[i]) return {WaitOutcome::failed, 0};
        handles[i] = objects[i]->object()->get();
    }
    const DWORD result = WaitForMultipleObjects(static_cast<DWORD>(objects.size()), handles.data(), FALSE, milliseconds);
    if (result < WAIT_OBJECT_0 + objects.size()) return {WaitOutcome::signalled, result - WAIT_OBJECT_0};
    return {result == WAIT_TIMEOUT ? WaitOutcome::timedOut : WaitOutcome::failed, 0};
}

}  // namespace vxcomn
