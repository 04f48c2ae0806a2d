// SPDX-License-Identifier: MIT
//
// vx measure sweep: distortion over frequency.
#include <cmath>
#include <iostream>
#include <limits>

#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/result.h"
#include "tools/vx_measure/sweep_measurement.h"
#include "tools/vx_measure/sweep_options.h"

namespace vx {

namespace {

constexpr double kNothing = std::numeric_limits<double>::quiet_NaN();
constexpr double kTailSeconds = 0.5;
constexpr const char *kNoOnset =
    "no onset came: the lead-in tone was not heard. Is the chain silent, is its noise less than 20 dB below the tone, or does the "
    "recording lack its beginning?";

struct SweepOptions : MeasureOptions {
    SweepSettings sweep;
};

std::string definitionOf(const SweepSettings &sweep) {
    return textf("distortion: mean magnitude behind a notch (Q 2) that follows the sweep, over that ahead of it; %s bands",
                 makeBandGrid(sweep.bandsPerOctave).name().c_str());
}

const char *kDetails =
    "It holds all harmonics from 2 to the stated order, which lies below half the sample rate, and noise and hum besides; the "
    "notch\n"
    "passes harmonic 2 at -0.46 dB, harmonic 3 at -0.15 dB. The floor is what the sweep itself leaves behind the notch; it falls "
    "as\n"
    "--time grows.\n";

double percentOf(const SweepBand &band) {
    return band.why.empty() ? 100.0 * band.ratio : kNothing;
}
double decibelsOf(const SweepBand &band) {
    return band.why.empty() && band.ratio > 0.0 ? 20.0 * std::log10(band.ratio) : kNothing;
}

// Bands outside the sweep are no lines of the table for a person.
std::string tableText(const SweepOutcome &outcome, const Style &style) {
    std::string text = style.bold(textf("%10s  %10s  %9s  %10s  %s", "band", "distortion", "in dB", "harmonics", "floor")) + "\n";
    for (const SweepBand &band : outcome.bands) {
        if (band.why == "outside the sweep") continue;
        text += textf("%10s  ", frequencyText(band.centreHz).c_str());
        if (band.why.empty())
            text += textf("%8.3f %%  %9.1f  %10s  %.2g %%\n", percentOf(band), decibelsOf(band),
                          band.highestOrder == 2 ? "2" : textf("2 to %d", band.highestOrder).c_str(), 100.0 * band.floor);
        else
            text += style.warning("not measurable: " + band.why) + "\n";
    }
    return text;
}

Result resultOf(const SweepOptions &options, const Rig &rig, const SweepOutcome &outcome) {
    const SweepSettings &sweep = options.sweep;
    const std::string definition = definitionOf(sweep);
    Result result;
    result.text = textf("sweep    %d Hz to %d Hz in %g s, lead-in %d ms, channel %d, %d Hz\n", sweep.startHz, sweep.stopHz,
                        sweep.timeMs / 1000.0, sweep.preDelayMs, sweep.channel, rig.rate()) +
                  "engine   " + rig.engineFile() + "\nchain    " + options.chainText() + "\n\n" +
                  tableText(outcome, Style(options.common.colour, stdout)) + "\nDefinition: " + definition + ".\n" + kDetails;
    result.json = {{"measurement", "sweep"},       {"definition", definition},
                   {"chain", options.chainText()}, {"sampleRate", rig.rate()},
                   {"channel", sweep.channel},     {"startHz", sweep.startHz},
                   {"stopHz", sweep.stopHz},       {"timeMs", sweep.timeMs},
                   {"leadInMs", sweep.preDelayMs}, {"bandsPerOctave", sweep.bandsPerOctave},
                   {"onset", outcome.onset}};
    result.table.columns = {"centre_hz",     "low_hz",        "high_hz",      "distortion_percent",
                            "distortion_db", "highest_order", "floor_percent"};
    double highest = -100.0, lowest = 0.0;
    for (const SweepBand &band : outcome.bands) {
        const bool measured = band.why.empty();
        nlohmann::ordered_json row = {{"centreHz", band.centreHz},
                                      {"lowHz", band.lowestHz},
                                      {"highHz", band.highestHz},
                                      {"distortionPercent", numberOrNull(percentOf(band))},
                                      {"distortionDb", numberOrNull(decibelsOf(band))},
                                      {"highestOrder", band.highestOrder},
                                      {"floorPercent", 100.0 * band.floor},
                                      {"state", measured ? "measured" : "not measurable"}};
        if (!measured) row["why"] = band.why;
        result.json["bands"].push_back(row);
        result.table.rows.push_back({band.centreHz, band.lowestHz, band.highestHz, percentOf(band), decibelsOf(band),
                                     static_cast<double>(band.highestOrder), 100.0 * band.floor});
        if (!measured) continue;
        highest = std::max(highest, decibelsOf(band));
        lowest = std::min(lowest, decibelsOf(band));
    }
    const double top = std::min(0.0, 20.0 * std::ceil((highest + 6.0) / 20.0));
    const double bottom = std::min(top - 40.0, 20.0 * std::floor((lowest - 6.0) / 20.0));
    result.plotCommands = titleCommands("Distortion over frequency", definition, options.chainText()) +
                          frequencyAxis(sweep.startHz * 0.9, sweep.stopHz * 1.1) +
                          textf("set yrange [%g:%g]\nset ytics 10\nset ylabel \"dB\"\n", bottom, top) +
                          textf("set y2range [%g:%g]\nset y2label \"percent\"\nset y2tics (", bottom, top);
    std::string tics;
    for (int decade = -6; decade <= 2; ++decade)
        for (const int step : {1, 2, 5}) {
            if (step == 2 && top - bottom > 60.0) continue;
            const double percent = step * std::pow(10.0, decade);
            tics += textf("%s\"%g\" %.9g", tics.empty() ? "" : ", ", percent, 20.0 * std::log10(percent / 100.0));
        }
    result.plotCommands +=
        tics +
        ")\nset key top right opaque\nset style fill solid 0.25 noborder\n"
        "plot $data using 1:(20*log10($7/100)) with filledcurves y1=-400 lc rgb '#999999' title \"floor of the sweep\", "
        "$data using 1:5 with linespoints lw 2 pt 7 ps 0.7 lc rgb '#1f6fb4' title \"distortion\"\n";
    return result;
}

void runSweep(const SweepOptions &options, int &exitStatus) {
    checkMeasureOptions(options);
    ResultFiles files(options);
    Rig rig(options, options.sweep.channel);
    checkSweep(options.sweep, rig.rate());
    const bool silent = options.common.quiet || options.common.json;
    if (options.onlyPlays()) {
        startSweep(rig, options.sweep);
        rig.stepUntil(sweepSeconds(options.sweep));
        stopSweep(rig, options.sweep);
        rig.stepUntil(rig.seconds() + kTailSeconds);
        rig.commit();
        return tellPlayed(options, rig.seconds());
    }
    const SweepOutcome outcome = measureSweep(rig, options.sweep, silent);
    rig.commit();
    files.deliver(resultOf(options, rig, outcome));
    if (!outcome.onset) std::cerr << "vx: " << kNoOnset << "\n";
    if (!outcome.anyMeasured()) exitStatus = static_cast<int>(ExitStatus::found);
}

}  // namespace

void addSweepSettings(CLI::App &verb, SweepSettings &sweep) {
    const char *group = "Sweep";
    verb.add_option("--channel", sweep.channel, "The measured channel")
        ->check(CLI::Range(0, 3))
        ->capture_default_str()
        ->type_name("N")
        ->group(group);
    verb.add_option("--start", sweep.startHz, "First frequency in Hz")
        ->check(CLI::Range(8, 65535))
        ->capture_default_str()
        ->type_name("HZ")
        ->group(group);
    verb.add_option("--stop", sweep.stopHz, "Last frequency in Hz")
        ->check(CLI::Range(8, 65535))
        ->capture_default_str()
        ->type_name("HZ")
        ->group(group);
    verb.add_option("--time", sweep.timeMs, "Length in ms; a longer sweep has a lower floor")
        ->check(CLI::Range(100, 65535))
        ->capture_default_str()
        ->type_name("MS")
        ->group(group);
    verb.add_option("--lead-in", sweep.preDelayMs, "Length of the tone ahead in ms, by which the sweep is found: 30 to 126")
        ->check(CLI::Range(30, 126))
        ->capture_default_str()
        ->type_name("MS")
        ->group(group);
    verb.add_option("--bands", sweep.bandsPerOctave, "Bands an octave: 1, 3, 6, 12, 24 or 48")
        ->check(CLI::IsMember({1, 3, 6, 12, 24, 48}))
        ->capture_default_str()
        ->type_name("N")
        ->group(group);
}

void addSweepVerb(CLI::App &measure, int &exitStatus) {
    auto options = std::make_shared<SweepOptions>();
    CLI::App *verb = measure.add_subcommand("sweep", "Distortion over frequency by a swept sine");
    addSweepSettings(*verb, options->sweep);
    addEngineAndFormat(*verb, *options);
    addChain(*verb, *options);
    addResults(*verb, *options);
    verb->footer("Parts of --plant, separated by commas:\n" + plantParts() + "\nDefinition: " + definitionOf(options->sweep) +
                 " (--bands).\n" + kDetails +
                 "Exit status: 0 measured; 1 nothing could be measured.\n"
                 "Example: vx measure sweep --plant delay=12ms,h2=-40dB,noise=-70dB --plot distortion.png");
    verb->callback([options, &exitStatus] { runSweep(*options, exitStatus); });
}

}  // namespace vx
