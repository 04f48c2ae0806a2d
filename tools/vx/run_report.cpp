// SPDX-License-Identifier: MIT
#include "tools/vx/run_report.h"

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>

#include "tools/vx/layout.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

struct LoadFigure {
    const char *name;
    double nanoseconds;
};

std::vector<LoadFigure> loadFigures(const LoadStatistics &load) {
    return {{"mean", load.meanNs()},
            {"p50", load.percentileNs(0.5)},
            {"p99", load.percentileNs(0.99)},
            {"p99.9", load.percentileNs(0.999)},
            {"max", load.maximumNs()}};
}

double audioSeconds(const RunReport &report) {
    return static_cast<double>(report.frames) / report.file.sampleRate;
}

double realTimeFactor(const RunReport &report) {
    return audioSeconds(report) * 1e9 / std::max(report.load.totalNs(), 1.0);
}

std::string hexText(const std::vector<uint8_t> &bytes) {
    std::string text;
    for (const uint8_t byte : bytes) text += textf("%02x", byte);
    return text;
}

std::string levelRows(const char *side, uint32_t mask, const std::vector<ChannelLevel> &levels, const Style &style) {
    std::string rows;
    for (size_t channel = 0; channel < levels.size(); ++channel) {
        const ChannelLevel &level = levels[channel];
        const std::string clipped = textf("%10llu", static_cast<unsigned long long>(level.clipped));
        rows += textf("  %-6s %-4s %12s  ", side, speakerName(mask, static_cast<int>(channel)).c_str(),
                      decibelText(static_cast<double>(level.peak)).c_str()) +
                (level.clipped > 0 ? style.warning(clipped) : clipped);
        if (level.notANumber > 0)
            rows +=
                style.warning(textf("  and %llu samples that are no numbers", static_cast<unsigned long long>(level.notANumber)));
        rows += "\n";
    }
    return rows;
}

nlohmann::ordered_json levelJson(uint32_t mask, const std::vector<ChannelLevel> &levels) {
    auto json = nlohmann::ordered_json::array();
    for (size_t channel = 0; channel < levels.size(); ++channel)
        json.push_back({{"speaker", speakerName(mask, static_cast<int>(channel))},
                        {"peak", levels[channel].peak},
                        {"clipped", levels[channel].clipped},
                        {"notANumber", levels[channel].notANumber}});
    return json;
}

nlohmann::ordered_json numberOrNull(const std::optional<double> &number) {
    return number ? nlohmann::ordered_json(*number) : nlohmann::ordered_json();
}

nlohmann::ordered_json layoutJson(uint32_t mask) {
    return {{"layout", layoutName(mask)}, {"mask", mask}, {"channels", channelCount(mask)}};
}

}  // namespace

std::string changeText(const FollowedChange &change) {
    std::string text = change.text + "  by " + change.writer;
    if (change.takenMs) text += textf("; %.2f ms from the write to the engine", *change.takenMs);
    if (change.heardMs) text += textf(", %.2f ms to the first block with it", *change.heardMs);
    return text;
}

std::string digestText(uint64_t digest) {
    return textf("%016llx", static_cast<unsigned long long>(digest));
}

std::string runText(const RunOptions &options, const RunReport &report, const Style &style) {
    const std::string platform = options.platform.value_or("none");
    std::string text = style.bold(options.input == "-" ? "standard input" : options.input) +
                       textf(": %s, %d Hz, %s, %.2f s\n", layoutText(report.fileMask).c_str(), report.file.sampleRate,
                             report.file.encoding.c_str(), audioSeconds(report));
    text += "engine   " + report.engineFile + textf(", platform %s, host type %d\n", platform.c_str(), options.hostType);
    text += "format   " + layoutText(report.inputMask) + " to " + layoutText(report.outputMask) +
            textf(", blocks of %d frames\n", options.block);
    for (const ParameterAnswer &answer : report.parameters) {
        text += "sent     " + answer.write.text;
        if (!answer.write.isInputGain)
            text += textf("  (component %d, parameter %d)", answer.write.componentId, answer.write.paramId);
        if (answer.result == 0) text += style.warning("  answered with 0: the engine may not have taken it");
        text += "\n";
    }
    for (const FollowedChange &change : report.changes) text += textf("%8.3f s ", change.seconds) + changeText(change) + "\n";
    text += "\n" + style.bold("levels           peak, 0 dB = 1.0   above 1.0") + "\n";
    text += levelRows("in", report.fileMask, report.inputLevels, style);
    text += levelRows("out", report.outputMask, report.outputLevels, style);
    text += textf("  silence called by the library: %.2f s\n\n", static_cast<double>(report.silentFrames) / report.file.sampleRate);
    text += style.bold(textf("load     %llu blocks of %.3f ms", static_cast<unsigned long long>(report.load.blocks()),
                             report.blockNs(options.block) / 1e6)) +
            "\n";
    for (const LoadFigure &figure : loadFigures(report.load))
        text += textf("  %-6s %10.2f us  %8.3f %%\n", figure.name, figure.nanoseconds / 1000.0,
                      100.0 * figure.nanoseconds / report.blockNs(options.block));
    text += textf("  %.0f times faster than real time inside the block, %.0f times with reading and writing\n",
                  realTimeFactor(report), audioSeconds(report) / std::max(report.wallSeconds, 1e-9));
    if (options.digest) text += "\ndigest   " + digestText(report.digest) + "\n";
    return text;
}

std::string runJson(const RunOptions &options, const RunReport &report, const std::vector<std::string> &files) {
    nlohmann::ordered_json json;
    json["input"] = {{"file", options.input}, {"encoding", report.file.encoding}, {"sampleRate", report.file.sampleRate}};
    json["input"].update(layoutJson(report.fileMask));
    json["engine"] = {{"file", report.engineFile},
                      {"platform", options.platform ? nlohmann::ordered_json(*options.platform) : nlohmann::ordered_json()},
                      {"hostType", options.hostType}};
    json["format"] = {{"in", layoutJson(report.inputMask)}, {"out", layoutJson(report.outputMask)}, {"blockFrames", options.block}};
    json["parameters"] = nlohmann::ordered_json::array();
    for (const ParameterAnswer &answer : report.parameters) {
        nlohmann::ordered_json sent = {{"text", answer.write.text}, {"data", hexText(answer.write.data)}};
        if (!answer.write.isInputGain)
            sent.update({{"component", answer.write.componentId},
                         {"id", answer.write.paramId},
                         {"channel", answer.write.channel},
                         {"answer", answer.result}});
        json["parameters"].push_back(sent);
    }
    if (!options.follow.empty()) {
        json["followed"] = {
            {"definition",
             "seconds: of audio, at the first block that carried the change; takenMs: from the write until the engine had "
             "it; heardMs: from the write until that block was ready"},
            {"changes", nlohmann::ordered_json::array()}};
        for (const FollowedChange &change : report.changes)
            json["followed"]["changes"].push_back({{"seconds", change.seconds},
                                                   {"name", change.name},
                                                   {"text", change.text},
                                                   {"writer", change.writer},
                                                   {"takenMs", numberOrNull(change.takenMs)},
                                                   {"heardMs", numberOrNull(change.heardMs)}});
    }
    json["frames"] = report.frames;
    json["seconds"] = audioSeconds(report);
    json["levels"] = {{"definition", "peak: largest magnitude, linear, full scale 1.0; clipped: samples of a magnitude above 1.0"},
                      {"in", levelJson(report.fileMask, report.inputLevels)},
                      {"out", levelJson(report.outputMask, report.outputLevels)}};
    json["silentSeconds"] = static_cast<double>(report.silentFrames) / report.file.sampleRate;
    json["load"] = {{"definition", "time in VXDSPAPI_Process, a block; percent of the block's duration; percentiles to 0.4 %"},
                    {"blocks", report.load.blocks()},
                    {"blockSeconds", report.blockNs(options.block) / 1e9}};
    for (const LoadFigure &figure : loadFigures(report.load))
        json["load"][figure.name] = {{"us", figure.nanoseconds / 1000.0},
                                     {"percent", 100.0 * figure.nanoseconds / report.blockNs(options.block)}};
    json["realTimeFactor"] = {{"block", realTimeFactor(report)},
                              {"whole", audioSeconds(report) / std::max(report.wallSeconds, 1e-9)}};
    json["digest"] = digestText(report.digest);
    json["files"] = files;
    return json.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) + "\n";
}

Table loadTable(const RunOptions &options, const RunReport &report) {
    Table table;
    table.columns = {"from_us", "to_us", "blocks", "from_percent", "to_percent"};
    const double block = report.blockNs(options.block);
    for (const LoadBar &bar : report.load.histogram(8))
        table.rows.push_back({bar.lowestNs / 1000.0, bar.highestNs / 1000.0, static_cast<double>(bar.blocks),
                              100.0 * bar.lowestNs / block, 100.0 * bar.highestNs / block});
    return table;
}

std::string loadPlotCommands(const RunOptions &options, const RunReport &report) {
    const double block = report.blockNs(options.block);
    const auto bars = report.load.histogram(8);
    double most = 1.0;
    for (const LoadBar &bar : bars) most = std::max(most, static_cast<double>(bar.blocks));
    const double lowest = bars.front().lowestNs / 1000.0 / 1.6;
    // Room for a label at the right: a quarter of the axis, which is logarithmic.
    const double last = bars.back().highestNs / 1000.0;
    const double highest = last * std::max(4.0, std::cbrt(last / lowest));
    const double top = most * 5.0;
    std::string text = textf("set title \"Load of %llu blocks of %d frames (%.3f ms) in %s\" noenhanced\n",
                             static_cast<unsigned long long>(report.load.blocks()), options.block, block / 1e6,
                             gnuplotText(report.engineFile).c_str());
    text += textf("set logscale x 10\nset logscale x2 10\nset xrange [%.9g:%.9g]\nset x2range [%.9g:%.9g]\n", lowest, highest,
                  lowest * 1e5 / block, highest * 1e5 / block);
    text +=
        "set xlabel \"microseconds in VXDSPAPI_Process\" noenhanced\nset x2label \"percent of the block's duration\"\nset x2tics "
        "nomirror\n";
    // Ticks at 1-2-5, over every decade that can occur; at 1 alone where many decades leave no room.
    const std::vector<int> steps = highest / lowest < 1000.0 ? std::vector<int>{1, 2, 5} : std::vector<int>{1};
    for (const char *axis : {"x", "x2"}) {
        std::string tics;
        for (int decade = -6; decade <= 9; ++decade)
            for (const int step : steps) tics += textf("%s%g", tics.empty() ? "" : ",", step * std::pow(10.0, decade));
        text += std::string("set ") + axis + "tics (" + tics + ")\n";
    }
    text += textf("set ylabel \"blocks\"\nset logscale y 10\nset yrange [0.7:%.9g]\nset style fill solid 0.8 noborder\nunset key\n",
                  top);
    double height = top / 1.3;
    for (const LoadFigure &figure : loadFigures(report.load)) {
        if (figure.name == std::string("mean")) continue;
        const double us = figure.nanoseconds / 1000.0;
        text += textf("set arrow from %.9g,0.7 to %.9g,%.9g nohead lw 1.5 dt 2 lc rgb '#c0392b' front\n", us, us, height);
        // Each line is shorter than the one to its left, so that no label is crossed.
        text += textf("set label \" %s %.4g us\" at %.9g,%.9g left tc rgb '#c0392b' front\n", figure.name, us, us, height);
        height /= most > 100.0 ? 1.9 : 1.4;
    }
    return text + "plot $data using (sqrt($1*$2)):3:1:2:(0.7):($3>0?$3:0.7) with boxxyerror lc rgb '#1f6fb4'\n";
}

}  // namespace vx
