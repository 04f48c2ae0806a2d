// SPDX-License-Identifier: MIT
#include "measure/fir_kernels.h"

#include <atomic>

namespace vxcomn {
namespace {

constinit std::atomic<InstructionSet> selected{InstructionSet::sse2};

// Runs while the library is loaded. A filter that another initialiser loads before takes the set that always works.
[[maybe_unused]] const bool kChosen = (selectFirKernels(chosenInstructionSet()), true);

}  // namespace

void selectFirKernels(InstructionSet set) noexcept {
    selected.store(set, std::memory_order_relaxed);
}

const FirKernels *firKernels(int log2Size) noexcept {
    static constexpr const FirKernels *kSets[kInstructionSets] = {&kFirKernelsSse2, &kFirKernelsAvx2, &kFirKernelsAvx512};
    for (int set = static_cast<int>(selected.load(std::memory_order_relaxed)); set >= 0; --set) {
        if (log2Size >= kSets[set]->minLog2Size) return kSets[set];
    }
    return nullptr;
}

}  // namespace vxcomn
