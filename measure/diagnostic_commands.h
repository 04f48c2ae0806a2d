// SPDX-License-Identifier: MIT
//
// What the diagnostic commands do to the measuring tools of a context. How a command keeps the block functions out meanwhile is its
// caller's business (host/diagnostic_data.cpp); each function says what it needs. Control threads, one at a time.
#pragma once

#include "measure/byte_cursors.h"
#include "measure/diagnostic_requests.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// Writes a meter's channel count and peaks and empties it. Render must keep off the meter; capture may be in the middle of it.
void takePeaks(const int32_t &channels, float *peaks, ByteWriter &out);

// One block function's timing.
struct LoadFigures {
    double &seconds;
    uint64_t &frames;
    float &percent;  // last computed
};

// The share of real time that the block function took, in percent, worked out anew after a quarter of a second of audio. The block
// function must keep off the figures.
float takeLoad(LoadFigures figures, int32_t sampleRate);

// Switches a feed; off also clears the ring. The feeding block function must keep off the analyser.
void switchAnalyser(RealTimeAnalyser &analyser, uint8_t on);

// Whether an analyser can do a readout of that size: a power of two from 2 on, with a ring that holds half of it.
bool canRead(const RealTimeAnalyser &analyser, uint32_t fftSize);

// One readout into the analyser's bands, for a size that it can do. False if there is no memory for it. The feed may run.
bool readSpectrum(RealTimeAnalyser &analyser, const SpectrumRequest &request);

// Sets the frequency of all four sines at the context's rate, unless it is 0. The sines may run.
void setSineFrequency(LibraryContext &context, uint16_t frequency);

// Arms one channel's sweep with its lead-in tone and its search, and forgets its results. Both block functions must be out.
void armSweep(LibraryContext &context, const SweepRequest &request);

// Arms one channel's polarity tone and its search. Both block functions must be out.
void armPolarity(LibraryContext &context, const PolarityRequest &request);

// Writes a sweep's number of points, the next point to be filled and the address of the points; all may be moving on.
void writeSweepResult(const LibraryContext &context, int channel, ByteWriter &out);

}  // namespace vxcomn
