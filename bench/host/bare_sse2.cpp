// SPDX-License-Identifier: MIT
#include <immintrin.h>

#include "bench/host/bare_loops.h"

VXCOMN_DEFINE_BARE(kBareSse2, __m128, 4, _mm_loadu_ps, _mm_storeu_ps)
