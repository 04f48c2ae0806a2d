// SPDX-License-Identifier: MIT
#include "tools/vx_measure/sweep_measurement.h"

#include <VXDSPAPI.h>

#include <algorithm>
#include <cmath>
#include <numbers>

#include "tools/vx/console.h"
#include "tools/vx/text.h"
#include "tools/vx_measure/data_bytes.h"

namespace vx {

namespace {

constexpr double kQuality = 2.0;          // of the library's notch
constexpr double kLateSeconds = 0.00105;  // the library starts to follow at a whole millisecond, and a sample beside the peak
constexpr double kLag = 0.12;             // how far it lags behind a moving sine, over the time in which it settles
constexpr double kMargin = 1.2;           // of the estimate over what clean chains show
constexpr double kPatience = 2.0;         // seconds beyond the end, for the chain's delay
constexpr double kPollSeconds = 0.1;

// Where a sweep begins and ends in the table: the rule of the library's arming.
struct Span {
    int first = 0;
    int count = 0;
};

int indexAbove(const BandGrid &grid, double hz) {
    return static_cast<int>(std::upper_bound(grid.edges.begin(), grid.edges.end(), hz) - grid.edges.begin());
}

Span spanOf(const BandGrid &grid, const SweepSettings &settings) {
    const int first = std::max(indexAbove(grid, settings.startHz) - 1, 0);
    return {first, indexAbove(grid, settings.stopHz) - first};
}

// Kept: the library's index ends one short of its points, so the table's last band never comes.
int bandsToReach(const BandGrid &grid, const Span &span) {
    return std::min(span.first + span.count, grid.bands() - 1);
}

std::vector<uint8_t> sweepCommand(const SweepSettings &settings, bool on) {
    constexpr uint32_t kPostDelayMs = 0;
    DataWriter writer;
    writer.u8(on ? 1 : 0).u8(static_cast<uint32_t>(settings.channel));
    for (const int value : {settings.startHz, settings.stopHz, settings.timeMs, settings.preDelayMs})
        writer.u16(static_cast<uint32_t>(value));
    return writer.u16(kPostDelayMs).u16(static_cast<uint32_t>(settings.bandsPerOctave)).bytes();
}

struct Progressed {
    int index;
    const float *ratios;
};

Progressed lookAt(Rig &rig, const SweepSettings &settings) {
    DataReader answer(rig.command(VXDSP_DATA_SWEEP_RESULT, DataWriter().u8(static_cast<uint32_t>(settings.channel)).bytes()));
    answer.i32();
    const int index = answer.i32();
    return {index, answer.floats()};
}

}  // namespace

bool SweepOutcome::anyMeasured() const {
    return std::any_of(bands.begin(), bands.end(), [](const SweepBand &band) { return band.why.empty(); });
}

double sweepFloor(const SweepSettings &settings, int band, int rate) {
    const BandGrid grid = makeBandGrid(settings.bandsPerOctave);
    const Span span = spanOf(grid, settings);
    const double hz = grid.edges[static_cast<size_t>(band)];
    const double bandSeconds = settings.timeMs / 1000.0 / (span.count - 1);
    // The frequency rises in a straight line from edge to edge, so most steeply, by its own measure, at the lower one.
    const double relativeSlope = (std::exp2(1.0 / settings.bandsPerOctave) - 1.0) / bandSeconds;
    // The notch lets pass 2Q of a small relative deviation, and more towards half the rate, where it narrows.
    const double highestW = 2.0 * std::numbers::pi * std::min(grid.edges[static_cast<size_t>(band) + 1] / rate, 0.49);
    const double slope = 2.0 * kQuality * highestW / std::sin(highestW);
    const double settling = 2.0 * kQuality / (2.0 * std::numbers::pi * hz);
    // The first band begins with the notch at rest.
    const double begin = settling / bandSeconds * std::exp((span.first - band) * bandSeconds / settling);
    return kMargin * (slope * relativeSlope * (kLateSeconds + kLag * settling) + begin);
}

void checkSweep(const SweepSettings &settings, int rate) {
    const auto fail = [](const std::string &what) { throw Failure(ExitStatus::usage, what); };
    const BandGrid grid = makeBandGrid(settings.bandsPerOctave);
    const double highest = std::min(grid.edges.back(), rate / 2.0);
    if (settings.startHz >= settings.stopHz) fail(textf("--start %d must be below --stop %d", settings.startHz, settings.stopHz));
    if (settings.stopHz >= highest)
        fail(textf("--stop %d: expected less than %.0f Hz, where ", settings.stopHz, highest) +
             (highest < rate / 2.0 ? "the " + grid.name() + " bands end" : "half the sample rate lies"));
    if (spanOf(grid, settings).count < 3)
        fail(textf("--start %d and --stop %d", settings.startHz, settings.stopHz) +
             ": a sweep needs two whole bands between them; widen it or take more --bands");
}

double sweepSeconds(const SweepSettings &settings) {
    const BandGrid grid = makeBandGrid(settings.bandsPerOctave);
    const Span span = spanOf(grid, settings);
    const double perBand = settings.timeMs / 1000.0 / (span.count - 1);
    return settings.preDelayMs / 1000.0 + perBand * (bandsToReach(grid, span) - span.first);
}

void startSweep(Rig &rig, const SweepSettings &settings) {
    rig.command(VXDSP_DATA_SWEEP_START, sweepCommand(settings, true));
}

void stopSweep(Rig &rig, const SweepSettings &settings) {
    rig.command(VXDSP_DATA_SWEEP_START, sweepCommand(settings, false));
}

SweepOutcome measureSweep(Rig &rig, const SweepSettings &settings, bool silent) {
    const BandGrid grid = makeBandGrid(settings.bandsPerOctave);
    const Span span = spanOf(grid, settings);
    const int wanted = bandsToReach(grid, span);
    startSweep(rig, settings);
    const double atMost = sweepSeconds(settings) + kPatience;
    Progress progress("sweep", static_cast<uint64_t>(sweepSeconds(settings) * rig.rate()), silent);
    Progressed now = lookAt(rig, settings);
    // A recording may begin long before the sweep does: it is heard to its end.
    while (now.index < wanted && (!rig.isSimulated() || rig.seconds() < atMost)) {
        const bool more = rig.stepUntil(rig.seconds() + kPollSeconds);
        now = lookAt(rig, settings);
        progress.update(rig.frames());
        if (!more) break;
    }
    SweepOutcome outcome;
    outcome.onset = now.index > span.first;
    const double nyquist = rig.rate() / 2.0;
    for (int i = 0; i < grid.bands(); ++i) {
        const auto at = static_cast<size_t>(i);
        SweepBand band;
        band.centreHz = grid.centres[at];
        band.lowestHz = grid.edges[at];
        band.highestHz = grid.edges[at + 1];
        band.floor = sweepFloor(settings, i, rig.rate());
        band.highestOrder = static_cast<int>(nyquist / band.highestHz);
        if (i < span.first || i >= span.first + span.count)
            band.why = "outside the sweep";
        else if (i >= wanted)
            band.why = "the library ends one band short of its table";
        else if (band.highestOrder < 2)
            band.why = "harmonic 2 lies beyond half the sample rate";
        else if (!outcome.onset)
            band.why = "no onset came";
        else if (i >= now.index)
            band.why = "the recording ended before the sweep came here";
        else
            band.ratio = static_cast<double>(now.ratios[i]);
        if (band.why.empty() && band.ratio < band.floor)
            band.why = textf("below the floor of this sweep, %.2g %%", 100.0 * band.floor);
        outcome.bands.push_back(band);
    }
    stopSweep(rig, settings);
    return outcome;
}

}  // namespace vx
