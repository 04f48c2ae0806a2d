// SPDX-License-Identifier: MIT
#include "platform/float_mode.h"

#include <doctest/doctest.h>

using namespace vxcomn;

TEST_CASE("the block's floating-point mode flushes denormals and leaves exactly what stood before") {
    const unsigned own = _mm_getcsr();
    for (const unsigned before : {0x1F80u, 0x1780u, 0x9FC0u, 0x7F80u, 0x1FBFu}) {
        _mm_setcsr(before);
        unsigned inside = 0;
        float smallest = 0;
        {
            const BlockFloatMode mode;
            inside = _mm_getcsr();
            volatile float least = 1.17549435e-38f;
            smallest = least * 0.5f;
        }
        const unsigned after = _mm_getcsr();
        _mm_setcsr(own);
        CHECK(inside == (before | 0x8840u));
        CHECK(after == before);
        CHECK(smallest == 0.0f);
    }
}

TEST_CASE("without the block's mode a denormal stays") {
    volatile float least = 1.17549435e-38f;
    CHECK(least * 0.5f > 0.0f);
}
