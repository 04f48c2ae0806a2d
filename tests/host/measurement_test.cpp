// SPDX-License-Identifier: MIT
//
// Whole measurements, from the command through VXDSPAPI_Process, a simulated chain and VXDSPAPI_Record to the result. The chain is
// a loudspeaker whose distortion is known exactly, because Chebyshev polynomials turn a sine of full scale into its harmonics.
#include <doctest/doctest.h>

#include <cmath>
#include <complex>
#include <deque>
#include <random>

#include "measure/band_tables.h"
#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr int kFrames = 480;
constexpr double kTwoPi = 6.283185307179586;
const IOFormat kStereo = formatOf(0x3);

// A value on both channels; slots beyond them would be folded in.
Block stereoBlock(float value) {
    Block block;
    std::fill_n(block.slot(0), kFrames, value);
    std::fill_n(block.slot(1), kFrames, value);
    return block;
}

struct Loudspeaker {
    double second = 0.0;  // amplitude of the second harmonic over the fundamental's
    double third = 0.0;
    int delay = 0;       // samples
    double gain = 1.0;   // below 0 it inverts
    double noise = 0.0;  // amplitude

    double shape(double x) const { return x + second * (2.0 * x * x - 1.0) + third * (4.0 * x * x * x - 3.0 * x); }
};

// Runs blocks through host, loudspeaker and capture side.
class Chain {
  public:
    Chain(const HostInstance &host, const Loudspeaker &speaker)
        : host_(host), speaker_(speaker), onTheWay_(static_cast<size_t>(speaker.delay), 0.0F), random_(4711) {}

    void run(int blocks, int channel = 0) {
        std::uniform_real_distribution<double> noise(-1.0, 1.0);
        for (int b = 0; b < blocks; ++b) {
            Block block;
            host_.process(block, kStereo, kStereo);
            Block captured;
            for (int i = 0; i < kFrames; ++i) {
                onTheWay_.push_back(static_cast<float>(speaker_.gain * airborne(static_cast<double>(block.slot(channel)[i]))));
                captured.slot(channel)[i] = onTheWay_.front() + static_cast<float>(speaker_.noise * noise(random_));
                onTheWay_.pop_front();
            }
            IOFormat format = kStereo;
            VXDSPAPI_Record(host_.handle, &captured.buffers, &format);
        }
    }

  private:
    // No loudspeaker sounds at 0 Hz: what the even polynomial makes of silence, and of a swell, goes through a high pass at 5 Hz.
    double airborne(double x) {
        const double shaped = speaker_.shape(x) + speaker_.second;
        slow_ += (shaped - slow_) * kTwoPi * 5.0 / 48000.0;
        return shaped - slow_;
    }

    const HostInstance &host_;
    Loudspeaker speaker_;
    double slow_ = 0.0;
    std::deque<float> onTheWay_;
    std::mt19937 random_;
};

// What the notch at f with Q 2 lets pass of a partial at n times f.
std::complex<double> notchAt(double hz, double partial, double rate = 48000.0) {
    const double w = kTwoPi * hz / rate;
    const double alpha = std::sin(w) / 4.0;
    const std::complex<double> z = std::polar(1.0, -w * partial);
    const std::complex<double> top = 1.0 - 2.0 * std::cos(w) * z + z * z;
    const std::complex<double> bottom = (1.0 + alpha) - 2.0 * std::cos(w) * z + (1.0 - alpha) * z * z;
    return top / bottom;
}

// The ratio of mean magnitudes behind and ahead of the notch for a steady sine through the loudspeaker, in closed form but for the
// mean, which is taken over 4096 places of one turn.
double expectedRatio(const Loudspeaker &speaker, double hz) {
    const std::complex<double> second = notchAt(hz, 2.0), third = notchAt(hz, 3.0);
    double before = 0.0, behind = 0.0;
    for (int i = 0; i < 4096; ++i) {
        const double t = kTwoPi * (i + 0.5) / 4096.0;
        before += std::fabs(speaker.shape(std::sin(t)));
        // With x = sin t the second polynomial is -cos 2t and the third -sin 3t.
        behind += std::fabs(-speaker.second * std::abs(second) * std::cos(2.0 * t + std::arg(second)) -
                            speaker.third * std::abs(third) * std::sin(3.0 * t + std::arg(third)));
    }
    return behind / before;
}

struct SweepResult {
    int points;
    int index;
    const float *ratios;
};

SweepResult resultOf(const HostInstance &host, uint8_t channel) {
    const Answer answer = command(host, VXDSP_DATA_SWEEP_RESULT, {channel});
    CHECK_EQ(answer.size, 16);
    return {answer.at<int32_t>(0), answer.at<int32_t>(4), answer.pointerAt<float>(8)};
}

SweepCommand slowSweep() {
    SweepCommand sweep;
    sweep.start = 100;
    sweep.stop = 10000;
    sweep.sweepTime = 8000;
    sweep.preDelay = 100;
    return sweep;
}

}  // namespace

TEST_CASE("-20 straight after -17 gives the first table index, all points and all results 1.0") {
    HostInstance host;
    host.setFormat(kStereo);
    for (const uint16_t n : {1, 3, 6, 12, 24, 48}) {
        SweepCommand sweep = slowSweep();
        sweep.channel = 5;
        sweep.bandsPerOctave = n;
        std::fill_n(host.context().distortion[5], VX_MAX_DISTORTION, 0.25F);
        CHECK_EQ(command(host, VXDSP_DATA_SWEEP_START, sweep.bytes()).size, 0);
        const SweepResult result = resultOf(host, 5);
        const float *edges = nullptr;
        int size = 0;
        BandTables::select(n, &edges, nullptr, &size);
        CHECK_EQ(result.points, size - 1);
        CHECK(edges[result.index] <= 100.0F);
        CHECK(edges[result.index + 1] > 100.0F);
        CHECK_EQ(result.ratios, host.context().distortion[5]);
        for (int i = 0; i < result.points; ++i) CHECK_EQ(result.ratios[i], 1.0F);
    }
}

TEST_CASE("-17 arms generator, tone, search and notch of its channel and lowers both stops") {
    HostInstance host;
    host.setFormat(kStereo);
    LibraryContext &context = host.context();
    context.trackingNotch[2] = {1, 2, 3, 4, 5, 6, 7, 8, 9};
    context.sweepStarted[2] = context.sweepTracking[2] = 1;
    context.notchInputSum[2] = context.notchOutputSum[2] = 3.0;
    SweepCommand sweep;
    sweep.channel = 2;
    sweep.preDelay = 101;
    command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
    CHECK_EQ(context.sweep[2].StartFrequency, 100);
    CHECK_EQ(context.sweep[2].StopFrequency, 10000);
    CHECK_EQ(context.sweep[2].SweepTime, 1000);
    CHECK_EQ(context.sweep[2].PreDelay, 101.0F);
    CHECK_EQ(context.sweep[2].BandsPerOctave, 3);
    CHECK_EQ(context.polarityTone[2].HalfLength, 2424);  // 50.5 ms
    CHECK_EQ(context.polarityTone[2].Position, 0);
    CHECK_EQ(context.trackingNotch[2].b0, 1.0F);
    CHECK_EQ(context.trackingNotch[2].a2, 5.0F);
    CHECK_EQ(context.trackingNotch[2].x1, 0.0F);
    CHECK_EQ(context.trackingNotch[2].y2, 0.0);
    CHECK_EQ(context.sweepStarted[2], 0);
    CHECK_EQ(context.sweepTracking[2], 0);
    CHECK_EQ(context.sweepOnsetPending[2], 1);
    CHECK_EQ(context.sweepActive[2], 1);
    CHECK_EQ(context.notchInputSum[2], 0.0);
    CHECK_EQ(context.notchOutputSum[2], 0.0);
    CHECK_EQ(context.processStop, 0);
    CHECK_EQ(context.recordStop, 0);
    sweep.on = 0;
    command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
    CHECK_EQ(context.sweepActive[2], 0);
    CHECK_EQ(context.sweepOnsetPending[2], 0);
    CHECK_EQ(context.sweepActive[1], 0);
}

TEST_CASE("-17 with start 100 and stop 100, with start 0 or with no time changes nothing, not even when on is 0") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, slowSweep().bytes());
    for (const uint8_t on : {0, 1}) {
        for (int fault = 0; fault < 4; ++fault) {
            SweepCommand sweep = slowSweep();
            sweep.on = on;
            if (fault == 0) sweep.start = sweep.stop = 100;
            if (fault == 1) sweep.start = 0;
            if (fault == 2) sweep.sweepTime = 0;
            if (fault == 3) sweep.start = 20000;
            CHECK_EQ(command(host, VXDSP_DATA_SWEEP_START, sweep.bytes()).size, 0);
            CHECK_EQ(host.context().sweepActive[0], 1);
            CHECK_EQ(host.context().sweep[0].SweepTime, 8000);
            CHECK_EQ(host.context().sweep[0].StartFrequency, 100);
        }
    }
}

TEST_CASE("a sweep on one channel leaves the others' audio untouched") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, slowSweep().bytes());
    Block block = stereoBlock(0.5F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().sweepStarted[0], 1);
    CHECK(block.slot(0)[0] != 0.5F);
    for (int i = 0; i < kFrames; ++i) REQUIRE_EQ(block.slot(1)[i], 0.5F);
}

TEST_CASE("distortion of a simulated loudspeaker comes out as its harmonics say") {
    for (const Loudspeaker &speaker :
         {Loudspeaker{0.0, 0.0, 0}, Loudspeaker{0.1, 0.0, 240}, Loudspeaker{0.0, 0.1, 1000}, Loudspeaker{0.05, 0.02, 4801}}) {
        HostInstance host;
        host.setFormat(kStereo);
        command(host, VXDSP_DATA_SWEEP_START, slowSweep().bytes());
        Chain chain(host, speaker);
        for (int s = 0; s < 120 && resultOf(host, 0).index < resultOf(host, 0).points - 1; ++s) chain.run(100);
        const SweepResult result = resultOf(host, 0);
        CHECK_EQ(host.context().sweepTracking[0], 1);
        // Kept: the last index is one short of the points.
        CHECK_EQ(result.index, result.points - 1);
        CHECK_EQ(result.ratios[result.points - 1], 1.0F);
        const float *edges = nullptr;
        BandTables::select(3, &edges, nullptr, nullptr);
        int looked = 0;
        for (int band = 0; band < result.index; ++band) {
            const double hz = std::sqrt(static_cast<double>(edges[band]) * static_cast<double>(edges[band + 1]));
            if (hz < 300.0 || hz > 7000.0) continue;  // below, the notch lags; above, the third harmonic folds back
            const double expected = expectedRatio(speaker, hz);
            CAPTURE(hz);
            CAPTURE(speaker.second);
            CAPTURE(speaker.third);
            CHECK(std::fabs(static_cast<double>(result.ratios[band]) - expected) < 0.006 + 0.03 * expected);
            ++looked;
        }
        CHECK(looked > 12);
    }
}

TEST_CASE("the sweep is followed on each of the four capture channels, and each has its own results") {
    HostInstance host;
    IOFormat format = formatOf(0xF);
    host.setFormat(format);
    SweepCommand sweep = slowSweep();
    sweep.sweepTime = 2000;
    for (uint8_t c = 0; c < 4; ++c) {
        sweep.channel = c;
        command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
    }
    for (int b = 0; b < 400; ++b) {
        Block block;
        host.process(block, format, format);
        for (int c = 0; c < 4; ++c) {
            for (int i = 0; i < kFrames; ++i) {
                const float x = block.slot(c)[i];
                block.slot(c)[i] = x + 0.05F * static_cast<float>(c) * (4.0F * x * x * x - 3.0F * x);
            }
        }
        VXDSPAPI_Record(host.handle, &block.buffers, &format);
    }
    float last = -1.0F;
    for (uint8_t c = 0; c < 4; ++c) {
        const SweepResult result = resultOf(host, c);
        CHECK_EQ(result.index, result.points - 1);
        const float ratio = result.ratios[20];  // around 800 Hz
        CHECK(ratio > last + 0.03F);
        last = ratio;
    }
}

TEST_CASE("a sweep without a lead-in that the search can find never starts to track") {
    HostInstance host;
    host.setFormat(kStereo);
    SweepCommand sweep = slowSweep();
    sweep.preDelay = 400;  // swells too slowly: less than sixfold in 10 ms
    command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
    Chain chain(host, {});
    chain.run(80);
    CHECK_EQ(host.context().sweepOnsetPending[0], 1);
    CHECK_EQ(resultOf(host, 0).ratios[10], 1.0F);
}

TEST_CASE("lead-ins of a half length below 64 ms are found on a clean chain, longer ones are not") {
    for (const uint16_t preDelay : {40, 60, 100, 124, 126, 130, 160}) {
        HostInstance host;
        host.setFormat(kStereo);
        SweepCommand sweep = slowSweep();
        sweep.preDelay = preDelay;
        command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
        Chain chain(host, {0.0, 0.0, 2400});
        chain.run((preDelay + 60) / 10);
        CAPTURE(preDelay);
        CHECK_EQ(host.context().sweepTracking[0], preDelay < 128 ? 1 : 0);
    }
}

TEST_CASE("-22 straight after -21 gives 0, also behind an earlier result") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().polarityResult[3] = 1;
    host.context().polarityStarted[3] = 1;
    CHECK_EQ(command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 3, 20)).size, 0);
    const Answer answer = command(host, VXDSP_DATA_POLARITY_RESULT, {3});
    CHECK_EQ(answer.size, 4);
    CHECK_EQ(answer.at<int32_t>(0), 0);
    const LibraryContext &context = host.context();
    CHECK_EQ(context.polarityActive[3], 1);
    CHECK_EQ(context.polarityOnsetPending[3], 1);
    CHECK_EQ(context.polarityStarted[3], 0);
    CHECK_EQ(context.polarityTone[3].HalfLength, 960);
    CHECK_EQ(context.processStop, 0);
    CHECK_EQ(context.recordStop, 0);
    command(host, VXDSP_DATA_POLARITY_START, polarityCommand(0, 3, 20));
    CHECK_EQ(context.polarityActive[3], 0);
    CHECK_EQ(context.polarityOnsetPending[3], 0);
}

TEST_CASE("the polarity of a chain is found right and inverted, with noise at -40 dB and delays from 0 to 300 ms") {
    for (int milliseconds = 0; milliseconds <= 300; milliseconds += 5) {
        for (const double gain : {1.0, -1.0, 0.3, -0.3}) {
            HostInstance host;
            host.setFormat(kStereo);
            const double noise = 0.01 * std::fabs(gain);
            Chain chain(host, {0.0, 0.0, milliseconds * 48 + milliseconds % 7, gain, noise});
            chain.run(10);  // noise alone is no onset
            command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 0, 20));
            int result = 0;
            for (int b = 0; b < 60 && result == 0; ++b) {
                chain.run(1);
                result = command(host, VXDSP_DATA_POLARITY_RESULT, {0}).at<int32_t>(0);
            }
            CAPTURE(milliseconds);
            CAPTURE(gain);
            // The tone begins downwards, so a chain that keeps the polarity reads -1.
            CHECK_EQ(result, gain > 0.0 ? -1 : 1);
        }
    }
}

TEST_CASE("the tone switches its channel off at its end, and a tone of no length writes one zero sample") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 1, 20));
    int blocks = 0;
    while (host.context().polarityActive[1] != 0 && blocks < 100) {
        Block block = stereoBlock(0.5F);
        host.process(block, kStereo, kStereo);
        ++blocks;
    }
    CHECK_EQ(blocks, 5);  // 1920 samples, and the block that finds the end
    command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 1, 0));
    Block block = stereoBlock(0.5F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(block.slot(1)[0], 0.0F);
    CHECK_EQ(block.slot(1)[1], 0.5F);
    CHECK_EQ(host.context().polarityActive[1], 0);
}
