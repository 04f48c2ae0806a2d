// SPDX-License-Identifier: MIT
//
// Peak-hold registers, one per channel: the block path raises them, a reader empties them. No decay, no hold time, no decibels; a
// meter's time constant is how often somebody looks. Beside them stands the block path's silence test, which looks at samples in
// the same way. Real-time safe, any thread; two threads may not share one row of peaks.
#pragma once

namespace vxcomn {

// Raises peaks[c] to the largest magnitude among the frameCount samples of channels[c], for each channel. NaN raises nothing.
// Returns channelCount; below 1 nothing is done.
int updatePeaks(float *const *channels, float *peaks, int channelCount, int frameCount) noexcept;

// Whether any of the samples has a magnitude above the threshold (at least 0).
bool anyAbove(const float *samples, int count, float threshold) noexcept;

}  // namespace vxcomn
