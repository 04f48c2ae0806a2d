// SPDX-License-Identifier: MIT
//
// vx measure spectrum: levels in fractional octaves at one of the library's three analysers, and beside them the response of the
// chain, which is what the capture side hears over what the host plays.
#include <cmath>
#include <iostream>
#include <limits>

#include "tools/vx/layout.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/live_bars.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/result.h"
#include "tools/vx_measure/spectrum_reader.h"
#include "tools/vx_measure/test_signal.h"

namespace vx {

namespace {

constexpr double kNothing = std::numeric_limits<double>::quiet_NaN();
constexpr double kSettlingSeconds = 1.1;  // the longest delay of a simulated chain, and its filters
constexpr double kLiveSeconds = 0.1;
constexpr int kLiveFftSize = 16384;

struct SpectrumOptions : MeasureOptions {
    SpectrumSettings spectrum;
    TestSignal signal;
    double seconds = 10.0;
    bool live = false;
};

struct Measured {
    std::vector<SpectrumBand> bands;
    std::vector<double> responseDb;  // empty if what plays is not known
    int readouts = 0;
};

// The response needs what played at the same time, on one channel: the input analyser hears the mean of all.
bool hasResponse(const SpectrumOptions &options, const Rig &rig) {
    return options.spectrum.tap == "record" && rig.isSimulated() && rig.channels() == 1;
}

Measured measure(const SpectrumOptions &options, Rig &rig, bool silent) {
    SpectrumReader reader(rig, options.spectrum, analyserOf(options.spectrum.tap));
    std::unique_ptr<SpectrumReader> played;
    if (hasResponse(options, rig)) played = std::make_unique<SpectrumReader>(rig, options.spectrum, analyserOf("input"));
    // Of files every second counts; a test signal has to come through the chain first.
    const double settling = rig.isSimulated() && options.signal.input.empty() ? kSettlingSeconds : 0.0;
    const double end = settling + options.seconds;
    Progress progress("spectrum", static_cast<uint64_t>(end * rig.rate()), silent);
    uint64_t next = reader.hop();
    bool settled = settling == 0.0;
    while (rig.seconds() < end && rig.step()) {
        progress.update(rig.frames());
        if (rig.frames() < next) continue;
        if (settled) {
            reader.read();
            if (played) played->read();
        } else {
            reader.skip();  // else the library's ring would be full, and what comes would be lost
            if (played) played->skip();
            settled = rig.seconds() >= settling;
        }
        next = rig.frames() + reader.hop();
    }
    Measured measured = {reader.bands(), {}, reader.readouts()};
    if (!played) return measured;
    const std::vector<SpectrumBand> source = played->bands();
    for (size_t i = 0; i < source.size(); ++i) {
        const double difference = measured.bands[i].levelDb - source[i].levelDb;
        measured.responseDb.push_back(std::isfinite(difference) ? difference : kNothing);
    }
    return measured;
}

bool anyMeasured(const Measured &measured) {
    for (const SpectrumBand &band : measured.bands)
        if (band.why.empty()) return true;
    return false;
}

std::string levelText(const SpectrumBand &band) {
    return std::isinf(band.levelDb) ? "silent" : textf("%.2f", band.levelDb);
}

std::string tableText(const Measured &measured, const Style &style) {
    const bool response = !measured.responseDb.empty();
    std::string text = style.bold(textf("%10s  %11s%s", "band", "level in dB", response ? "  response in dB" : "")) + "\n";
    for (size_t i = 0; i < measured.bands.size(); ++i) {
        const SpectrumBand &band = measured.bands[i];
        text += textf("%10s  ", frequencyText(band.centreHz).c_str());
        if (!band.why.empty())
            text += style.warning("not measurable: " + band.why);
        else
            text += textf("%11s", levelText(band).c_str()) +
                    (response && !std::isnan(measured.responseDb[i]) ? textf("  %+14.2f", measured.responseDb[i]) : "");
        text += "\n";
    }
    return text;
}

std::string plotOf(const SpectrumOptions &options, const Measured &measured, const std::string &definition) {
    double highest = -200.0, lowest = 100.0, first = 0.0, last = 0.0;
    for (const SpectrumBand &band : measured.bands) {
        if (!std::isfinite(band.levelDb)) continue;
        highest = std::max(highest, band.levelDb);
        lowest = std::min(lowest, band.levelDb);
        if (first == 0.0) first = band.lowestHz;
        last = band.highestHz;
    }
    if (first == 0.0) return "set title \"nothing was measurable\"\nset xrange [20:20000]\nset yrange [-100:0]\nplot 1/0 notitle\n";
    const double top = 10.0 * std::ceil((highest + 3.0) / 10.0);
    const double bottom = std::max(10.0 * std::floor((lowest - 10.0) / 10.0), top - 120.0);
    return titleCommands("Spectrum of " + options.signal.text() + " at the " + options.spectrum.tap + " tap", definition,
                         options.chainText()) +
           frequencyAxis(first, last) +
           textf("set yrange [%g:%g]\nset ylabel \"dB\"\nset style fill solid 0.8 border rgb '#ffffff'\nunset key\n", bottom, top) +
           textf("plot $data using 1:(($4>%g?$4:%g)):2:3:(%g):(($4>%g?$4:%g)) with boxxyerror lc rgb '#1f6fb4'\n", bottom, bottom,
                 bottom, bottom, bottom);
}

Result resultOf(const SpectrumOptions &options, const Rig &rig, const Measured &measured) {
    const std::string definition = spectrumDefinition(options.spectrum, rig.rate());
    const bool response = !measured.responseDb.empty();
    const std::string readouts = textf("mean of %d readouts without overlap", measured.readouts);
    Result result;
    result.text = "signal   " + (options.recorded.empty() ? options.signal.text() : "recorded") + textf(", %d Hz\n", rig.rate()) +
                  "tap      " + options.spectrum.tap + ", " + readouts + "\nchain    " + options.chainText() + "\n\n" +
                  tableText(measured, Style(options.common.colour, stdout)) + "\nDefinition: " + definition + ".\n" +
                  (response ? "Response: the level at the record tap over that at the input tap.\n" : "");
    result.json = {{"measurement", "spectrum"}, {"definition", definition + "; " + readouts}};
    result.json.update({{"signal", options.signal.text()},
                        {"chain", options.chainText()},
                        {"tap", options.spectrum.tap},
                        {"sampleRate", rig.rate()},
                        {"bandsPerOctave", options.spectrum.bandsPerOctave},
                        {"fftSize", fftSizeOf(options.spectrum, rig.rate())},
                        {"readouts", measured.readouts}});
    result.table.columns = {"centre_hz", "low_hz", "high_hz", "level_db"};
    if (response) result.table.columns.push_back("response_db");
    for (size_t i = 0; i < measured.bands.size(); ++i) {
        const SpectrumBand &band = measured.bands[i];
        nlohmann::ordered_json row = {{"centreHz", band.centreHz},
                                      {"lowHz", band.lowestHz},
                                      {"highHz", band.highestHz},
                                      {"levelDb", numberOrNull(band.levelDb)}};
        if (response) row["responseDb"] = numberOrNull(measured.responseDb[i]);
        row["state"] = !band.why.empty() ? "not measurable" : std::isinf(band.levelDb) ? "silent" : "measured";
        if (!band.why.empty()) row["why"] = band.why;
        result.json["bands"].push_back(row);
        const double level = std::isfinite(band.levelDb) ? band.levelDb : kNothing;
        result.table.rows.push_back({band.centreHz, band.lowestHz, band.highestHz, level});
        if (response) result.table.rows.back().push_back(measured.responseDb[i]);
    }
    result.plotCommands = plotOf(options, measured, definition);
    return result;
}

void runLive(const SpectrumOptions &options, Rig &rig) {
    SpectrumSettings settings = options.spectrum;
    if (settings.fftSize == 0) settings.fftSize = std::min(kLiveFftSize, fftSizeOf(settings, rig.rate()));
    SpectrumReader reader(rig, settings, analyserOf(settings.tap));
    LiveBars bars(options.common.colour);
    double next = static_cast<double>(reader.hop()) / rig.rate();
    while (next <= options.seconds && rig.stepUntil(next)) {
        reader.forget();
        reader.read();
        bars.show(reader.bands(), rig.seconds());
        next += kLiveSeconds;
    }
}

void checkSpectrumOptions(const SpectrumOptions &options) {
    const auto fail = [](const std::string &what) { throw Failure(ExitStatus::usage, what); };
    checkMeasureOptions(options);
    if (options.live && (options.common.json || options.common.quiet || !options.csv.empty() || !options.plots.empty()))
        fail("--live draws bars and has no other result; leave --json, -q, --csv and --plot away");
    if (options.live && options.onlyPlays()) fail("--live has nothing to hear with --play alone");
    if (!options.recorded.empty() && options.spectrum.tap != "record")
        fail("--recorded is heard at the record tap; --tap " + options.spectrum.tap + " hears what the host plays");
    if (options.seconds <= 0.0) fail("--seconds must be more than 0");
}

void runSpectrum(const SpectrumOptions &options, int &exitStatus) {
    checkSpectrumOptions(options);
    ResultFiles files(options);
    Rig rig(options, 0, options.signal.input);
    fftSizeOf(options.spectrum, rig.rate());
    switchOn(rig, options.signal);
    if (options.live) {
        runLive(options, rig);
        return rig.commit();
    }
    if (options.onlyPlays()) {
        rig.stepUntil(options.seconds);
        rig.commit();
        return tellPlayed(options, rig.seconds());
    }
    const Measured measured = measure(options, rig, options.common.quiet || options.common.json);
    rig.commit();
    files.deliver(resultOf(options, rig, measured));
    if (anyMeasured(measured)) return;
    std::cerr << "vx: nothing was measurable: one transform takes " << fftSizeOf(options.spectrum, rig.rate()) / 2
              << " samples; measure longer or take a smaller --fft\n";
    exitStatus = static_cast<int>(ExitStatus::found);
}

}  // namespace

void addSpectrumVerb(CLI::App &measure, int &exitStatus) {
    auto options = std::make_shared<SpectrumOptions>();
    CLI::App *verb = measure.add_subcommand("spectrum", "Spectrum in fractional octaves, and the response of a chain");
    addTestSignal(*verb, options->signal);
    const char *group = "Analyser";
    verb->add_option("--tap", options->spectrum.tap, "Where to listen: input (ahead of the engine), output (behind it), record")
        ->check(CLI::IsMember({"input", "output", "record"}))
        ->capture_default_str()
        ->type_name("TAP")
        ->group(group);
    verb->add_option("--listen", options->spectrum.listen, "Channel 0, 1 or the mean; the input tap always hears the mean")
        ->check(CLI::IsMember({"0", "1", "mean"}))
        ->capture_default_str()
        ->type_name("WHAT")
        ->group(group);
    verb->add_option("--bands", options->spectrum.bandsPerOctave, "Bands an octave: 1, 3, 6, 12, 24 or 48")
        ->check(CLI::IsMember({1, 3, 6, 12, 24, 48}))
        ->capture_default_str()
        ->type_name("N")
        ->group(group);
    verb->add_option("--fft", options->spectrum.fftSize, "Transform size, a power of two; the window covers half of it")
        ->type_name("N")
        ->group(group);
    verb->add_flag("--centres", options->spectrum.atCentres, "Power per Hz at the bands' centres instead of the bands' power")
        ->group(group);
    verb->add_option("--seconds", options->seconds, "How long to measure")
        ->check(CLI::Range(0.0, 86400.0))
        ->capture_default_str()
        ->type_name("S")
        ->group(group);
    verb->add_flag("--live", options->live, "Bars in the terminal, as the sound plays")->group(group);
    addEngineAndFormat(*verb, *options);
    addChain(*verb, *options);
    addResults(*verb, *options);
    verb->footer("Parts of --plant, separated by commas:\n" + plantParts() +
                 "\nDefinition: mean power of readouts without overlap in fractional octaves, Hamming window; 0 dB is a sine at "
                 "full scale. The\n"
                 "response is the level at the record tap over that at the input tap; simulated chains of one channel have it.\n"
                 "Exit status: 0 measured; 1 nothing could be measured.\n"
                 "Examples:\n"
                 "  vx measure spectrum --plant band=80-16000 --csv response.csv --plot response.svg\n"
                 "  vx measure spectrum --input music.wav --layout stereo --tap output --set bass=1 --live --seconds 30");
    verb->callback([options, &exitStatus] { runSpectrum(*options, exitStatus); });
}

}  // namespace vx
