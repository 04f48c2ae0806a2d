// SPDX-License-Identifier: MIT
//
// vx join: several recordings become the channels of one, side by side or each in its turn.
#include <algorithm>
#include <iostream>
#include <memory>
#include <vector>

#include "tools/vx/audio_file.h"
#include "tools/vx/console.h"
#include "tools/vx/layout.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"

namespace vx {

namespace {

constexpr size_t kFramesAtOnce = 4096;

struct JoinOptions {
    std::vector<std::string> inputs;
    std::string output;
    std::string layout;
    bool inTurn = false;
    bool force = false;
    bool quiet = false;
};

using Readers = std::vector<std::unique_ptr<AudioReader>>;

Readers openAll(const std::vector<std::string> &paths) {
    Readers readers;
    for (const std::string &path : paths) {
        readers.push_back(openAudioFile(path));
        const AudioFormat &format = readers.back()->format();
        if (format.channels != 1)
            throw Failure(ExitStatus::input,
                          path + ": has " + std::to_string(format.channels) + " channels; vx join takes mono recordings");
        if (format.sampleRate != readers.front()->format().sampleRate)
            throw Failure(ExitStatus::input, path + ": has " + std::to_string(format.sampleRate) + " Hz and " + paths.front() +
                                                 " has " + std::to_string(readers.front()->format().sampleRate) +
                                                 " Hz; bring them to one rate first");
    }
    return readers;
}

// Reads one stretch of channels [first, last) into an otherwise silent block; the frames that the longest of them had.
size_t readStretch(Readers &readers, size_t first, size_t last, std::vector<float> &block) {
    std::fill(block.begin(), block.end(), 0.0F);
    std::vector<float> mono(kFramesAtOnce);
    size_t longest = 0;
    for (size_t channel = first; channel < last; ++channel) {
        const size_t got = readers[channel]->read(mono.data(), kFramesAtOnce);
        for (size_t frame = 0; frame < got; ++frame) block[frame * readers.size() + channel] = mono[frame];
        longest = std::max(longest, got);
    }
    return longest;
}

void runJoin(const JoinOptions &options) {
    const int channels = static_cast<int>(options.inputs.size());
    const uint32_t mask = options.layout.empty() ? usualLayout(channels) : parseLayout(options.layout);
    if (mask == 0)
        throw Failure(ExitStatus::usage, std::to_string(channels) + " recordings have no usual layout; name one with --layout");
    if (channelCount(mask) != channels)
        throw Failure(ExitStatus::usage, "layout " + layoutName(mask) + " has " + std::to_string(channelCount(mask)) +
                                             " speakers, and " + std::to_string(channels) + " recordings were given");
    Readers readers = openAll(options.inputs);
    AudioFormat format;
    format.channels = channels;
    format.mask = mask;
    format.sampleRate = readers.front()->format().sampleRate;
    OutputFile output(options.output, options.force);
    const auto writer = createAudioFile(output, format, sampleTypeFor(options.output, std::nullopt), std::nullopt);
    std::vector<float> block(kFramesAtOnce * readers.size());
    uint64_t frames = 0;
    const size_t turns = options.inTurn ? readers.size() : 1;
    for (size_t turn = 0; turn < turns; ++turn) {
        const size_t first = options.inTurn ? turn : 0;
        const size_t last = options.inTurn ? turn + 1 : readers.size();
        while (const size_t got = readStretch(readers, first, last, block)) {
            writer->write(block.data(), got);
            frames += got;
        }
    }
    writer->finish();
    output.commit();
    if (!options.quiet && options.output != "-")
        std::cout << "wrote " << options.output << ": " << layoutText(mask) << ", " << format.sampleRate << " Hz, "
                  << textf("%.2f s\n", static_cast<double>(frames) / format.sampleRate);
}

}  // namespace

void addJoinVerb(CLI::App &app, int &) {
    auto options = std::make_shared<JoinOptions>();
    CLI::App *verb = app.add_subcommand("join", "Make one recording of several mono recordings, one a speaker");
    verb->add_option("INPUT", options->inputs, "Mono recordings in the order of the layout's speakers")->required();
    verb->add_option("-o,--output", options->output, "Sound file to write; - for standard output")->required()->type_name("FILE");
    verb->add_option("--layout", options->layout, "Speaker layout: " + layoutNames() + " or a mask such as 0x3F")
        ->type_name("LAYOUT");
    verb->add_flag("--in-turn", options->inTurn, "Each recording begins where the one before it ends");
    verb->add_flag("--force", options->force, "Write over a file that exists");
    verb->add_flag("-q,--quiet", options->quiet, "No summary");
    verb->footer("Example: vx join left.wav right.wav -o stereo.wav");
    verb->callback([options] { runJoin(*options); });
}

}  // namespace vx
