// SPDX-License-Identifier: MIT
#include "measure/diagnostic_requests.h"

namespace vxcomn {

namespace {

template <class T>
T *pointerOf(uint64_t address) {
    return reinterpret_cast<T *>(static_cast<uintptr_t>(address));
}

// What became of one entry of a capture request.
enum class Entry { taken, last, cutOff };

Entry readCaptureEntry(ByteReader &in, CaptureRequest &request) {
    uint8_t slot = 0;
    uint8_t count = 0;
    if (!in.read(slot)) return Entry::cutOff;
    if (slot >= VX_RECORD_CHANNELS) return Entry::last;
    if (!in.read(count)) return Entry::cutOff;
    CaptureRing &ring = request.rings[slot];
    ring.bufferCount = count;  // Kept: also one that ends the list
    if (count >= VX_CAPTURE_BUFFERS) return Entry::last;
    for (int i = 0; i < count; ++i) {
        uint64_t address = 0;
        if (!in.read(address)) return Entry::cutOff;
        ring.buffers[i] = pointerOf<uint32_t>(address);
    }
    uint64_t ready = 0;
    uint8_t oneShot = 0;
    if (!in.read(ready, oneShot)) return Entry::cutOff;
    ring.bufferReady = pointerOf<VXAtomicByte>(ready);
    ring.oneShot = oneShot;
    ring.active = 1;
    return Entry::taken;
}

}  // namespace

bool readRequest(ByteReader &in, AnalyserSwitch &request) {
    return in.read(request.analyser, request.on) && request.analyser < kAnalysers;
}

bool readRequest(ByteReader &in, SpectrumRequest &request) {
    uint8_t ignored = 0;
    uint8_t integrate = 0;
    if (!in.read(request.analyser, ignored, integrate, request.fftSize, request.bandsPerOctave)) return false;
    request.integrate = integrate != 0;
    return request.analyser < kAnalysers;
}

bool readRequest(ByteReader &in, SineRequest &request) {
    return in.read(request.on, request.frequency);
}

bool readRequest(ByteReader &in, SweepRequest &request) {
    if (!in.read(request.on, request.channel, request.start, request.stop, request.sweepTime, request.preDelay, request.postDelay,
                 request.bandsPerOctave)) {
        return false;
    }
    return request.channel < VX_SLOT_COUNT && request.start != 0 && request.start < request.stop && request.sweepTime != 0;
}

bool readRequest(ByteReader &in, PolarityRequest &request) {
    uint8_t ignored = 0;
    return in.read(request.on, request.channel, ignored, request.halfLength) && request.channel < VX_SLOT_COUNT;
}

bool readRequest(ByteReader &in, CaptureRequest &request) {
    request = {};
    uint8_t entries = 0;
    if (!in.read(entries)) return false;
    for (int i = 0; i < entries; ++i) {
        const Entry entry = readCaptureEntry(in, request);
        if (entry == Entry::cutOff) return false;
        if (entry == Entry::last) return true;
    }
    return true;
}

bool readChannel(ByteReader &in, uint8_t &channel) {
    return in.read(channel) && channel < VX_SLOT_COUNT;
}

}  // namespace vxcomn
