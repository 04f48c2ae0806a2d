// SPDX-License-Identifier: MIT
//
// vx measure levels: the peaks at the library's three meters. vx measure load: the share of real time that its two block functions
// take, as the library reckons it.
#include <VXDSPAPI.h>

#include <algorithm>
#include <cmath>
#include <limits>

#include "tools/vx/layout.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/data_bytes.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/result.h"
#include "tools/vx_measure/test_signal.h"

namespace vx {

namespace {

constexpr const char *kLevelDefinition =
    "peak: largest magnitude of each channel over the whole length, 0 dB = 1.0; record: at most four channels";
constexpr const char *kLoadDefinition =
    "time in the block function over the time that its frames last at the output's sample rate; readings of a quarter of a "
    "second";
constexpr double kReadingSeconds = 0.26;  // the library reckons anew after a quarter

struct MeterOptions : MeasureOptions {
    TestSignal signal;
    double seconds = 2.0;
};

struct MeterRow {
    std::string name;  // "input 0"
    double peak;
};

struct Meter {
    const char *name;
    int32_t command;
};
constexpr Meter kMeters[] = {
    {"input", VXDSP_DATA_METER_INPUT}, {"output", VXDSP_DATA_METER_OUTPUT}, {"record", VXDSP_DATA_METER_RECORD}};

std::vector<MeterRow> readMeters(Rig &rig) {
    std::vector<MeterRow> rows;
    for (const Meter &meter : kMeters) {
        DataReader answer(rig.command(meter.command));
        const int32_t channels = answer.i32();
        for (int32_t channel = 0; channel < channels; ++channel)
            rows.push_back({textf("%s %d", meter.name, channel), static_cast<double>(answer.f32())});
    }
    return rows;
}

// The library's meters begin at 1e-6: what is no higher cannot be told from nothing.
bool isSilent(double peak) {
    return peak <= static_cast<double>(1e-6F);
}

double decibels(double linear) {
    return !isSilent(linear) ? 20.0 * std::log10(linear) : std::numeric_limits<double>::quiet_NaN();
}

std::string barPlot(const std::string &yLabel, double bottom, double top, size_t rows, const char *column, const char *format) {
    return textf("set yrange [%.9g:%.9g]\nset xrange [-0.7:%.1f]\nset ylabel \"%s\"\nunset key\n", bottom, top,
                 static_cast<double>(rows) - 0.3, yLabel.c_str()) +
           "set style fill solid 0.8 noborder\n" +
           textf(
               "set xtics noenhanced\nplot $data using 0:%s:($0-0.3):($0+0.3):(%.9g):%s:xtic(1) with boxxyerror lc rgb '#1f6fb4', ",
               column, bottom, column) +
           textf("$data using 0:%s:(sprintf('%s',%s)) with labels offset 0,0.7\n", column, format, column);
}

void runLevels(const MeterOptions &options) {
    checkMeasureOptions(options);
    ResultFiles files(options);
    Rig rig(options, 0, options.signal.input);
    switchOn(rig, options.signal);
    rig.stepUntil(options.seconds);
    rig.commit();
    if (options.onlyPlays()) return tellPlayed(options, rig.seconds());
    const std::vector<MeterRow> rows = readMeters(rig);
    const Style style(options.common.colour, stdout);
    Result result;
    result.text = "signal   " + options.signal.text() + textf(", %.2f s, %d Hz\n", rig.seconds(), rig.rate()) + "chain    " +
                  options.chainText() + "\n\n" + style.bold(textf("%-10s  %12s  %9s", "meter", "peak in dB", "linear")) + "\n";
    result.json = {{"measurement", "levels"},
                   {"definition", kLevelDefinition},
                   {"signal", options.signal.text()},
                   {"chain", options.chainText()},
                   {"sampleRate", rig.rate()},
                   {"seconds", rig.seconds()},
                   {"peaks", nlohmann::ordered_json::array()}};
    result.table.columns = {"meter", "peak", "peak_db"};
    double top = 0.0;
    for (const MeterRow &row : rows) {
        const std::string line = textf("%-10s  %12s  %9.6f", row.name.c_str(),
                                       !isSilent(row.peak) ? textf("%.2f", decibels(row.peak)).c_str() : "silent", row.peak);
        result.text += (row.peak > 1.0 ? style.warning(line + "  above full scale") : line) + "\n";
        result.json["peaks"].push_back(
            {{"meter", row.name}, {"peak", numberOrNull(row.peak)}, {"peakDb", numberOrNull(decibels(row.peak))}});
        result.table.labels.push_back(row.name);
        result.table.rows.push_back({row.peak, decibels(row.peak)});
        if (!isSilent(row.peak)) top = std::max(top, decibels(row.peak));
    }
    result.text += std::string("\nDefinition: ") + kLevelDefinition + ".\n";
    constexpr double kBottomDb = -90.0;
    result.plotCommands = titleCommands("Peak levels of " + options.signal.text(), kLevelDefinition, options.chainText()) +
                          barPlot("dB", kBottomDb, 10.0 * std::ceil((top + 5.0) / 10.0), rows.size(), "($3>-90?$3:-90)", "%.1f dB");
    files.deliver(result);
}

struct Readings {
    const char *name;
    int32_t command;
    std::vector<double> percent = {};

    double median() const {
        std::vector<double> sorted = percent;
        std::nth_element(sorted.begin(), sorted.begin() + static_cast<std::ptrdiff_t>(sorted.size() / 2), sorted.end());
        return sorted[sorted.size() / 2];
    }
    double lowest() const { return *std::min_element(percent.begin(), percent.end()); }
    double highest() const { return *std::max_element(percent.begin(), percent.end()); }
};

void runLoad(const MeterOptions &options, int &exitStatus) {
    checkMeasureOptions(options);
    if (options.onlyPlays()) throw Failure(ExitStatus::usage, "--play alone measures nothing; add --plant or --recorded");
    ResultFiles files(options);
    Rig rig(options, 0, options.signal.input);
    switchOn(rig, options.signal);
    // As heavy as measuring gets: all three analysers listen.
    for (uint32_t analyser = 0; analyser < 3; ++analyser)
        rig.command(VXDSP_DATA_RTA_ENABLE, DataWriter().u8(analyser).u8(1).bytes());
    Readings functions[] = {{"VXDSPAPI_Process", VXDSP_DATA_LOAD_PROCESS}, {"VXDSPAPI_Record", VXDSP_DATA_LOAD_RECORD}};
    while (rig.seconds() + kReadingSeconds <= options.seconds && rig.stepUntil(rig.seconds() + kReadingSeconds))
        for (Readings &function : functions)
            function.percent.push_back(static_cast<double>(DataReader(rig.command(function.command)).f32()));
    rig.commit();
    const bool measured = !functions[0].percent.empty();
    const Style style(options.common.colour, stdout);
    Result result;
    result.text = "signal   " + options.signal.text() +
                  textf(", %.2f s, %d Hz, blocks of %d frames, three analysers on\n", rig.seconds(), rig.rate(), options.block) +
                  "engine   " + rig.engineFile() + "\n\n" +
                  style.bold(textf("%-18s  %9s  %9s  %9s  %8s", "percent of", "median", "lowest", "highest", "readings")) + "\n";
    result.json = {{"measurement", "load"},
                   {"definition", kLoadDefinition},
                   {"signal", options.signal.text()},
                   {"sampleRate", rig.rate()},
                   {"blockFrames", options.block},
                   {"engine", rig.engineFile()},
                   {"functions", nlohmann::ordered_json::array()}};
    result.table.columns = {"function", "median_percent", "lowest_percent", "highest_percent", "readings"};
    double top = 0.0;
    for (const Readings &function : functions) {
        if (!measured) {
            result.text +=
                textf("%-18s  ", function.name) +
                style.warning("not measurable: the library reckons the load of a quarter of a second, and less was played") + "\n";
            result.json["functions"].push_back(
                {{"function", function.name}, {"state", "not measurable"}, {"why", "less than a quarter of a second was played"}});
            continue;
        }
        result.text += textf("%-18s  %9.4f  %9.4f  %9.4f  %8zu\n", function.name, function.median(), function.lowest(),
                             function.highest(), function.percent.size());
        result.json["functions"].push_back({{"function", function.name},
                                            {"state", "measured"},
                                            {"medianPercent", function.median()},
                                            {"lowestPercent", function.lowest()},
                                            {"highestPercent", function.highest()},
                                            {"readings", function.percent.size()}});
        result.table.labels.push_back(function.name);
        result.table.rows.push_back(
            {function.median(), function.lowest(), function.highest(), static_cast<double>(function.percent.size())});
        top = std::max(top, function.median());
    }
    result.text += std::string("\nDefinition: ") + kLoadDefinition + ".\n";
    result.plotCommands =
        titleCommands("Load", kLoadDefinition, options.chainText()) +
        barPlot("percent of real time, median", 0.0, std::max(1.25 * top, 1e-3), result.table.rows.size(), "($2)", "%.3f %%");
    if (!measured) exitStatus = static_cast<int>(ExitStatus::found);
    files.deliver(result);
}

void addCommon(CLI::App &verb, MeterOptions &options) {
    addTestSignal(verb, options.signal);
    verb.add_option("--seconds", options.seconds, "How long to measure")
        ->check(CLI::Range(0.01, 86400.0))
        ->capture_default_str()
        ->type_name("S")
        ->group("Signal");
    addEngineAndFormat(verb, options);
    addChain(verb, options);
    addResults(verb, options);
}

}  // namespace

void addMeterVerb(CLI::App &measure, int &) {
    auto options = std::make_shared<MeterOptions>();
    CLI::App *verb = measure.add_subcommand("levels", "Peak levels ahead of the engine, behind it and on the capture side");
    addCommon(*verb, *options);
    verb->footer("Parts of --plant, separated by commas:\n" + plantParts() + "\nDefinition: " + kLevelDefinition +
                 ".\nExample: vx measure levels --layout stereo --signal sine --plant gain=-6dB --plot levels.png");
    verb->callback([options] { runLevels(*options); });
}

void addLoadVerb(CLI::App &measure, int &exitStatus) {
    auto options = std::make_shared<MeterOptions>();
    CLI::App *verb = measure.add_subcommand("load", "Share of real time that the library's block functions take");
    addCommon(*verb, *options);
    verb->footer(std::string("Definition: ") + kLoadDefinition +
                 ".\nExit status: 0 measured; 1 nothing could be measured.\n"
                 "Example: vx measure load --layout 7.1 --block 512 --seconds 10 --json");
    verb->callback([options, &exitStatus] { runLoad(*options, exitStatus); });
}

}  // namespace vx
