// SPDX-License-Identifier: MIT
#include "measure/float_buffer.h"

#include <cstdint>
#include <cstdlib>

namespace vxcomn {
namespace {

constexpr size_t kLine = 64;
constexpr size_t kPage = 4096;

// The system hands out untouched memory page by page at the first access. A block function shall not be the one that waits for it.
void touchPages(void *memory, size_t size) noexcept {
    volatile char *const bytes = static_cast<char *>(memory);
    for (size_t at = 0; at < size; at += kPage) bytes[at] = 0;
    bytes[size - 1] = 0;
}

}  // namespace

// The standard aligned allocation doesn't exist on both platforms, so what the plain one returned stands in front of the floats.
float *allocateFloats(size_t count) noexcept {
    const size_t size = count * sizeof(float) + kLine + sizeof(void *);
    void *const raw = std::calloc(size, 1);
    if (raw == nullptr) return nullptr;
    touchPages(raw, size);
    const uintptr_t line = (reinterpret_cast<uintptr_t>(raw) + sizeof(void *) + kLine - 1) / kLine * kLine;
    reinterpret_cast<void **>(line)[-1] = raw;
    return reinterpret_cast<float *>(line);
}

void freeFloats(float *floats) noexcept {
    if (floats != nullptr) std::free(reinterpret_cast<void **>(floats)[-1]);
}

}  // namespace vxcomn
