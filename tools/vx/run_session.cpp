// SPDX-License-Identifier: MIT
#include "tools/vx/run_session.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <memory>
#include <optional>
#include <thread>

#include "tools/vx/engine_seat.h"
#include "tools/vx/failure.h"
#include "tools/vx/interrupt.h"
#include "tools/vx/layout.h"
#include "tools/vx/levels_csv.h"
#include "tools/vx/levels_plot.h"
#include "tools/vx/slot_buffers.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

using Clock = std::chrono::steady_clock;

uint32_t fileMaskOf(const RunOptions &options, const AudioFormat &format) {
    const std::string channels = std::to_string(format.channels) + " channels";
    const uint32_t mask = !options.fileLayout.empty() ? parseLayout(options.fileLayout)
                          : format.mask != 0          ? format.mask
                                                      : usualLayout(format.channels);
    if (mask == 0)
        throw Failure(ExitStatus::input,
                      options.input + ": has " + channels + " and names no speakers; say what they are with --file-layout");
    if (channelCount(mask) != format.channels)
        throw Failure(ExitStatus::usage, "--file-layout " + layoutName(mask) + ": has " + std::to_string(channelCount(mask)) +
                                             " speakers, and the file has " + channels);
    const IOFormat record = makeFormat(mask, 1, format.sampleRate);
    for (int left = 0; left < record.channels; ++left)
        for (int right = left + 1; right < record.channels; ++right)
            if (record.channelSlot[left] == record.channelSlot[right])
                throw Failure(ExitStatus::input, options.input + ": speakers " + speakerName(mask, left) + " and " +
                                                     speakerName(mask, right) +
                                                     " share a slot of the library; choose other speakers with --file-layout");
    return mask;
}

std::optional<SampleType> askedType(const std::string &bits) {
    if (bits.empty()) return std::nullopt;
    return bits == "16" ? SampleType::pcm16 : bits == "24" ? SampleType::pcm24 : SampleType::float32;
}

// Frames to play, if that can be told ahead.
std::optional<uint64_t> framesToPlay(const RunOptions &options, const AudioReader &reader) {
    std::optional<uint64_t> frames;
    if (reader.announcedFrames()) frames = *reader.announcedFrames() * static_cast<uint64_t>(options.loops);
    if (options.seconds) {
        const auto asked = static_cast<uint64_t>(std::ceil(*options.seconds * reader.format().sampleRate));
        frames = frames ? std::min(*frames, asked) : asked;
    }
    const auto announced = reader.announcedFrames();
    const auto present = reader.presentFrames();
    if (announced && present && *present<*announced && * frames> * present) failTruncated(options.input, *announced, *present);
    return frames;
}

// Reads a block, from the beginning again while loops are left.
class LoopingSource {
  public:
    LoopingSource(AudioReader &reader, int loops) : reader_(reader), left_(loops) {}

    size_t read(float *interleaved, size_t frames) {
        const auto channels = static_cast<size_t>(reader_.format().channels);
        size_t done = 0;
        while (left_ > 0 && done < frames) {
            const size_t got = reader_.read(interleaved + done * channels, frames - done);
            done += got;
            if (done == frames) break;
            if (--left_ > 0 && !reader_.rewind()) left_ = 0;
        }
        return done;
    }

  private:
    AudioReader &reader_;
    int left_;
};

struct Outputs {
    std::unique_ptr<OutputFile> file;
    std::unique_ptr<AudioWriter> writer;
    std::unique_ptr<LevelsCsv> levels;
    std::unique_ptr<LevelsPlot> levelsPlot;

    void commit() {
        if (writer) writer->finish();
        if (levels) levels->finish();
        if (file) file->commit();
    }
};

Outputs openOutputs(const RunOptions &options, RunReport &report, std::optional<uint64_t> frames) {
    Outputs outputs;
    AudioFormat format;
    format.channels = channelCount(report.outputMask);
    format.mask = report.outputMask;
    format.sampleRate = report.file.sampleRate;
    if (!options.output.empty()) {
        const SampleType type = sampleTypeFor(options.output, askedType(options.bits));
        report.sampleText = type == SampleType::float32 ? "32-bit float" : type == SampleType::pcm24 ? "24-bit PCM" : "16-bit PCM";
        outputs.file = std::make_unique<OutputFile>(options.output, options.force);
        outputs.writer = createAudioFile(*outputs.file, format, type, frames);
    }
    if (!options.levelsCsv.empty())
        outputs.levels =
            std::make_unique<LevelsCsv>(options.levelsCsv, options.force, report.fileMask, report.outputMask, format.sampleRate);
    if (!options.levelsPlots.empty())
        outputs.levelsPlot = std::make_unique<LevelsPlot>(options.levelsPlots, options.force, format.sampleRate);
    return outputs;
}

std::vector<ParameterWrite> parameterWrites(const RunOptions &options) {
    std::vector<ParameterWrite> writes;
    for (const std::string &text : options.settings) writes.push_back(parseSetting(text));
    for (const std::string &text : options.parameters) writes.push_back(parseParameter(text));
    return writes;
}

// Holds a run back to the speed of its sound.
class Pace {
  public:
    Pace(bool realTime, int sampleRate) : realTime_(realTime), sampleRate_(sampleRate), begin_(Clock::now()) {}

    void waitFor(uint64_t frame) const {
        if (!realTime_) return;
        const std::chrono::duration<double> due(static_cast<double>(frame) / sampleRate_);
        std::this_thread::sleep_until(begin_ + std::chrono::duration_cast<Clock::duration>(due));
    }

  private:
    bool realTime_;
    int sampleRate_;
    Clock::time_point begin_;
};

void playBlocks(const RunOptions &options, EngineSeat &seat, RunFollower *follower, AudioReader &reader,
                std::optional<uint64_t> frames, Outputs &outputs, RunReport &report) {
    const int rate = report.file.sampleRate;
    IOFormat input = makeFormat(report.fileMask, options.block, rate);
    IOFormat output = makeFormat(report.outputMask, options.block, rate);
    LevelMeter inputMeter(input.channels);
    LevelMeter outputMeter(output.channels);
    SampleDigest digest;
    LoopingSource source(reader, options.loops);
    SlotBuffers slots;
    std::vector<float> before(static_cast<size_t>(options.block * input.channels));
    std::vector<float> after(static_cast<size_t>(options.block * output.channels));
    Progress progress("run", frames, options.common.quiet || options.common.json);
    const InterruptGuard interrupt;
    const Pace pace(options.realTime || follower != nullptr, rate);
    while (!frames || report.frames < *frames) {
        const auto wanted = static_cast<size_t>(options.block);
        const size_t got =
            source.read(before.data(), frames ? static_cast<size_t>(std::min<uint64_t>(wanted, *frames - report.frames)) : wanted);
        if (got == 0) break;
        inputMeter.feed(before.data(), got);
        slots.scatter(before.data(), input, got);
        input.frames = output.frames = static_cast<int32_t>(got);
        pace.waitFor(report.frames);
        seat.renew();
        if (follower != nullptr) follower->beforeBlock(static_cast<double>(report.frames) / rate);
        const Clock::time_point begin = Clock::now();
        seat.host().process(slots.record(), input, output);
        const auto took = std::chrono::duration_cast<std::chrono::nanoseconds>(Clock::now() - begin).count();
        if (follower != nullptr) follower->afterBlock();
        report.load.add(static_cast<uint64_t>(std::max<int64_t>(took, 0)));
        if (slots.record().silent != 0) report.silentFrames += got;
        slots.gather(after.data(), output, got);
        outputMeter.feed(after.data(), got);
        digest.feed(after.data(), got * static_cast<size_t>(output.channels));
        if (outputs.writer) outputs.writer->write(after.data(), got);
        if (outputs.levels)
            outputs.levels->add(report.frames, inputMeter.blockPeaks(), outputMeter.blockPeaks(), static_cast<double>(took));
        if (outputs.levelsPlot)
            outputs.levelsPlot->feed(before.data(), got * static_cast<size_t>(input.channels), after.data(),
                                     got * static_cast<size_t>(output.channels), got);
        report.frames += got;
        progress.update(report.frames);
        // Who follows has no other end than a signal when the file is long, and keeps what was played.
        if (follower != nullptr && interrupt.noted()) break;
        interrupt.check();
    }
    report.inputLevels = inputMeter.levels();
    report.outputLevels = outputMeter.levels();
    report.digest = digest.value();
}

}  // namespace

RunReport runSession(const RunOptions &options, RunFollower *follower) {
    const std::vector<ParameterWrite> writes = parameterWrites(options);
    const Clock::time_point begin = Clock::now();
    RunReport report;
    const std::unique_ptr<AudioReader> reader = openAudioFile(options.input);
    report.file = reader->format();
    report.fileMask = fileMaskOf(options, report.file);
    report.inputMask = options.layout.empty() ? report.fileMask : parseLayout(options.layout);
    report.outputMask = options.outputLayout.empty() ? report.inputMask : parseLayout(options.outputLayout);
    if (channelCount(report.inputMask) > kMostChannels || channelCount(report.outputMask) > kMostChannels)
        throw Failure(ExitStatus::usage,
                      "a layout has at most " + std::to_string(kMostChannels) + " speakers, one a slot of the library");
    const std::optional<uint64_t> frames = framesToPlay(options, *reader);
    if (frames == 0) throw Failure(ExitStatus::input, options.input + ": holds no audio; nothing to play");

    EngineChoice choice = {options.engine.value_or(kUsualEngine),
                           options.platform,
                           options.hostType,
                           options.hardware,
                           options.commandLine,
                           options.recordRate};
    if (choice.recordRate == 0) choice.recordRate = report.file.sampleRate;
    EngineSeat seat(choice, makeFormat(report.inputMask, options.block, report.file.sampleRate),
                    makeFormat(report.outputMask, options.block, report.file.sampleRate), writes, follower);
    report.engineFile = seat.host().engineFile();
    report.parameters = seat.answers();

    Outputs outputs = openOutputs(options, report, frames);
    playBlocks(options, seat, follower, *reader, frames, outputs, report);
    if (report.frames == 0) throw Failure(ExitStatus::input, options.input + ": holds no audio; nothing to play");
    outputs.commit();
    if (follower != nullptr) report.changes = follower->changes();
    if (outputs.levelsPlot)
        report.levelsPlots = outputs.levelsPlot->draw(options.input + " through " + report.engineFile, report.changes);
    report.wallSeconds = std::chrono::duration<double>(Clock::now() - begin).count();
    return report;
}

}  // namespace vx
