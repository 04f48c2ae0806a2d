// SPDX-License-Identifier: MIT
//
// The block side of the real-time analyser: one mono sample a frame goes into a ring of one second. All analysis is done by the
// reader (measure/analyser_readout.cpp). The ring's words: the feeding thread stores samples and then the write index (release),
// the reader fetches it (acquire), copies, and stores the read index (release), behind which the feed may write again.
//
// The indexes are read and written once a block, not once a frame: the same samples land in the same slots, and a reader sees whole
// blocks.
#include <cstdlib>

#include "measure/float_buffer.h"
#include "measure/kernels.h"
#include "measure/realtime.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

void RealTimeAnalyser::create(int rate) {
    *this = RealTimeAnalyser{};
    sampleRate = rate;
    if (rate < 1) return;
    ring = allocateFloats(static_cast<size_t>(rate));
    writeIndex = static_cast<int32_t *>(std::malloc(sizeof(int32_t)));
    readIndex = static_cast<int32_t *>(std::malloc(sizeof(int32_t)));
    if (ring == nullptr || writeIndex == nullptr || readIndex == nullptr) {
        dispose();
        return;
    }
    capacity = rate;
    // Kept: 1, not 0, also in a ring of one sample, which is always full.
    *writeIndex = 1;
    *readIndex = 0;
}

void RealTimeAnalyser::dispose() {
    freeFloats(ring);
    std::free(writeIndex);
    std::free(readIndex);
    freeFloats(window);
    std::free(fftSize);
    freeFloats(work);
    ring = window = work = nullptr;
    writeIndex = readIndex = fftSize = nullptr;
    capacity = 0;
}

void RealTimeAnalyser::clear() {
    for (int i = 0; i < capacity; ++i) ring[i] = 0.0F;
}

namespace {

// Puts the frames from `from` on into consecutive slots.
VXCOMN_RT_INLINE void put(int channelChoice, float *const *channels, int channelCount, int from, int count, float *slots) {
    if (channelCount > 1 && channelChoice >= 2) {
        measureKernels->mean(channels, channelCount, from, count, slots);
    } else {
        measureKernels->copy(channels[channelCount == 1 ? 0 : channelChoice] + from, count, slots);
    }
}

}  // namespace

VXCOMN_RT void RealTimeAnalyser::feed(int channelChoice, float *const *channels, int channelCount, int frameCount) {
    if (capacity < 2 || channelCount < 1 || frameCount < 1 || channelChoice < 0) return;
    const int write = *writeIndex;  // only this thread writes it
    const int read = __atomic_load_n(readIndex, __ATOMIC_ACQUIRE);
    // One slot stays free, so that a full ring differs from an empty one; what doesn't fit is dropped.
    int space = read - write - 1;
    if (space < 0) space += capacity;
    const int count = frameCount < space ? frameCount : space;
    if (count < 1) return;
    const int toEnd = capacity - write;
    const int first = count < toEnd ? count : toEnd;
    put(channelChoice, channels, channelCount, 0, first, ring + write);
    if (count > first) put(channelChoice, channels, channelCount, first, count - first, ring);
    const int next = write + count;
    __atomic_exchange_n(writeIndex, next < capacity ? next : next - capacity, __ATOMIC_ACQ_REL);
}
