// SPDX-License-Identifier: MIT
//
// The inputs of the diagnostic commands, taken off their byte streams (include/VXDSPAPI.h has the layouts). A reader that answers
// false refuses the command, which then changes nothing: the stream ends too early, a number points beyond the context's tables, or
// the values are none that the command takes. Control threads.
#pragma once

#include "measure/byte_cursors.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

inline constexpr int kAnalysers = 3;

struct AnalyserSwitch {
    uint8_t analyser;  // 0 to 2
    uint8_t on;
};

struct SpectrumRequest {
    uint8_t analyser;  // 0 to 2
    bool integrate;
    uint32_t fftSize;
    int32_t bandsPerOctave;
};

struct SineRequest {
    uint8_t on;
    uint16_t frequency;  // Hz; 0 keeps what is set
};

struct SweepRequest {
    uint8_t on;
    uint8_t channel;  // 0 to 7
    uint16_t start;   // Hz, above 0 and below stop
    uint16_t stop;
    uint16_t sweepTime;  // ms, above 0; likewise the next two
    uint16_t preDelay;
    uint16_t postDelay;
    uint16_t bandsPerOctave;
};

struct PolarityRequest {
    uint8_t on;
    uint8_t channel;      // 0 to 7
    uint16_t halfLength;  // ms
};

// The four rings as they are to stand.
struct CaptureRequest {
    CaptureRing rings[VX_RECORD_CHANNELS];
};

[[nodiscard]] bool readRequest(ByteReader &in, AnalyserSwitch &request);
[[nodiscard]] bool readRequest(ByteReader &in, SpectrumRequest &request);
[[nodiscard]] bool readRequest(ByteReader &in, SineRequest &request);
// Kept: also a request to stop has to carry frequencies and a time that a sweep could run with.
[[nodiscard]] bool readRequest(ByteReader &in, SweepRequest &request);
[[nodiscard]] bool readRequest(ByteReader &in, PolarityRequest &request);
[[nodiscard]] bool readRequest(ByteReader &in, CaptureRequest &request);

// The channel of a request for results, 0 to 7.
[[nodiscard]] bool readChannel(ByteReader &in, uint8_t &channel);

}  // namespace vxcomn
