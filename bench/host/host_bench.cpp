// SPDX-License-Identifier: MIT
//
// The figures of the host: fold-down, peak meter, fixed-point adapter, a whole block, and what it costs to enter and leave one.
// Each against its bare memory traffic and, where there is one, a packaged peer.
#include <cblas.h>
#include <emmintrin.h>

#include <algorithm>
#include <cstdio>

extern "C" {
#include <libavutil/channel_layout.h>
#include <libavutil/opt.h>
#include <libswresample/swresample.h>
}

#include "VXDSPAPI.h"
#include "bench/host/bare.h"
#include "bench/support/block_fixture.h"
#include "bench/support/timing.h"
#include "host/channel_mixer.h"
#include "host/kernels.h"
#include "measure/kernels.h"
#include "measure/peak_meter.h"
#include "platform/clock.h"
#include "platform/float_mode.h"

using namespace vxcomn;
using namespace vxcomn::bench;

namespace {

// The resampler's planar mixing stage at equal rates, with the same matrix.
class PackagedMixer {
  public:
    PackagedMixer() {
        AVChannelLayout in = AV_CHANNEL_LAYOUT_7POINT1;
        AVChannelLayout out = AV_CHANNEL_LAYOUT_STEREO;
        swr_alloc_set_opts2(&swr_, &out, AV_SAMPLE_FMT_FLTP, 48000, &in, AV_SAMPLE_FMT_FLTP, 48000, 0, nullptr);
        // FL FR FC LFE BL BR SL SR
        const double matrix[16] = {1, 0, 0.5, 0.5, 0.7083, 0, 0.7083, 0, 0, 1, 0.5, 0.5, 0, 0.7083, 0, 0.7083};
        swr_set_matrix(swr_, matrix, 8);
        if (swr_init(swr_) < 0) std::fputs("the packaged mixer doesn't start\n", stderr);
    }
    ~PackagedMixer() { swr_free(&swr_); }
    PackagedMixer(const PackagedMixer &) = delete;
    PackagedMixer &operator=(const PackagedMixer &) = delete;
    void run(float **in, float **out) {
        const uint8_t *planes[8];
        for (int c = 0; c < 8; ++c) planes[c] = reinterpret_cast<const uint8_t *>(in[c]);
        swr_convert(swr_, reinterpret_cast<uint8_t **>(out), kFrames, planes, kFrames);
    }

  private:
    SwrContext *swr_ = nullptr;
};

void benchFold(InstructionSet best) {
    static Planes planes;
    static Planes out;
    static PackagedMixer peer;
    IOFormat target = formatOf(kStereo);
    ProcessBuffers buffers{planes.plane, 0, 0, 0};
    std::puts("fold-down of 7.1 to stereo, 512 frames");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        selectHostKernels(set);
        const Bare &bare = bareOf(set);
        const auto figures = timeInTurns({repeat("bare", [&] { bare.foldTraffic(planes.plane, kFrames); }),
                                          repeat("fold",
                                                 [&] {
                                                     // Keeps the sums from growing without end.
                                                     mixChannels(&buffers, nullptr, &target);
                                                     planes.plane[0][0] = 0.0F;
                                                 }),
                                          repeat("peer", [&] { peer.run(planes.plane, out.plane); })});
        const double fold = nanosecondsOf(figures, "fold");
        const double aims[] = {3.7, 2.0, 1.5};
        printRatio(named("fold", set), fold, fold / nanosecondsOf(figures, "bare"), "bare loads and stores", aims[i], true);
        printRatio(named("fold", set), fold, nanosecondsOf(figures, "peer") / fold, "faster than libswresample", i == 0 ? 5 : 10,
                   false);
    }
}

void benchPeaks(InstructionSet best) {
    static Planes planes;
    static float peaks[8];
    openblas_set_num_threads(1);
    std::puts("peak meter, 8 x 512");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        selectMeasureKernels(set);
        const Bare &bare = bareOf(set);
        const auto figures =
            timeInTurns({repeat("bare", [&] { bare.load(planes.plane, 8, kFrames); }),
                         repeat("peaks", [&] { keep(updatePeaks(planes.plane, peaks, 8, kFrames)); }), repeat("peer", [&] {
                             for (float *plane : planes.plane) keep(cblas_isamax(kFrames, plane, 1));
                         })});
        const double ours = nanosecondsOf(figures, "peaks");
        const double aims[] = {6.0, 3.0, 2.0};
        printRatio(named("peaks", set), ours, ours / nanosecondsOf(figures, "bare"), "bare loads", aims[i], true);
        printRatio(named("peaks", set), ours, nanosecondsOf(figures, "peer") / ours, "faster than OpenBLAS isamax", i == 2 ? 5 : 1,
                   false);
    }
}

void benchFixedPoint(InstructionSet best) {
    static Planes planes;
    alignas(64) static int32_t words[8][kFrames + 16];
    std::puts("fixed-point adapter there and back, 8 x 512");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        const HostKernels &kernels = hostKernelsOf(set);
        const Bare &bare = bareOf(set);
        const auto figures = timeInTurns({repeat("bare",
                                                 [&] {
                                                     for (int c = 0; c < 8; ++c)
                                                         bare.thereAndBack(planes.plane[c], words[c], kFrames);
                                                 }),
                                          repeat("adapter", [&] {
                                              for (int c = 0; c < 8; ++c)
                                                  kernels.toProcessWords(planes.plane[c], words[c], kFrames);
                                              for (int c = 0; c < 8; ++c)
                                                  kernels.fromProcessWords(words[c], planes.plane[c], kFrames);
                                          })});
        const double ours = nanosecondsOf(figures, "adapter");
        printRatio(named("adapter", set), ours, ours / nanosecondsOf(figures, "bare"), "bare loads and stores", 2.0, true);
    }
}

void benchBlock(InstructionSet best) {
    static Planes planes;
    Host host;
    ProcessBuffers buffers{planes.plane, 0, 0, 0};
    IOFormat format = formatOf(k71);
    const auto block = [&] {
        VXDSPAPI_Process(host.handle, &buffers, &format, &format);
        planes.plane[0][0] = 0.0F;
    };
    std::puts("VXDSPAPI_Process, 8 x 512, 7.1 folded to stereo, engine passes through");
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        selectHostKernels(set);
        selectMeasureKernels(set);
        const Bare &bare = bareOf(set);
        for (const bool silent : {false, true}) {
            planes.fill(silent ? 0.0F : 0x1p-33F);
            const auto figures = timeInTurns({repeat("bare",
                                                     [&] {
                                                         bare.load(planes.plane, 8, kFrames);
                                                         bare.foldTraffic(planes.plane, kFrames);
                                                     }),
                                              repeat("block", block)});
            const double ours = nanosecondsOf(figures, "block");
            const double aims[] = {10.0, 10.0, 4.0};
            printRatio(named(silent ? "block, silent" : "block", set), ours, ours / nanosecondsOf(figures, "bare"),
                       "bare traffic, two passes", aims[i], true);
        }
    }
}

// What entering and leaving consists of, and nothing else: mode, busy, clock, stop; clock, counters, busy, mode.
void bareEnterAndLeave(LibraryContext &context) {
    const unsigned mode = _mm_getcsr();
    _mm_setcsr(mode | kBlockFloatMode);
    context.processBusy.store(1, std::memory_order_seq_cst);
    const int64_t start = performanceCounter();
    keep(context.processStop.load(std::memory_order_seq_cst));
    context.processSeconds += static_cast<double>(performanceCounter() - start) * 1e-9;
    context.processBusy.store(0, std::memory_order_release);
    _mm_setcsr(mode);
}

void benchEnterAndLeave() {
    static Planes planes;
    Host host;
    host.context->processStop = 1;
    ProcessBuffers buffers{planes.plane, 0, 0, 0};
    IOFormat format = formatOf(k71);
    std::puts("entering and leaving one block (mode, clock, flags)");
    const auto figures = timeInTurns({repeat("bare", [&] { bareEnterAndLeave(*host.context); }),
                                      repeat("ours", [&] { VXDSPAPI_Process(host.handle, &buffers, &format, &format); })});
    const double ours = nanosecondsOf(figures, "ours");
    printRatio("enter and leave", ours, ours / nanosecondsOf(figures, "bare"), "the same instructions", 2.2, true);
}

}  // namespace

int main() {
    printHeading("Host figures");
    const InstructionSet best = bestInstructionSet();
    benchFold(best);
    benchPeaks(best);
    benchFixedPoint(best);
    benchBlock(best);
    benchEnterAndLeave();
    return 0;
}
