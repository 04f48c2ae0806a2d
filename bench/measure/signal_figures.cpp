// SPDX-License-Identifier: MIT
//
// Sweep, tracking notch and pink noise, 512 samples of each.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "bench/measure/bare_chains.h"
#include "bench/measure/figures.h"
#include "bench/support/block_fixture.h"
#include "bench/support/timing.h"
#include "measure/kernels.h"
#include "measure/tracking_notch.h"
#include "tests/measure/plain_generators.h"
#include "tests/measure/plain_notch.h"

namespace vxcomn::bench {

namespace {

constexpr int kRate = 48000;
constexpr int kPlaces = 64;

// Ten seconds from 20 Hz to 20 kHz, at 64 places of its way: every contender goes round all of them.
std::vector<SweepGenerator> placesOfSweep() {
    SweepGenerator sweep;
    sweep.arm(kRate, 20, 20000, 10000, 0.0F, 0.0F, 48);
    std::vector<SweepGenerator> places;
    std::vector<float> way(static_cast<size_t>(sweep.SweepSamples / kPlaces));
    for (int i = 0; i < kPlaces; ++i) {
        places.push_back(sweep);
        sweep.generate(way.data(), 0, static_cast<int>(way.size()));
    }
    return places;
}

// Calls f with a copy of one place after the other.
template <class F>
Work atPlaces(std::string name, const std::vector<SweepGenerator> &places, F f) {
    return repeat(std::move(name), [&places, f, at = size_t{0}]() mutable {
        SweepGenerator sweep = places[at];
        at = (at + 1) % places.size();
        f(sweep);
    });
}

// The lines of one signal: against its bare chain, and against the plain form with the C library's functions if it needs any.
void printSignal(const char *what, const std::vector<Figure> &figures, const char *bareName, double bareAim, const char *plainName,
                 double plainAim, InstructionSet best) {
    const double bare = nanosecondsOf(figures, "bare"), plainTime = nanosecondsOf(figures, "plain");
    std::printf("%s, 512 samples: %s %.1f ns (%.2f ns a sample), plain form %.1f ns\n", what, bareName, bare, bare / kFrames,
                plainTime);
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        const double ours = nanosecondsOf(figures, instructionSetName(set));
        if (set == InstructionSet::avx512) {
            printRatio(named(what, set), ours, ours / bare, bareName, bareAim, true);
        } else {
            printRatio(named(what, set), ours, ours / bare, bareName);
        }
        if (set == InstructionSet::avx512 && plainAim > 0) {
            printRatio(named(what, set), ours, plainTime / ours, plainName, plainAim, false);
        } else {
            printRatio(named(what, set), ours, plainTime / ours, plainName);
        }
    }
}

}  // namespace

void benchSweep(InstructionSet best) {
    const auto places = placesOfSweep();
    alignas(64) static float block[kFrames];
    std::vector<Work> works{repeat("bare", [] { barePhaseAdditions(kFrames); }),
                            atPlaces("plain", places, [](SweepGenerator &sweep) {
                                const auto libmSine = [](double x) { return static_cast<float>(std::sin(x)); };
                                for (float &sample : block) sample = plain::sweepSample(sweep, libmSine);
                                keep(sweep.Phase);
                            })};
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        works.push_back(atPlaces(instructionSetName(set), places, [set](SweepGenerator &sweep) {
            selectMeasureKernels(set);
            sweep.generate(block, 0, kFrames);
            keep(sweep.Phase);
        }));
    }
    printSignal("sweep", timeInTurns(works), "bare phase additions", 4.5, "faster than libm's sine", 4, best);
}

void benchNotch(InstructionSet best) {
    const auto places = placesOfSweep();
    alignas(64) static float source[kFrames];
    alignas(64) static float block[kFrames];
    std::mt19937 random(1);
    for (float &sample : source) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-33F;
    static plain::NotchLog log;
    log.points = places[0].TableSize;
    // A block of noise to a filter at rest, and the log where the sweep stands.
    const auto prepare = [](const SweepGenerator &tracker) {
        std::copy(source, source + kFrames, block);
        log.in = log.out = 0.0;
        log.next = static_cast<int32_t>(tracker.TablePosition);
    };
    std::vector<Work> works{repeat("bare", [] { bareFilterRecurrence(kFrames); }),
                            atPlaces("plain", places, [prepare](SweepGenerator &tracker) {
                                BiquadState notch{};
                                prepare(tracker);
                                plain::trackSweep(
                                    tracker, notch, log, block, kFrames, kRate, [](double w) { return std::sin(w); },
                                    [](double w) { return std::cos(w); });
                                keep(notch.y1);
                            })};
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        works.push_back(atPlaces(instructionSetName(set), places, [set, prepare](SweepGenerator &tracker) {
            selectMeasureKernels(set);
            BiquadState notch{};
            prepare(tracker);
            trackSweep(tracker, notch, log.log(), block, kFrames, kRate);
            keep(notch.y1);
        }));
    }
    printSignal("tracking notch", timeInTurns(works), "bare filter recurrence", 3.3, "faster than with libm", 2, best);
}

void benchPink(InstructionSet best) {
    static float block[kFrames];
    static plain::Pink plainPink;
    static PinkNoiseGenerator pink;
    pink.create();
    std::vector<Work> works{repeat("bare", [] { barePinkRecurrence(kFrames); }), repeat("plain", [] {
                                for (float &sample : block) sample = plainPink.next();
                                keep(block);
                            })};
    for (int i = 0; i <= static_cast<int>(best); ++i) {
        const auto set = static_cast<InstructionSet>(i);
        works.push_back(repeat(instructionSetName(set), [set] {
            selectMeasureKernels(set);
            pink.generate(block, 0, kFrames);
        }));
    }
    printSignal("pink noise", timeInTurns(works), "bare recurrence", 1.9, "faster than the plain form", 0, best);
}

}  // namespace vxcomn::bench
