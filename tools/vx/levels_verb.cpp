// SPDX-License-Identifier: MIT
//
// vx levels: the level of a recording per octave band, or what changed between two.
#include <cmath>
#include <iostream>
#include <limits>
#include <memory>
#include <nlohmann/json.hpp>
#include <numbers>

#include "tools/vx/audio_file.h"
#include "tools/vx/console.h"
#include "tools/vx/octave_bands.h"
#include "tools/vx/plot.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"

namespace vx {

namespace {

constexpr const char *kDefinition =
    "Mean power of all channels over the whole length, octave bands 1000 Hz * 2^n, Hann frames of 0.3 s or more at 75 % overlap; 0 "
    "dB is a sine at full scale.";
constexpr double kNoChangeDb = 0.01;  // rounding of the samples and of the transform
constexpr size_t kFramesAtOnce = 4096;

struct LevelsOptions {
    CommonOptions common;
    std::string first;
    std::string second;
    std::vector<std::string> plots;
    bool force = false;
};

struct Levels {
    std::string path;
    int channels = 0;
    int sampleRate = 0;
    uint64_t frames = 0;
    std::vector<double> decibels;
};

Levels measure(const std::string &path, bool silent) {
    const std::unique_ptr<AudioReader> reader = openAudioFile(path);
    Levels levels;
    levels.path = path;
    levels.channels = reader->format().channels;
    levels.sampleRate = reader->format().sampleRate;
    OctaveAnalyser analyser(levels.channels, levels.sampleRate);
    Progress progress("levels", reader->announcedFrames(), silent);
    std::vector<float> block(kFramesAtOnce * static_cast<size_t>(levels.channels));
    while (const size_t got = reader->read(block.data(), kFramesAtOnce)) {
        analyser.feed(block.data(), got);
        levels.frames += got;
        progress.update(levels.frames);
    }
    if (levels.frames == 0) throw Failure(ExitStatus::input, path + ": holds no audio; nothing to measure");
    levels.decibels = analyser.finish();
    return levels;
}

std::string levelText(double decibels) {
    if (std::isnan(decibels)) return "not measurable";
    return std::isinf(decibels) ? "silent" : textf("%.1f", decibels);
}

// NaN where one side is silent or not measurable.
double changeOf(const Levels &before, const Levels &after, size_t band) {
    const double change = after.decibels[band] - before.decibels[band];
    if (!std::isfinite(change)) return std::numeric_limits<double>::quiet_NaN();
    return std::fabs(change) < kNoChangeDb ? 0.0 : change;
}

void printText(const Levels &before, const Levels *after, const Style &style) {
    const auto what = [](const Levels &levels) {
        return textf("%s: %d channel%s, %d Hz, %.2f s\n", levels.path.c_str(), levels.channels, levels.channels == 1 ? "" : "s",
                     levels.sampleRate, static_cast<double>(levels.frames) / levels.sampleRate);
    };
    std::string text = (after == nullptr ? "" : "before  ") + what(before);
    if (after != nullptr) text += "after   " + what(*after);
    text += style.bold(after == nullptr ? textf("%8s  %14s", "octave", "level in dB")
                                        : textf("%8s  %14s  %14s  %10s", "octave", "before in dB", "after in dB", "change"));
    text += "\n";
    for (size_t band = 0; band < before.decibels.size(); ++band) {
        text += textf("%5s Hz  %14s", kOctaveBand[band].name, levelText(before.decibels[band]).c_str());
        if (after != nullptr) {
            const double change = changeOf(before, *after, band);
            const std::string number = std::isnan(change) ? "" : textf("%+.1f", change);
            const std::string cell = textf("%10s", number.c_str());
            text += textf("  %14s  ", levelText(after->decibels[band]).c_str()) + (change >= 0.5    ? style.good(cell)
                                                                                   : change <= -0.5 ? style.warning(cell)
                                                                                                    : cell);
        }
        text += "\n";
    }
    text += std::string(kDefinition) + "\n";
    std::cout << text;
}

nlohmann::ordered_json numberOrNull(double value) {
    return std::isfinite(value) ? nlohmann::ordered_json(value) : nlohmann::ordered_json();
}

nlohmann::ordered_json toJson(const Levels &levels) {
    nlohmann::ordered_json json;
    json["file"] = levels.path;
    json["channels"] = levels.channels;
    json["sampleRate"] = levels.sampleRate;
    json["frames"] = levels.frames;
    for (size_t band = 0; band < levels.decibels.size(); ++band)
        json["bands"].push_back({{"octaveHz", kOctaveBand[band].middleHz},
                                 {"levelDb", numberOrNull(levels.decibels[band])},
                                 {"state", std::isnan(levels.decibels[band])   ? "not measurable"
                                           : std::isinf(levels.decibels[band]) ? "silent"
                                                                               : "measured"}});
    return json;
}

void printJson(const Levels &before, const Levels *after) {
    nlohmann::ordered_json json;
    json["definition"] = kDefinition;
    json["before"] = toJson(before);
    if (after != nullptr) {
        json["after"] = toJson(*after);
        for (size_t band = 0; band < before.decibels.size(); ++band)
            json["changeDb"].push_back(numberOrNull(changeOf(before, *after, band)));
    }
    std::cout << json.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) << "\n";
}

Table tableOf(const Levels &before, const Levels *after) {
    Table table;
    table.columns = {"octave_hz", "before_db"};
    if (after != nullptr) table.columns.insert(table.columns.end(), {"after_db", "change_db"});
    const auto finite = [](double value) { return std::isfinite(value) ? value : std::numeric_limits<double>::quiet_NaN(); };
    for (size_t band = 0; band < before.decibels.size(); ++band) {
        table.rows.push_back({kOctaveBand[band].middleHz, finite(before.decibels[band])});
        if (after != nullptr)
            table.rows.back().insert(table.rows.back().end(), {finite(after->decibels[band]), changeOf(before, *after, band)});
    }
    return table;
}

std::string fileName(const std::string &path) {
    return path == "-" ? "standard input" : utf8Of(pathOf(path).filename());
}

// Ticks of the frequency axis, with or without their names.
std::string ticks(bool named) {
    std::string text;
    for (const OctaveBand &band : kOctaveBand)
        text += (text.empty() ? "" : ", ") + textf("\"%s\" %g", named ? band.name : "", band.middleHz);
    return "set xtics (" + text + ")\n";
}

std::string plotCommands(const Levels &before, const Levels *after) {
    const std::string axis =
        "set logscale x 2\nset xrange [22:23000]\nset title \"Level per octave band (0 dB: sine at full scale)\"\n";
    const std::string lines = "$data using 1:2 with linespoints lw 2 pt 7 ps 0.8 lc rgb '#888888' title \"" +
                              gnuplotText(fileName(before.path)) + "\" noenhanced";
    if (after == nullptr)
        return axis + ticks(true) + "set key top right\nset xlabel \"Hz\"\nset ylabel \"dB\"\nplot " + lines + "\n";
    return axis + "set multiplot\nset lmargin at screen 0.1\nset rmargin at screen 0.97\n" +
           // The upper panel: both levels.
           "set tmargin at screen 0.91\nset bmargin at screen 0.45\nset key bottom center maxrows 1\nset offsets 0,0,2,10\n" +
           "set ylabel \"dB\"\n" + ticks(false) + "plot " + lines +
           ", $data using 1:3 with linespoints lw 2 pt 5 ps 0.8 lc rgb '#1f6fb4' title \"" + gnuplotText(fileName(after->path)) +
           "\" noenhanced\n" +
           // The lower panel: the change, as bars of most of an octave.
           "unset title\nunset key\nset tmargin at screen 0.41\nset bmargin at screen 0.12\nset offsets 0,0,4,4\n" + ticks(true) +
           "set ylabel \"change in dB\"\nset xlabel \"Hz\" offset 0,0.3\nset xzeroaxis lt 1 lc rgb '#555555'\n" +
           "set style fill solid 0.8 noborder\nplot $data using 1:4:($1*0.45) with boxes lc rgb '#1f6fb4', " +
           // A number stands above a rise and below a fall.
           "$data using 1:($4>=0?$4:NaN):(sprintf('%+.1f',$4)) with labels font ',10' offset 0,0.7, " +
           "$data using 1:($4<0?$4:NaN):(sprintf('%+.1f',$4)) with labels font ',10' offset 0,-0.7\nunset multiplot\n";
}

void runLevels(const LevelsOptions &options) {
    std::unique_ptr<Plot> plot;
    if (!options.plots.empty()) plot = std::make_unique<Plot>(options.plots, options.force);
    const bool silent = options.common.quiet || options.common.json;
    const Levels before = measure(options.first, silent);
    std::unique_ptr<Levels> after;
    if (!options.second.empty()) after = std::make_unique<Levels>(measure(options.second, silent));
    std::vector<std::string> made;
    if (plot) made = plot->draw(tableOf(before, after.get()), plotCommands(before, after.get()));
    if (options.common.json) {
        printJson(before, after.get());
    } else if (!options.common.quiet) {
        printText(before, after.get(), Style(options.common.colour, stdout));
    }
    if (!silent)
        for (const std::string &file : made) std::cout << "wrote " << file << "\n";
}

}  // namespace

void addLevelsVerb(CLI::App &app, int &) {
    auto options = std::make_shared<LevelsOptions>();
    CLI::App *verb = app.add_subcommand("levels", "Level per octave band of a recording, or what changed between two");
    verb->add_option("FILE", options->first, "Recording; - for standard input")->required();
    verb->add_option("AFTER", options->second, "A second recording, to be compared with the first");
    verb->add_option("--plot", options->plots,
                     "Draw the levels into a .svg or .png, with the numbers as .csv beside it; may be repeated")
        ->allow_extra_args(false)

        ->type_name("FILE");
    verb->add_flag("--force", options->force, "Write over files that exist");
    addCommonOptions(*verb, options->common);
    verb->footer(std::string(kDefinition) + "\nExample: vx levels before.wav after.wav --plot change.svg");
    verb->callback([options] { runLevels(*options); });
}

}  // namespace vx
