// SPDX-License-Identifier: MIT
//
// ReactiveProperty: a value that tells when it changes. Setting it calls the changing handlers, assigns, and calls the changed
// handlers, all in list order under the owner's recursive lock, on the thread that sets. Handlers may set further properties of the
// same owner, and add and remove handlers. Any control thread; never the block path, since handlers block on the registry.
#pragma once

#include <algorithm>
#include <cstring>
#include <mutex>
#include <utility>
#include <vector>

#include "preset/engine_identity.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

// The owner's lock: first in every lock order.
using StateLock = std::recursive_mutex;

// An object and what is called with it. Two are equal if both are.
struct PropertyHandler {
    void *object = nullptr;
    void (*call)(void *object) = nullptr;

    friend bool operator==(const PropertyHandler &, const PropertyHandler &) = default;
};

// The handler that calls `object->*method`.
template <auto method, class Object>
PropertyHandler handlerOf(Object *object) noexcept {
    return {object, [](void *target) { (static_cast<Object *>(target)->*method)(); }};
}

// When two values count as the same, so that a set does nothing.
template <class T>
bool sameProperty(const T &left, const T &right) noexcept {
    return left == right;
}
inline bool sameProperty(const EngineConfig &left, const EngineConfig &right) noexcept {
    return sameEngineConfig(left, right);
}
inline bool sameProperty(const GUID &left, const GUID &right) noexcept {
    return std::memcmp(&left, &right, sizeof(GUID)) == 0;
}

template <class T>
class ReactiveProperty {
  public:
    explicit ReactiveProperty(StateLock &lock, T value = T()) : lock_(lock), value_(std::move(value)) {}
    ReactiveProperty(const ReactiveProperty &) = delete;
    ReactiveProperty &operator=(const ReactiveProperty &) = delete;

    // A copy of the value as it stands.
    T get() const {
        const std::lock_guard guard(lock_);
        return value_;
    }

    // The value itself, for who holds the lock.
    const T &underLock() const noexcept { return value_; }

    // Fires nothing if the value is the one that stands.
    void set(T value) {
        const std::lock_guard guard(lock_);
        if (sameProperty(value_, value)) return;
        fire(changing_);
        value_ = std::move(value);
        fire(changed_);
    }

    // Assigns without a word to anybody.
    void setSilently(T value) {
        const std::lock_guard guard(lock_);
        value_ = std::move(value);
    }

    // Duplicates are kept; removing takes every equal one.
    void addChanging(PropertyHandler handler) { add(changing_, handler); }
    void addChanged(PropertyHandler handler) { add(changed_, handler); }
    void removeChanging(PropertyHandler handler) { remove(changing_, handler); }
    void removeChanged(PropertyHandler handler) { remove(changed_, handler); }

  private:
    using Handlers = std::vector<PropertyHandler>;

    // By index, over the list as it stands at each step: a handler may add and remove.
    void fire(const Handlers &handlers) {
        for (size_t at = 0; at < handlers.size(); ++at) {
            const PropertyHandler handler = handlers[at];
            handler.call(handler.object);
        }
    }
    void add(Handlers &handlers, PropertyHandler handler) {
        const std::lock_guard guard(lock_);
        handlers.push_back(handler);
    }
    void remove(Handlers &handlers, PropertyHandler handler) {
        const std::lock_guard guard(lock_);
        std::erase(handlers, handler);
    }

    StateLock &lock_;
    T value_;
    Handlers changing_, changed_;
};

}  // namespace vxcomn
