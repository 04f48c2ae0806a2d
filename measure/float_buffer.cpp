// SPDX-License-Identifier: MIT
#include "measure/float_buffer.h"

#include <cstdint>
#include <cstdlib>

namespace vxcomn {
namespace {

constexpr size_t kLine = 64;

}  // namespace

// The standard aligned allocation doesn't exist on both platforms, so what the plain one returned stands in front of the floats.
float *allocateFloats(size_t count) noexcept {
    void *const raw = std::calloc(count * sizeof(float) + kLine + sizeof(void *), 1);
    if (raw == nullptr) return nullptr;
    const uintptr_t line = (reinterpret_cast<uintptr_t>(raw) + sizeof(void *) + kLine - 1) / kLine * kLine;
    reinterpret_cast<void **>(line)[-1] = raw;
    return reinterpret_cast<float *>(line);
}

void freeFloats(float *floats) noexcept {
    if (floats != nullptr) std::free(reinterpret_cast<void **>(floats)[-1]);
}

}  // namespace vxcomn
