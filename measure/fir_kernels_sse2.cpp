// SPDX-License-Identifier: MIT
#include "measure/fir_kernels.h"

#define VXCOMN_FIR_LANES 2
#define VXCOMN_FIR_GROUP 4
#define VXCOMN_FIR_LEVELS 2
#include "measure/fir_kernels_impl.h"

namespace vxcomn {
namespace {

VXCOMN_RT void process(const FirBlock &block) noexcept {
    processBlock(kFirKernelsSse2, block);
}

}  // namespace

const FirKernels kFirKernelsSse2 = {kLanes, kGroup, kLevels, 2, 4, process};

}  // namespace vxcomn
