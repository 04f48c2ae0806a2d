// SPDX-License-Identifier: MIT
//
// Whole blocks with their measurements on: the render side with meters and analysers, the capture side with filters and sweeps.
#include <algorithm>
#include <cstdio>
#include <random>
#include <string>
#include <vector>

#include "bench/host/bare.h"
#include "bench/measure/figures.h"
#include "bench/measure/plain_block.h"
#include "bench/support/block_fixture.h"
#include "bench/support/timing.h"
#include "host/kernels.h"
#include "measure/fir_kernels.h"
#include "measure/kernels.h"

namespace vxcomn::bench {

namespace {

constexpr int kRate = 48000;

// What an application's readout leaves: an empty ring, so that the next feed finds room.
void readAll(RealTimeAnalyser &analyser) {
    *analyser.readIndex = *analyser.writeIndex;
}

struct MeteredHost : Host {
    MeteredHost() {
        for (int i = 0; i < 2; ++i) {
            context->analyser[i].create(kRate);
            context->analyser[i].enabled = 1;
        }
        context->analyserFeedMode = 2;
    }
    ~MeteredHost() {
        for (int i = 0; i < 2; ++i) context->analyser[i].dispose();
    }
};

// Four channels, each with a filter of 1024 taps and a sweep that is being followed.
struct RecordingHost : Host {
    explicit RecordingHost(InstructionSet set) {
        selectFirKernels(set);
        std::mt19937 random(1);
        std::vector<float> taps(1024);
        for (float &tap : taps) tap = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-38F;
        armed.arm(kRate, 20, 20000, 10000, 0.0F, 0.0F, 48);
        for (int k = 0; k < VX_RECORD_CHANNELS; ++k) {
            context->recordFir[k].create();
            context->recordFir[k].load(taps.data(), static_cast<int>(taps.size()), kRate);
            context->recordFirEnable[k] = 1;
            context->sweepActive[k] = 1;
            context->sweepTracking[k] = 1;
            context->distortionPoints[k] = armed.TableSize;
        }
        restart();
    }
    ~RecordingHost() {
        for (FftFirFilter &filter : context->recordFir) filter.dispose();
    }
    void restart() {
        for (int k = 0; k < VX_RECORD_CHANNELS; ++k) {
            context->sweepTracker[k] = armed;
            context->distortionIndex[k] = 0;
        }
    }
    SweepGenerator armed;
};

}  // namespace

void benchProcess(InstructionSet best) {
    static Planes planes;
    MeteredHost host;
    LibraryContext &context = *host.context;
    ProcessBuffers buffers{planes.plane, 0, 0, 0};
    IOFormat format = formatOf(k71);
    float peaks[2][8] = {};
    const auto block = [&] {
        VXDSPAPI_Process(host.handle, &buffers, &format, &format);
        readAll(context.analyser[0]);
        readAll(context.analyser[1]);
    };
    const auto plainBlock = [&] {
        keep(plain::silent(planes.plane, 8, kFrames));
        plain::meter(planes.plane, peaks[0], 8, kFrames);
        plain::feed(context.analyser[0], planes.plane, 8, kFrames);
        plain::foldToStereo(planes.plane, kFrames);
        plain::feed(context.analyser[1], planes.plane, 8, kFrames);
        plain::meter(planes.plane, peaks[1], 8, kFrames);
        readAll(context.analyser[0]);
        readAll(context.analyser[1]);
    };
    std::puts("VXDSPAPI_Process, meters and two analysers on, 8 x 512, 7.1 folded to stereo, engine passes through");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        selectHostKernels(set);
        selectMeasureKernels(set);
        const Bare &bare = bareOf(set);
        const auto traffic = [&] {
            bare.load(planes.plane, 8, kFrames);
            bare.foldTraffic(planes.plane, kFrames);
        };
        for (const bool silent : {false, true}) {
            // The fold adds to the first two planes in every block. Their sums grow, but not to where a sample costs more.
            planes.fill(silent ? 0.0F : 0x1p-33F);
            const auto figures = timeInTurns({repeat("bare", traffic), repeat("block", block), repeat("plain", plainBlock)});
            const double ours = nanosecondsOf(figures, "block"), overBare = ours / nanosecondsOf(figures, "bare");
            const double overPlain = nanosecondsOf(figures, "plain") / ours;
            const std::string what = named(silent ? "block, silent" : "block", set);
            if (set == InstructionSet::avx512) {
                printRatio(what, ours, overBare, "bare loads and stores", 4.0, true);
                printRatio(what, ours, overPlain, "faster than the plain steps", 40, false);
            } else {
                printRatio(what, ours, overBare, "bare loads and stores");
                printRatio(what, ours, overPlain, "faster than the plain steps");
            }
        }
    }
}

void benchRecord(InstructionSet best) {
    static Planes source;
    static Planes planes;
    ProcessBuffers buffers{planes.plane, 0, 0, 0};
    IOFormat format{};
    format.channels = VX_RECORD_CHANNELS;
    format.frames = kFrames;
    format.sampleRate = kRate;
    std::puts("VXDSPAPI_Record, 4 x 512, 1024 taps and a running sweep on each channel");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        selectMeasureKernels(set);
        RecordingHost host(set);
        const auto figures = timeInTurns({repeat("record", [&] {
            for (int c = 0; c < VX_RECORD_CHANNELS; ++c) std::copy_n(source.plane[c], kFrames, planes.plane[c]);
            if (host.context->sweepTracker[0].Position >= host.armed.TotalSamples) host.restart();
            VXDSPAPI_Record(host.handle, &buffers, &format);
        })});
        const double ours = nanosecondsOf(figures, "record");
        std::printf("  %-44s %9.1f ns  %7.3f %% of real time at 48 kHz\n", named("record", set).c_str(), ours,
                    100.0 * ours / (1e9 * kFrames / kRate));
    }
}

}  // namespace vxcomn::bench
