// SPDX-License-Identifier: MIT
#include "measure/white_noise.h"

#include "measure/realtime.h"

namespace vxcomn {
namespace {

// Any render thread reads it at the head of a block and writes it behind; relaxed, since nothing hangs on the order.
uint32_t whiteSeed = 1;

// The multiplicative generator of modulus 2^31 - 1 and multiplier 16807, without a 64-bit product: bits above the 31st weigh 1
// modulo 2^31 - 1, so they are added back at the bottom.
VXCOMN_RT_INLINE uint32_t next(uint32_t seed) {
    const uint32_t a = (seed & 0xFFFFu) * 16807u, b = (seed >> 16) * 16807u;
    const uint32_t t = a + ((b & 0x7FFFu) << 16) + (b >> 15);
    return t >= 0x80000000u ? t + 0x80000001u : t;
}

}  // namespace

VXCOMN_RT void fillWhite(float *samples, int count) noexcept {
    if (count < 1) return;
    uint32_t seed = __atomic_load_n(&whiteSeed, __ATOMIC_RELAXED);
    for (int i = 0; i < count; ++i) {
        seed = next(seed);
        const int32_t r = static_cast<int32_t>(seed << 1) >> 8;
        samples[i] = 1.0F - static_cast<float>(r) * 1.1920929e-7F;  // 2^-23: r has 24 bits with its sign
    }
    __atomic_store_n(&whiteSeed, seed, __ATOMIC_RELAXED);
}

void seedWhite(uint32_t seed) noexcept {
    __atomic_store_n(&whiteSeed, seed, __ATOMIC_RELAXED);
}

}  // namespace vxcomn
