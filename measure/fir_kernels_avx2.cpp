// SPDX-License-Identifier: MIT
#include "measure/fir_kernels.h"

#define VXCOMN_FIR_LANES 4
#define VXCOMN_FIR_GROUP 4
#define VXCOMN_FIR_LEVELS 2
#include "measure/fir_kernels_impl.h"

namespace vxcomn {
namespace {

VXCOMN_RT void process(const FirBlock &block) noexcept {
    processBlock(kFirKernelsAvx2, block);
}

}  // namespace

const FirKernels kFirKernelsAvx2 = {kLanes, kGroup, kLevels, 1, 4, process};

}  // namespace vxcomn
