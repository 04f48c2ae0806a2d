// SPDX-License-Identifier: MIT
#include "platform/thread_random.h"

namespace vxcomn {
namespace {

// Initial-exec: an offset from the thread pointer, which the loader has fixed. Four bytes of the static block that the C library
// keeps for libraries that come late.
[[gnu::tls_model("initial-exec")]] constinit thread_local uint32_t word = 1;

}  // namespace

[[gnu::section("RT_CODE")]] uint32_t *threadRandomWord() noexcept {
    return &word;
}

}  // namespace vxcomn
