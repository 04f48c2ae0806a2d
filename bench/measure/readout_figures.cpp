// SPDX-License-Identifier: MIT
//
// One readout of the analyser: window, transform, power and 1/48-octave bands.
#include <cmath>
#include <cstdio>
#include <random>
#include <vector>

#include "bench/measure/figures.h"
#include "bench/measure/readout_peers.h"
#include "bench/support/block_fixture.h"
#include "bench/support/timing.h"
#include "measure/band_integration.h"
#include "measure/band_tables.h"
#include "measure/kernels.h"
#include "tests/measure/plain_readout.h"

namespace vxcomn::bench {

namespace {

constexpr int kRate = 48000;
constexpr int kPerOctave = 48;

struct Table {
    Table() { BandTables::select(kPerOctave, &edges, &centres, &size); }
    const float *edges = nullptr, *centres = nullptr;
    int size = 0;
};

std::vector<float> plainBands(const std::vector<float> &power, int half, const Table &table) {
    return plain::bands(power, half, table.edges, table.centres, table.size, kRate, true);
}

// The plain form with its window at hand, as a program would keep it.
std::vector<float> plainReadout(const std::vector<float> &samples, const std::vector<float> &window, std::vector<float> &work,
                                const Table &table) {
    const auto half = window.size();
    for (size_t k = 0; k < half; ++k) {
        float value = samples[k];
        if (value > 1e6F) value = 1e6F;
        if (value < -1e6F) value = -1e6F;
        work[2 * k] = value * window[k];
        work[2 * k + 1] = 0.0F;
    }
    for (size_t i = 2 * half; i < 4 * half; ++i) work[i] = 0.0F;
    plain::transform(work, static_cast<int>(2 * half));
    plain::power(work, static_cast<int>(2 * half));
    return plainBands(work, static_cast<int>(half), table);
}

struct Analyser : RealTimeAnalyser {
    Analyser() { create(kRate); }
    ~Analyser() { dispose(); }
    Analyser(const Analyser &) = delete;
    Analyser &operator=(const Analyser &) = delete;
};

void benchSize(int size, InstructionSet best) {
    const int half = size / 2;
    std::mt19937 random(1);
    std::vector<float> samples(static_cast<size_t>(half)), work(2 * static_cast<size_t>(size));
    for (float &sample : samples) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
    Analyser analyser;
    float *const channel = samples.data();
    analyser.feed(0, &channel, 1, half);
    const std::vector<float> window = plain::window(half);
    const Table table;
    std::vector<float> bands(VX_MAX_BANDS);
    ReadoutPeer complexPeer(size, false), realPeer(size, true);

    std::vector<Work> works{
        repeat("c2c", [&] { keep(plainBands(complexPeer.run(samples.data(), window.data()), half, table).data()); }),
        repeat("r2c", [&] { keep(plainBands(realPeer.run(samples.data(), window.data()), half, table).data()); }),
        repeat("r2c, our bands",
               [&] {
                   const std::vector<float> &power = realPeer.run(samples.data(), window.data());
                   integrateBands(power.data(), half, table.edges, table.centres, table.size, bands.data(), kRate, true);
               }),
        repeat("plain", [&] { keep(plainReadout(samples, window, work, table).data()); })};
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        works.push_back(repeat(instructionSetName(set), [&, set] {
            selectMeasureKernels(set);
            analyser.readBands(1, size, kPerOctave);
        }));
    }
    const auto figures = timeInTurns(works, 51);

    std::printf("readout of %d points, bands of 1/48 octave: FFTW f32 c2c %.1f us, r2c %.1f us, plain form %.1f us\n", size,
                nanosecondsOf(figures, "c2c") / 1000, nanosecondsOf(figures, "r2c") / 1000, nanosecondsOf(figures, "plain") / 1000);
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        const double ours = nanosecondsOf(figures, instructionSetName(set));
        const double overComplex = nanosecondsOf(figures, "c2c") / ours, overReal = ours / nanosecondsOf(figures, "r2c");
        const double overMixed = ours / nanosecondsOf(figures, "r2c, our bands"),
                     overPlain = nanosecondsOf(figures, "plain") / ours;
        const std::string what = named("readout", set);
        if (set == InstructionSet::avx512) {
            printRatio(what, ours, overComplex, "faster than FFTW c2c", 1.2, false);
            printRatio(what, ours, overReal, "FFTW r2c, plain bands", 1.1, true);
            printRatio(what, ours, overPlain, "faster than the plain form", 8, false);
        } else {
            printRatio(what, ours, overComplex, "faster than FFTW c2c");
            printRatio(what, ours, overReal, "FFTW r2c, plain bands");
            printRatio(what, ours, overPlain, "faster than the plain form");
        }
        printRatio(what, ours, overMixed, "FFTW r2c with our bands");
    }
}

}  // namespace

void benchReadout(InstructionSet best) {
    for (const int size : {4096, 16384, 65536}) benchSize(size, best);
}

}  // namespace vxcomn::bench
