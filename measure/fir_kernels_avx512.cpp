// SPDX-License-Identifier: MIT
#include "measure/fir_kernels.h"

#define VXCOMN_FIR_LANES 8
#define VXCOMN_FIR_GROUP 8
#define VXCOMN_FIR_LEVELS 3
#include "measure/fir_kernels_impl.h"

namespace vxcomn {
namespace {

VXCOMN_RT void process(const FirBlock &block) noexcept {
    processBlock(kFirKernelsAvx512, block);
}

}  // namespace

const FirKernels kFirKernelsAvx512 = {kLanes, kGroup, kLevels, 1, 6, process};

}  // namespace vxcomn
