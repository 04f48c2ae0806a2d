// SPDX-License-Identifier: MIT
#include "host/kernels.h"

namespace vxcomn {

namespace detail {
constinit const HostKernels *chosenHostKernels = &kHostKernelsSse2;
}

namespace {

// Chooses when the library is loaded.
const struct ChooseAtLoad {
    ChooseAtLoad() noexcept { selectHostKernels(chosenInstructionSet()); }
} chooseAtLoad;

}  // namespace

const HostKernels &hostKernelsOf(InstructionSet set) noexcept {
    switch (set) {
        case InstructionSet::avx512:
            return kHostKernelsAvx512;
        case InstructionSet::avx2:
            return kHostKernelsAvx2;
        default:
            return kHostKernelsSse2;
    }
}

void selectHostKernels(InstructionSet set) noexcept {
    detail::chosenHostKernels = &hostKernelsOf(set);
}

}  // namespace vxcomn
