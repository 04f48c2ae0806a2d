// SPDX-License-Identifier: MIT
#include "host/measuring_objects.h"

#include "host/host_context.h"
#include "host/isst_module.h"

namespace vxcomn {

namespace {

// A filter may have been loaded ahead of the first format.
void recreate(FftFirFilter &filter) {
    filter.dispose();
    filter.create();
}

}  // namespace

void disposeMeasuringObjects(LibraryContext &context) {
    hostLog(context, VX_TEXT("Disposing RTAs...\n"));
    for (RealTimeAnalyser &analyser : context.analyser) analyser.dispose();
    hostLog(context, VX_TEXT("Disposing fftfir...\n"));
    context.processFir.dispose();
    for (FftFirFilter &filter : context.recordFir) filter.dispose();
    if (isstInUse(context)) UnloadISSTModule(context);
    hostLog(context, VX_TEXT("Done.\n"));
}

void createMeasuringObjects(LibraryContext &context) {
    const int rate = context.sampleRate;
    hostLog(context, VX_TEXT("Creating FFTFIR...\n"));
    recreate(context.processFir);
    for (FftFirFilter &filter : context.recordFir) recreate(filter);
    for (RealTimeAnalyser &analyser : context.analyser) analyser = {};
    hostLog(context, VX_TEXT("Creating pinknoise generator...\n"));
    context.pinkNoise.create();
    hostLog(context, VX_TEXT("Creating sinewave generator...\n"));
    for (SineGenerator &sine : context.sine) {
        sine = {};
        sine.create(rate);
    }
    hostLog(context, VX_TEXT("Creating sinesweep generators...\n"));
    for (SweepGenerator &sweep : context.sweep) {
        sweep = {};
        sweep.arm(rate, 20, 20000, 10000, 500, 500, 3);
    }
    hostLog(context, VX_TEXT("Creating polarity tone generators...\n"));
    for (PolarityToneGenerator &tone : context.polarityTone) {
        tone = {};
        tone.create(rate);
    }
    hostLog(context, VX_TEXT("Allocating RTAs...\n"));
    context.analyser[0].create(rate);
    context.analyser[1].create(rate);
    context.analyser[2].create(context.recordSampleRate);
}

}  // namespace vxcomn
