// SPDX-License-Identifier: MIT
#include "measure/kernels.h"

namespace vxcomn {

constinit const MeasureKernels *measureKernels = &kMeasureKernelsSse2;

void selectMeasureKernels(InstructionSet set) noexcept {
    switch (set) {
        case InstructionSet::avx512:
            measureKernels = &kMeasureKernelsAvx512;
            break;
        case InstructionSet::avx2:
            measureKernels = &kMeasureKernelsAvx2;
            break;
        case InstructionSet::sse2:
            measureKernels = &kMeasureKernelsSse2;
            break;
    }
}

namespace {

struct ChooseAtLoad {
    ChooseAtLoad() noexcept { selectMeasureKernels(chosenInstructionSet()); }
} chooseAtLoad;

}  // namespace
}  // namespace vxcomn
