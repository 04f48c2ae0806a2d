// SPDX-License-Identifier: MIT
#include <immintrin.h>

#include "bench/host/bare_loops.h"

VXCOMN_DEFINE_BARE(kBareAvx2, __m256, 8, _mm256_loadu_ps, _mm256_storeu_ps)
