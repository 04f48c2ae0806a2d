// SPDX-License-Identifier: MIT
#include "measure/capture_ring.h"

#include "measure/realtime.h"

namespace vxcomn {

VXCOMN_RT void feedCaptureRing(CaptureRing &ring, const uint32_t *samples, int frames) noexcept {
    if (ring.currentBuffer >= ring.bufferCount || ring.currentBuffer < 0 || ring.bufferReady == nullptr) return;
    for (int i = 0; i < frames; ++i) {
        // A one-shot ring that fills up in mid-call ends here: behind its last buffer there is none to write to.
        if (ring.currentBuffer >= VX_CAPTURE_BUFFERS || ring.currentBuffer >= ring.bufferCount) return;
        uint32_t *const buffer = ring.buffers[ring.currentBuffer];
        if (buffer == nullptr) return;
        buffer[ring.writePosition] = samples[i];
        ++ring.writePosition;
        // Kept: with a buffer length of 0, which is what the set-up leaves, the ring moves on one buffer with each sample.
        if (ring.writePosition >= ring.bufferLength) {
            ring.writePosition = 0;
            __atomic_store_n(reinterpret_cast<uint8_t *>(&ring.bufferReady[ring.currentBuffer]), uint8_t{1}, __ATOMIC_RELEASE);
            ++ring.currentBuffer;
            if (ring.currentBuffer == ring.bufferCount && ring.oneShot == 0) ring.currentBuffer = 0;
        }
    }
}

}  // namespace vxcomn
