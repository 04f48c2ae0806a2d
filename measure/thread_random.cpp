// SPDX-License-Identifier: MIT
#include "measure/thread_random.h"

#include "measure/realtime.h"

namespace vxcomn {
namespace {

constinit uint32_t sharedWord = 1;

VXCOMN_RT uint32_t *shared() noexcept {
    return &sharedWord;
}

constinit ThreadRandomWord installed = shared;

}  // namespace

void installThreadRandom(ThreadRandomWord word) noexcept {
    installed = word != nullptr ? word : shared;
}

VXCOMN_RT uint32_t *threadRandom() noexcept {
    return installed();
}

}  // namespace vxcomn
