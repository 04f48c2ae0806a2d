// SPDX-License-Identifier: MIT
//
// Words of a context that one thread writes while another may read them, without either holding the other up (formats' frames,
// silence count, rates, a meter's peaks, results of a measurement): atomic accesses to plain fields, so that neither side sees a
// torn or stale-forever value. Any thread, real-time safe.
#pragma once

#include <atomic>

#include "measure/realtime.h"

namespace vxcomn {

template <class T>
VXCOMN_RT_INLINE T loadShared(const T &word) noexcept {
    return std::atomic_ref<T>(const_cast<T &>(word)).load(std::memory_order_relaxed);
}

template <class T>
VXCOMN_RT_INLINE void storeShared(T &word, T value) noexcept {
    std::atomic_ref<T>(word).store(value, std::memory_order_relaxed);
}

// The pair for a word that publishes others: what was written before the store is seen by whoever has loaded its value.
template <class T>
VXCOMN_RT_INLINE T loadPublished(const T &word) noexcept {
    return std::atomic_ref<T>(const_cast<T &>(word)).load(std::memory_order_acquire);
}
template <class T>
VXCOMN_RT_INLINE void publish(T &word, T value) noexcept {
    std::atomic_ref<T>(word).store(value, std::memory_order_release);
}

}  // namespace vxcomn
