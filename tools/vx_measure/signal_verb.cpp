// SPDX-License-Identifier: MIT
//
// vx signal: the library's test signals as sound files, as its host plays them.
#include <iostream>

#include "tools/vx/level_meter.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/rig.h"
#include "tools/vx_measure/sweep_options.h"
#include "tools/vx_measure/test_signal.h"

namespace vx {

namespace {

struct SignalOptions : MeasureOptions {
    std::string output;
    std::string bits;
    double seconds = 10.0;
    TestSignal signal;
    SweepSettings sweep;
};

SampleType typeFor(const SignalOptions &options) {
    std::optional<SampleType> asked;
    if (!options.bits.empty())
        asked = options.bits == "16" ? SampleType::pcm16 : options.bits == "24" ? SampleType::pcm24 : SampleType::float32;
    return sampleTypeFor(options.output, asked);
}

void runSignal(SignalOptions options) {
    const bool sweeps = options.signal.name == "sweep";
    if (options.seconds <= 0.0) throw Failure(ExitStatus::usage, "--seconds must be more than 0");
    // Nothing records: the capture side has a wire that nobody reads.
    Rig rig(options, sweeps ? options.sweep.channel : 0);
    if (sweeps) checkSweep(options.sweep, rig.rate());
    const double seconds = sweeps ? sweepSeconds(options.sweep) : options.seconds;
    const auto channels = static_cast<size_t>(rig.channels());
    const auto frames = static_cast<uint64_t>(seconds * rig.rate() + 0.5);
    AudioFormat format;
    format.channels = rig.channels();
    format.mask = rig.mask();
    format.sampleRate = rig.rate();
    const SampleType type = typeFor(options);
    OutputFile file(options.output, options.force);
    const auto writer = createAudioFile(file, format, type, frames);
    if (sweeps)
        startSweep(rig, options.sweep);
    else
        switchOn(rig, options.signal);
    LevelMeter meter(rig.channels());
    std::vector<float> block(static_cast<size_t>(options.block) * channels);
    for (uint64_t done = 0; done < frames;) {
        rig.step();
        const auto count = static_cast<size_t>(std::min<uint64_t>(frames - done, static_cast<uint64_t>(options.block)));
        for (size_t c = 0; c < channels; ++c)
            for (size_t i = 0; i < count; ++i) block[i * channels + c] = rig.played().slot(static_cast<int>(c))[i];
        meter.feed(block.data(), count);
        writer->write(block.data(), count);
        done += count;
    }
    writer->finish();
    file.commit();
    uint64_t clipped = 0;
    for (const ChannelLevel &level : meter.levels()) clipped += level.clipped;
    if (clipped > 0 && type != SampleType::float32)
        std::cerr << "vx: " << options.output << ": " << clipped
                  << " samples lie above full scale and were clipped; float samples (--bits 32f) hold them\n";
    if (options.common.quiet || options.output == "-") return;
    const std::string what =
        sweeps ? textf("sweep from %d Hz to %d Hz", options.sweep.startHz, options.sweep.stopHz) : options.signal.text();
    std::cout << "wrote " << options.output
              << textf(": %s, %d channel%s, %d Hz, %.2f s, peak %s\n", what.c_str(), rig.channels(), channels == 1 ? "" : "s",
                       rig.rate(), static_cast<double>(frames) / rig.rate(),
                       decibelText(static_cast<double>(meter.levels()[0].peak)).c_str());
}

CLI::App *addSignal(CLI::App &group, const char *name, const char *help) {
    auto options = std::make_shared<SignalOptions>();
    options->signal.name = name;
    CLI::App *verb = group.add_subcommand(name, help);
    verb->add_option("-o,--output", options->output, "Sound file to write; - for a WAV on standard output")
        ->required()
        ->type_name("FILE");
    verb->add_option("--bits", options->bits, "Samples: 16, 24 or 32f. WAV takes 32f and FLAC 24 if not given")
        ->check(CLI::IsMember({"16", "24", "32f"}))
        ->type_name("BITS");
    if (std::string(name) == "sweep")
        addSweepSettings(*verb, options->sweep);
    else
        verb->add_option("--seconds", options->seconds, "Length")
            ->check(CLI::Range(0.0, 86400.0))
            ->capture_default_str()
            ->type_name("S");
    if (std::string(name) == "sine")
        verb->add_option("--frequency", options->signal.frequencyHz, "Frequency in Hz")
            ->check(CLI::Range(1, 65535))
            ->capture_default_str()
            ->type_name("HZ");
    verb->add_flag("--force", options->force, "Write over a file that exists");
    verb->add_flag("-q,--quiet", options->common.quiet, "No summary");
    addEngineAndFormat(*verb, *options);
    verb->callback([options] { runSignal(*options); });
    return verb;
}

}  // namespace

void addSignalVerb(CLI::App &app, int &) {
    CLI::App *group = app.add_subcommand("signal", "Write a test signal of the library into a sound file");
    group->require_subcommand(1);
    group->footer("Example: vx signal pink -o pink.wav --layout stereo --seconds 30");
    addSignal(*group, "white", "White noise")
        ->footer("The library's white noise lies between 0 and 2, with a mean of 1; float samples hold it.");
    addSignal(*group, "pink", "Pink noise")->footer("Each channel has noise of its own.");
    addSignal(*group, "sine", "A sine of full scale")->footer("On the first four channels.");
    addSignal(*group, "sweep", "A swept sine of full scale behind a lead-in tone")
        ->footer("On one channel. It ends where vx measure sweep with the same options has measured its last band.");
}

}  // namespace vx
