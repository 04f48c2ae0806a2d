// SPDX-License-Identifier: MIT
//
// vx measure equaliser: ten bands that bring a measured curve to a target, in every way in which somebody may want to enter them.
#include <algorithm>
#include <cmath>
#include <iostream>

#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/equaliser_fit.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/result.h"

namespace vx {

namespace {

constexpr const char *kDefinition =
    "least squares of the deviation in dB over the measured points, at most twelve an octave; the level between the curves is free";
constexpr double kLeastDb = 0.05;  // a band that is rounded to nothing is off

struct EqualiserOptions : MeasureOptions {
    std::string measured;
    std::string target = "flat";
    FitSettings fit;
};

bool isOn(const PeakBand &band) {
    return std::fabs(band.decibels) >= kLeastDb;
}

std::string filterLine(size_t number, const PeakBand &band) {
    const std::string hz = band.hz >= 100.0 ? textf("%.0f", band.hz) : textf("%.4g", band.hz);
    return textf("Filter %zu: %s PK Fc %s Hz Gain %.1f dB Q %.2f", number + 1, isOn(band) ? "ON" : "OFF", hz.c_str(),
                 isOn(band) ? band.decibels : 0.0, band.quality);
}

// For vx run and vx measure: the sliders by name, or whole bands as parameters of the sample engine's equaliser.
std::string engineOption(size_t number, const PeakBand &band, bool free) {
    if (!free) return textf("--set eq%zu=%+.2fdB", number + 1, band.decibels);
    return textf("--param 5,%zu=u8:1,f32:%.1f,f32:%.3f,f32:%.2f", 117 + number, band.hz, band.quality, band.decibels);
}

// The attenuation ahead, with which no frequency is lifted above full scale.
double headroomDb(const EqualiserFit &fit, double sampleRate) {
    double most = 0.0;
    for (double hz = 10.0; hz < sampleRate / 2.0; hz *= 1.02) most = std::max(most, equaliserResponse(fit.bands, hz, sampleRate));
    return -most;
}

std::string deviationText(const char *when, const Deviation &deviation) {
    return textf("  %-7s %6.2f dB rms, at most %+.2f dB at ", when, deviation.rms, deviation.worst) +
           frequencyText(deviation.worstHz) + "\n";
}

nlohmann::ordered_json deviationJson(const Deviation &deviation) {
    return {{"rmsDb", deviation.rms}, {"worstDb", deviation.worst}, {"worstHz", deviation.worstHz}};
}

std::string textOf(const EqualiserOptions &options, const EqualiserFit &fit, double headroom) {
    const Style style(options.common.colour, stdout);
    std::string text =
        "measured " + options.measured + textf(", %zu points from ", fit.measured.size()) + frequencyText(fit.measured.front().hz) +
        " to " + frequencyText(fit.measured.back().hz) + "\ntarget   " + options.target +
        textf("; the measured curve lies %.2f dB %s it\n\n", std::fabs(fit.levelDb), fit.levelDb < 0.0 ? "below" : "above");
    text += style.bold(textf("%-5s  %10s  %8s  %6s", "band", "frequency", "gain", "Q")) + "\n";
    for (size_t i = 0; i < kFitBands; ++i)
        text += textf("%-5zu  %10s  %+5.2f dB  %6.2f\n", i + 1, frequencyText(fit.bands[i].hz).c_str(), fit.bands[i].decibels,
                      fit.bands[i].quality);
    text += "\n" + style.bold("deviation from the target") + "\n" + deviationText("before", fit.before) +
            deviationText("after", fit.after);
    text += "\n" + style.bold("sample engine") + "\n ";
    for (size_t i = 0; i < kFitBands; ++i) text += " " + engineOption(i, fit.bands[i], options.fit.free);
    text += "\n\n" + style.bold("filter text") + "\n" + textf("Preamp: %.1f dB\n", headroom);
    for (size_t i = 0; i < kFitBands; ++i) text += filterLine(i, fit.bands[i]) + "\n";
    return text + "\nDefinition: " + kDefinition +
           textf("; response at %g Hz; gains within %g dB.\n", options.fit.sampleRate, kFitMostDb);
}

Result resultOf(const EqualiserOptions &options, const EqualiserFit &fit) {
    const double headroom = headroomDb(fit, options.fit.sampleRate);
    Result result;
    result.text = textOf(options, fit, headroom);
    result.json = {{"measurement", "equaliser"},
                   {"definition", kDefinition},
                   {"measured", options.measured},
                   {"target", options.target},
                   {"sampleRate", options.fit.sampleRate},
                   {"levelDb", fit.levelDb},
                   {"preampDb", headroom},
                   {"before", deviationJson(fit.before)},
                   {"after", deviationJson(fit.after)}};
    for (size_t i = 0; i < kFitBands; ++i) {
        const PeakBand &band = fit.bands[i];
        result.json["bands"].push_back({{"hz", band.hz},
                                        {"gainDb", band.decibels},
                                        {"q", band.quality},
                                        {"option", engineOption(i, band, options.fit.free)},
                                        {"filter", filterLine(i, band)}});
    }
    result.table.columns = {"hz", "measured_db", "target_db", "corrected_db", "equaliser_db"};
    double highest = 3.0, lowest = -3.0;
    for (size_t i = 0; i < fit.measured.size(); ++i) {
        const double hz = fit.measured[i].hz;
        const double equaliser = equaliserResponse(fit.bands, hz, options.fit.sampleRate);
        result.table.rows.push_back({hz, fit.measured[i].decibels, fit.target[i].decibels, fit.corrected[i].decibels, equaliser});
        for (size_t column = 1; column < 5; ++column) {
            highest = std::max(highest, result.table.rows.back()[column]);
            lowest = std::min(lowest, result.table.rows.back()[column]);
        }
    }
    const double range = highest - lowest;
    result.plotCommands = titleCommands("Equaliser of ten bands for " + utf8Of(pathOf(options.measured).filename()),
                                        std::string("fit: ") + kDefinition, "") +
                          frequencyAxis(fit.measured.front().hz * 0.9, fit.measured.back().hz * 1.1) +
                          textf("set yrange [%.9g:%.9g]\nset ylabel \"dB\"\nset key bottom center maxrows 1\n",
                                lowest - 0.2 * range, highest + 0.06 * range) +
                          "plot $data using 1:3 with lines lw 1.5 dt 2 lc rgb '#222222' title \"target\", "
                          "$data using 1:2 with lines lw 2 lc rgb '#999999' title \"measured\", "
                          "$data using 1:5 with lines lw 2 lc rgb '#e08e0b' title \"equaliser\", "
                          "$data using 1:4 with lines lw 2.5 lc rgb '#1f6fb4' title \"corrected\"\n";
    return result;
}

void runEqualiser(const EqualiserOptions &options) {
    checkMeasureOptions(options);
    if (options.fit.lowestHz >= options.fit.highestHz)
        throw Failure(ExitStatus::usage, textf("--from %g must be below --to %g", options.fit.lowestHz, options.fit.highestHz));
    if (options.measured == "-" && options.target == "-")
        throw Failure(ExitStatus::usage, "--fit - and --target - both want standard input");
    ResultFiles files(options);
    const Curve measured = readCurve(options.measured);
    const Curve target = options.target == "flat" ? Curve() : readCurve(options.target);
    files.deliver(resultOf(options, fitEqualiser(measured, target, options.fit)));
}

}  // namespace

void addEqualiserVerb(CLI::App &measure, int &) {
    auto options = std::make_shared<EqualiserOptions>();
    CLI::App *verb = measure.add_subcommand("equaliser", "Fit a 10-band equaliser, so that a measured curve comes to a target");
    verb->add_option("--fit", options->measured,
                     "The measured curve as CSV, as vx measure spectrum --csv writes it; - for standard input")
        ->required()
        ->type_name("FILE");
    verb->add_option("--target", options->target, "The curve to come to, as CSV, or flat")
        ->capture_default_str()
        ->type_name("FILE");
    verb->add_flag("--free", options->fit.free, "Frequencies and widths move, too; without it the sample engine's ten sliders do");
    verb->add_option("--from", options->fit.lowestHz, "Lowest frequency of the fit in Hz")
        ->check(CLI::Range(5.0, 100000.0))
        ->capture_default_str()
        ->type_name("HZ");
    verb->add_option("--to", options->fit.highestHz, "Highest frequency of the fit in Hz")
        ->check(CLI::Range(5.0, 100000.0))
        ->capture_default_str()
        ->type_name("HZ");
    verb->add_option("--rate", options->fit.sampleRate, "Sample rate at which the equaliser will run, in Hz")
        ->check(CLI::Range(8000.0, 768000.0))
        ->capture_default_str()
        ->type_name("HZ");
    addResults(*verb, *options);
    verb->footer(
        std::string("The CSV has a column centre_hz, hz, freq or frequency and one of response_db, level_db, db or spl; without a\n"
                    "head, the first two columns.\nDefinition: ") +
        kDefinition +
        ".\nExamples:\n"
        "  vx measure spectrum --plant band=80-16000 --csv speaker.csv\n"
        "  vx measure equaliser --fit speaker.csv --from 50 --to 16000 --plot fit.svg");
    verb->callback([options] { runEqualiser(*options); });
}

}  // namespace vx
