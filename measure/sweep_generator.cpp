// SPDX-License-Identifier: MIT
//
// The swept sine: a silent lead-in, then a sine whose frequency moves at a constant rate through a table of band edges, linearly
// between neighbours. `arm` comes from control calls that hold the block functions up; `generate` runs on the render thread.
//
// Kept: the sweep has no end of its own. Past its stop frequency it climbs on to the table's last entry but one and stays there;
// whoever armed it ends it.
#include "measure/band_tables.h"
#include "measure/kernels.h"
#include "measure/realtime.h"
#include "measure/saturate.h"
#include "measure/sweep_step.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

// Index of the first entry above a frequency, or -1.
int firstAbove(const float *table, int size, int hz) {
    for (int i = 0; i < size; ++i) {
        if (static_cast<double>(table[i]) > hz) return i;
    }
    return -1;
}

}  // namespace

void SweepGenerator::arm(int rate, int start, int stop, int sweepTimeMs, float preDelayMs, float postDelayMs, int bandsPerOctave) {
    SampleRate = rate;
    StartFrequency = start;
    StopFrequency = stop;
    SweepTime = sweepTimeMs;
    BandsPerOctave = bandsPerOctave;
    Position = 0;
    CurrentFrequency = start;
    PreDelay = preDelayMs < 0.0F ? 0.0F : preDelayMs;
    PostDelay = postDelayMs < 0.0F ? 0.0F : postDelayMs;
    RadiansPerHz = 6.283185307179586 / SampleRate;
    SweepSamples = truncateToSamples(SweepTime / 1000.0 * SampleRate);

    BandTables::select(BandsPerOctave, &Table, nullptr, &TableSize);
    const int first = firstAbove(Table, TableSize, StartFrequency);
    FirstIndex = first > 0 ? first - 1 : 0;
    // Kept: a stop frequency above the last entry gives a span of 0, so that the sweep walks down from its start.
    const int behind = firstAbove(Table, TableSize, StopFrequency);
    IndexSpan = behind > FirstIndex ? behind - FirstIndex : 0;

    Phase = 0.0;
    FadePosition = 0;
    TablePosition = FirstIndex;
    TableStep = static_cast<double>(IndexSpan - 1) / static_cast<double>(SweepSamples);
    PreDelaySamples = truncateToSamples(static_cast<double>(PreDelay) / 1000.0 * SampleRate);
    PostDelaySamples = truncateToSamples(static_cast<double>(PostDelay) / 1000.0 * SampleRate);
    TotalSamples = PreDelaySamples + PostDelaySamples + SweepSamples;
    FadeStep = 1.0 / static_cast<double>(PreDelaySamples);  // Kept: infinite without a lead-in; nobody reads it
}

VXCOMN_RT void SweepGenerator::generate(float *buffer, int offset, int count) {
    int i = 0;
    for (; i < count && Position < PreDelaySamples; ++i, ++Position) buffer[offset + i] = 0.0F;
    if (i >= count) return;
    SweepRun run{Table, TablePosition, TableStep, TableSize - 2.0, Phase, RadiansPerHz, CurrentFrequency};
    measureKernels->sweep(run, buffer + offset + i, count - i);
    TablePosition = run.position;
    Phase = run.phase;
    CurrentFrequency = run.hz;
    Position += count - i;
}
