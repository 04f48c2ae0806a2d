// SPDX-License-Identifier: MIT
//
// Marks a function of the block path. Such functions stand together in a code section of their own, apart from all control code:
// whatever is reached from VXDSPAPI_Process is in it, allocates nothing, locks nothing, logs nothing and calls nothing outside. A
// test walks the section of the linked library to prove it.
#pragma once

// On a function's definition or declaration.
#define VXCOMN_RT [[gnu::section("RT_CODE")]]

// A helper that the block path uses: it has no code of its own, so it can be called from either side.
#define VXCOMN_RT_INLINE [[gnu::always_inline]] inline
