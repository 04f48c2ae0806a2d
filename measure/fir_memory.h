// SPDX-License-Identifier: MIT
//
// Arrays on a cache line's border, for the widest registers. Made and freed by control calls.
#pragma once

#include <cstddef>
#include <memory>
#include <new>

namespace vxcomn {

struct AlignedRelease {
    void operator()(void *memory) const noexcept { ::operator delete (memory, std::align_val_t{64}); }
};

template <typename T>
using AlignedArray = std::unique_ptr<T[], AlignedRelease>;

// `count` zeros.
template <typename T>
AlignedArray<T> makeAlignedArray(size_t count) {
    AlignedArray<T> array(static_cast<T *>(::operator new (count * sizeof(T), std::align_val_t{64})));
    for (size_t i = 0; i < count; ++i) array[i] = T{};
    return array;
}

}  // namespace vxcomn
