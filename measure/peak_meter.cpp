// SPDX-License-Identifier: MIT
#include "measure/peak_meter.h"

#include "measure/kernels.h"
#include "measure/realtime.h"

namespace vxcomn {

VXCOMN_RT int updatePeaks(float *const *channels, float *peaks, int channelCount, int frameCount) noexcept {
    measureKernels->peaks(channels, peaks, channelCount, frameCount);
    return channelCount;
}

VXCOMN_RT bool anyAbove(const float *samples, int count, float threshold) noexcept {
    return measureKernels->anyAbove(samples, count, threshold);
}

}  // namespace vxcomn
