// SPDX-License-Identifier: MIT
#include <immintrin.h>

#include "bench/host/bare_loops.h"

VXCOMN_DEFINE_BARE(kBareAvx512, __m512, 16, _mm512_loadu_ps, _mm512_storeu_ps)
