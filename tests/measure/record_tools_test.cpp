// SPDX-License-Identifier: MIT
//
// What the capture side measures with: onset search, tracking notch and capture rings.
#include <doctest/doctest.h>

#include <xmmintrin.h>

#include <cmath>
#include <cstdint>
#include <random>
#include <vector>

#include "measure/capture_ring.h"
#include "measure/exact_sine.h"
#include "measure/onset_detector.h"
#include "measure/tracking_notch.h"
#include "measure_sets.h"
#include "plain_generators.h"
#include "plain_notch.h"
#include "plain_sine.h"

using namespace vxcomn;

namespace {

bool same(float a, float b) {
    return __builtin_bit_cast(uint32_t, a) == __builtin_bit_cast(uint32_t, b);
}

bool alike(double a, double b) {
    return __builtin_bit_cast(uint64_t, a) == __builtin_bit_cast(uint64_t, b) || (std::isnan(a) && std::isnan(b));
}

using Log = plain::NotchLog;

// The frames as they read, with sine and cosine in extended precision.
void plainTrack(SweepGenerator &tracker, BiquadState &notch, Log &log, float *samples, int count, int rate) {
    plain::trackSweep(
        tracker, notch, log, samples, count, rate, [](double w) { return static_cast<double>(plain::sineOf(w)); },
        [](double w) { return exactCosine(w); });
}

// A pulse train that the detector has no reason to miss.
std::vector<float> impulse(int at, float first, float second) {
    std::vector<float> signal(4000);
    signal[static_cast<size_t>(at)] = first;
    signal[static_cast<size_t>(at) + 5] = second;
    return signal;
}

}  // namespace

TEST_CASE("the history is 10 ms long, 480 samples at 48 kHz, and at most 1920") {
    OnsetDetector detector;
    for (const auto &[rate, length] :
         {std::pair{48000.0F, 480}, {44100.0F, 441}, {192000.0F, 1920}, {384000.0F, 1920}, {8000.0F, 80}}) {
        resetOnsetDetector(detector, rate);
        CHECK(detector.windowLength == length);
    }
    resetOnsetDetector(detector, 48000.0F);
    CHECK(std::fabs(detector.decay - std::exp(std::log(0.01) / 4800.0)) < 1e-7);
    CHECK(detector.minimum == -1e-6F);
    CHECK(detector.delayedMaximum == 1e-6F);
    CHECK(detector.sampleIndex == 0);
}

TEST_CASE("an impulse of +1.0 with an undershoot of -0.5 is found with a positive peak, and its inverse with a negative one") {
    for (const float sign : {1.0F, -1.0F}) {
        OnsetDetector detector;
        resetOnsetDetector(detector, 48000.0F);
        const std::vector<float> signal = impulse(1500, sign, -0.5F * sign);
        const Onset onset = findOnset(detector, signal.data(), 4000);
        REQUIRE(onset.found);
        CHECK(onset.index == 1500);
        CHECK(onset.peak == sign);
        CHECK(detector.sampleIndex == 1505);
    }
}

TEST_CASE("the search finds the same onset in blocks of any length") {
    const std::vector<float> signal = impulse(2100, -0.25F, 0.2F);
    for (const int length : {1, 7, 64, 441, 512}) {
        OnsetDetector detector;
        resetOnsetDetector(detector, 48000.0F);
        Onset onset{};
        for (int from = 0; from < 4000 && !onset.found; from += length) {
            onset = findOnset(detector, signal.data() + from, std::min(length, 4000 - from));
        }
        REQUIRE(onset.found);
        CHECK(onset.index == 2100);
        CHECK(onset.peak == -0.25F);
    }
}

TEST_CASE("nothing is found in the first 20 ms, in silence, or without an opposite peak") {
    OnsetDetector detector;
    resetOnsetDetector(detector, 48000.0F);
    const std::vector<float> early = impulse(900, 1.0F, -1.0F);
    CHECK(!findOnset(detector, early.data(), 961).found);
    resetOnsetDetector(detector, 48000.0F);
    const std::vector<float> silence(4000);
    CHECK(!findOnset(detector, silence.data(), 4000).found);
    CHECK(detector.sampleIndex == 4000);
    resetOnsetDetector(detector, 48000.0F);
    std::vector<float> lonely(4000);
    lonely[2000] = 1.0F;
    CHECK(!findOnset(detector, lonely.data(), 4000).found);
}

TEST_CASE("a detector for a rate below 100 Hz has no history and finds nothing") {
    for (const float rate : {50.0F, 0.0F, NAN}) {
        OnsetDetector detector;
        resetOnsetDetector(detector, rate);
        CHECK(detector.windowLength == 0);
        const std::vector<float> signal = impulse(1500, 1.0F, -0.5F);
        CHECK(!findOnset(detector, signal.data(), 4000).found);
    }
}

TEST_CASE("a detector with absurd numbers in it stays inside its history") {
    OnsetDetector detector;
    resetOnsetDetector(detector, -1e30F);
    const std::vector<float> signal = impulse(1500, 1.0F, -0.5F);
    findOnset(detector, signal.data(), 4000);
    CHECK(detector.historyPosition == 0);
    resetOnsetDetector(detector, 48000.0F);
    detector.windowLength = 100000;
    detector.sampleIndex = INT32_MAX - 10;
    findOnset(detector, signal.data(), 1000);
    CHECK(detector.historyPosition == 1000);
}

TEST_CASE("the biquad sums forward in f32 and feeds back in f64, for any block lengths") {
    std::mt19937 random(51);
    BiquadState state{0.3F, -0.2F, 0.7F, -1.1F, 0.6F, 0.0F, 0.0F, 0.0, 0.0}, judge = state;
    for (int count = 0; count < 300; ++count) {
        std::vector<float> samples(static_cast<size_t>(count));
        for (float &sample : samples) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
        std::vector<float> expected = samples;
        for (float &sample : expected) {
            float forward = judge.b0 * sample;
            forward += judge.b1 * judge.x1;
            forward += judge.b2 * judge.x2;
            double y = forward;
            y -= static_cast<double>(judge.a1) * judge.y1;
            y -= static_cast<double>(judge.a2) * judge.y2;
            judge.x2 = judge.x1;
            judge.x1 = sample;
            judge.y2 = judge.y1;
            judge.y1 = y;
            sample = static_cast<float>(y);
        }
        runBiquad(state, samples.data(), count);
        for (size_t i = 0; i < samples.size(); ++i) REQUIRE(same(samples[i], expected[i]));
        REQUIRE(state.y1 == judge.y1);
        REQUIRE(state.x2 == judge.x2);
    }
}

TEST_CASE("the biquad flushes denormals in its block and leaves the thread's floating-point mode as it was") {
    const unsigned mode = _mm_getcsr();
    BiquadState state{1.0F, 0.0F, 0.0F, 0.0F, 0.0F, 0.0F, 0.0F, 0.0, 0.0};
    float sample = 1e-40F;
    runBiquad(state, &sample, 1);
    CHECK(_mm_getcsr() == mode);
    CHECK(sample == 0.0F);
}

TEST_CASE("the tracking notch has the bits of its frames read one by one, for any block lengths") {
    onEachInstructionSet([] {
        for (const int rate : {44100, 48000, 96000}) {
            for (const int perOctave : {3, 48}) {
                // At 44.1 kHz the sweep passes half the rate and the filter runs away, in the plain frames as well.
                SweepGenerator tracker;
                tracker.arm(rate, 20, 20000, 1000, 40.0F, 0.0F, perOctave);
                SweepGenerator judgeTracker = tracker;
                BiquadState notch{}, judgeNotch{};
                Log log, judgeLog;
                log.points = judgeLog.points = tracker.TableSize - 5;
                std::mt19937 random(61);
                for (int done = 0, count = 1; done < 2 * rate; done += count) {
                    count = static_cast<int>(random() % 513);
                    std::vector<float> samples(static_cast<size_t>(count));
                    for (float &sample : samples) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
                    std::vector<float> expected = samples;
                    trackSweep(tracker, notch, log.log(), samples.data(), count, rate);
                    plainTrack(judgeTracker, judgeNotch, judgeLog, expected.data(), count, rate);
                    for (size_t i = 0; i < samples.size(); ++i) REQUIRE(alike(samples[i], expected[i]));
                    REQUIRE(tracker.TablePosition == judgeTracker.TablePosition);
                    REQUIRE(tracker.Phase == judgeTracker.Phase);
                    REQUIRE(tracker.Position == judgeTracker.Position);
                    REQUIRE(tracker.CurrentFrequency == judgeTracker.CurrentFrequency);
                    REQUIRE(alike(notch.y1, judgeNotch.y1));
                    REQUIRE(alike(notch.x2, judgeNotch.x2));
                    REQUIRE(alike(log.in, judgeLog.in));
                    REQUIRE(alike(log.out, judgeLog.out));
                    REQUIRE(log.next == judgeLog.next);
                    REQUIRE(same(notch.b0, judgeNotch.b0));
                    REQUIRE(same(notch.a1, judgeNotch.a1));
                    REQUIRE(same(notch.a2, judgeNotch.a2));
                }
                CHECK(log.next > 20);
                for (size_t i = 0; i < VX_MAX_DISTORTION; ++i) REQUIRE(alike(log.ratios[i], judgeLog.ratios[i]));
            }
        }
    });
}

TEST_CASE("the notch takes a clean sweep away and leaves a harmonic as its share") {
    SweepGenerator sweep, tracker;
    sweep.arm(48000, 100, 10000, 2000, 0.0F, 0.0F, 3);
    tracker = sweep;
    BiquadState notch{};
    Log log;
    log.points = sweep.TableSize;
    std::vector<float> block(480);
    for (int done = 0; done < 96000; done += 480) {
        SweepGenerator copy = sweep;
        sweep.generate(block.data(), 0, 480);
        for (float &sample : block) {  // second harmonic, a tenth: 0.1 * sin(2 phase)
            sample += static_cast<float>(0.1 * std::sin(2.0 * copy.Phase));
            plain::sweepSample(copy, exactSine);
        }
        trackSweep(tracker, notch, log.log(), block.data(), 480, 48000);
    }
    for (int j = 15; j < log.next - 1; ++j) {
        CHECK(log.ratios[static_cast<size_t>(j)] > 0.05F);
        CHECK(log.ratios[static_cast<size_t>(j)] < 0.2F);
    }
    CHECK(log.next > 20);
}

TEST_CASE("with a sum of exactly 0 before the notch at a band's edge the band's result is 1.0") {
    SweepGenerator tracker;
    tracker.arm(48000, 100, 10000, 1000, 0.0F, 0.0F, 3);
    BiquadState notch{};
    Log log;
    log.points = 20;
    std::vector<float> silence(1), ratios(VX_MAX_DISTORTION, 0.5F);
    log.ratios = ratios;
    trackSweep(tracker, notch, log.log(), silence.data(), 1, 48000);
    CHECK(log.next == 1);
    CHECK(log.ratios[0] == 1.0F);
    CHECK(log.ratios[1] == 0.5F);
}

TEST_CASE("a log that asks for more points than there is room for, or stands nowhere, is left alone") {
    SweepGenerator tracker;
    tracker.arm(48000, 100, 10000, 1000, 0.0F, 0.0F, 48);
    BiquadState notch{};
    Log log;
    std::vector<float> block(64, 0.5F);
    log.points = INT32_MAX;
    log.next = -3;
    trackSweep(tracker, notch, log.log(), block.data(), 64, 48000);
    CHECK(log.next == -3);
    tracker.TablePosition = 500.0;
    log.next = VX_MAX_DISTORTION;
    trackSweep(tracker, notch, log.log(), block.data(), 64, 48000);
    CHECK(log.next == VX_MAX_DISTORTION);
}

TEST_CASE("a one-shot ring of two buffers stores nothing more once both are full") {
    uint32_t first[4] = {}, second[4] = {};
    VXAtomicByte ready[2] = {};
    CaptureRing ring{};
    ring.bufferCount = 2;
    ring.bufferLength = 4;
    ring.buffers[0] = first;
    ring.buffers[1] = second;
    ring.oneShot = 1;
    ring.bufferReady = ready;
    const uint32_t samples[] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10};
    feedCaptureRing(ring, samples, 5);
    CHECK(ready[0] == 1);
    CHECK(ready[1] == 0);
    CHECK(ring.writePosition == 1);
    feedCaptureRing(ring, samples + 5, 5);  // fills up in mid-call
    CHECK(ring.currentBuffer == 2);
    CHECK(ready[1] == 1);
    CHECK(second[3] == 8u);
    feedCaptureRing(ring, samples, 5);
    CHECK(ring.currentBuffer == 2);
    CHECK(first[0] == 1u);
}

TEST_CASE("a ring that isn't one-shot wraps to its first buffer") {
    uint32_t first[2] = {}, second[2] = {};
    VXAtomicByte ready[2] = {};
    CaptureRing ring{};
    ring.bufferCount = 2;
    ring.bufferLength = 2;
    ring.buffers[0] = first;
    ring.buffers[1] = second;
    ring.bufferReady = ready;
    const uint32_t samples[] = {1, 2, 3, 4, 5};
    feedCaptureRing(ring, samples, 5);
    CHECK(ring.currentBuffer == 0);
    CHECK(first[0] == 5u);
    CHECK(second[1] == 4u);
}

TEST_CASE("a ring whose buffer length was never set moves on one buffer with each sample") {
    uint32_t words[3] = {};
    VXAtomicByte ready[3] = {};
    CaptureRing ring{};
    ring.bufferCount = 3;
    for (int i = 0; i < 3; ++i) ring.buffers[i] = words + i;
    ring.bufferReady = ready;
    const uint32_t samples[] = {7, 8, 9, 10};
    feedCaptureRing(ring, samples, 4);
    CHECK(words[0] == 10u);
    CHECK(words[1] == 8u);
    CHECK(words[2] == 9u);
    CHECK(ring.currentBuffer == 1);
}

TEST_CASE("a ring without buffers or flags, or with counts beyond its table, stores nothing outside") {
    const uint32_t samples[20] = {};
    CaptureRing ring{};
    feedCaptureRing(ring, samples, 20);
    VXAtomicByte ready[8] = {};
    ring.bufferReady = ready;
    ring.bufferCount = 100;
    feedCaptureRing(ring, samples, 20);
    uint32_t word = 0;
    for (uint32_t *&buffer : ring.buffers) buffer = &word;
    feedCaptureRing(ring, samples, 20);
    CHECK(ring.currentBuffer == 8);
    ring.currentBuffer = -1;
    feedCaptureRing(ring, samples, 20);
    CHECK(ring.currentBuffer == -1);
}
