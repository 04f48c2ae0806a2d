// SPDX-License-Identifier: MIT
#include "tools/vx_measure/rig.h"

#include <algorithm>
#include <cmath>

#include "tools/vx/failure.h"
#include "tools/vx/layout.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr int kUsualRate = 48000;

std::unique_ptr<AudioReader> openIfNamed(const std::string &path) {
    return path.empty() ? nullptr : openAudioFile(path);
}

// The rate that was asked for has to be that of every file.
int rateOf(const MeasureOptions &options, const AudioReader *recorded, const AudioReader *input) {
    int rate = options.rate;
    for (const AudioReader *file : {recorded, input}) {
        if (file == nullptr) continue;
        const int own = file->format().sampleRate;
        if (rate != 0 && own != rate)
            throw Failure(ExitStatus::input, (file == recorded ? "the recording" : "the input") + textf(" has %d Hz and ", own) +
                                                 textf("%d Hz are wanted; bring them to one rate first", rate));
        rate = own;
    }
    return rate == 0 ? kUsualRate : rate;
}

uint32_t maskOf(const MeasureOptions &options) {
    const uint32_t mask = parseLayout(options.layout);
    if (channelCount(mask) > kMostChannels)
        throw Failure(ExitStatus::usage,
                      textf("--layout 0x%X has %d speakers; the library takes %d", mask, channelCount(mask), kMostChannels));
    return mask;
}

EngineChoice engineOf(const MeasureOptions &options, int rate) {
    EngineChoice choice;
    choice.engine = options.engine;
    choice.recordRate = rate;
    return choice;
}

}  // namespace

Rig::Rig(const MeasureOptions &options, int channel, const std::string &input)
    : options_(options),
      recorded_(openIfNamed(options.recorded)),
      input_(openIfNamed(input)),
      rate_(rateOf(options, recorded_.get(), input_.get())),
      channel_(channel),
      host_(engineOf(options, rate_)),
      format_(makeFormat(maskOf(options), options.block, rate_)) {
    const int channels = format_.channels;
    if (channel >= channels)
        throw Failure(ExitStatus::usage, textf("--channel %d: layout ", channel) + options.layout +
                                             textf(" has channels 0 to %d; choose another --layout", channels - 1));
    if (recorded_ && recorded_->format().channels != 1 && recorded_->format().channels <= channel)
        throw Failure(ExitStatus::input, options.recorded + textf(": has channels 0 to %d, and channel %d is measured",
                                                                  recorded_->format().channels - 1, channel));
    if (input_ && input_->format().channels != channels)
        throw Failure(ExitStatus::input, input + textf(": has %d channels, and layout ", input_->format().channels) +
                                             options.layout + textf(" has %d; choose another --layout", channels));
    host_.start(format_, format_);
    std::vector<std::string> settings = options.settings;
    if (settings.empty() && options.engine == MeasureOptions().engine) settings.push_back("bypass=on");
    for (const std::string &setting : settings) host_.send(parseSetting(setting));
    const PlantDescription plant = parsePlant(options.plant, rate_);
    if (!recorded_ && !options.onlyPlays())
        for (int c = 0; c < channels; ++c) plants_.emplace_back(plant, rate_, options.seed + static_cast<uint32_t>(c));
    if (options.play.empty()) return;
    AudioFormat played;
    played.channels = channels;
    played.mask = format_.channelMask;
    played.sampleRate = rate_;
    playFile_ = std::make_unique<OutputFile>(options.play, options.force);
    playWriter_ = createAudioFile(*playFile_, played, sampleTypeFor(options.play, std::nullopt), std::nullopt);
}

bool Rig::fillInput() {
    const auto frames = static_cast<size_t>(options_.block);
    interleaved_.assign(frames * static_cast<size_t>(format_.channels), 0.0F);
    if (input_ && input_->read(interleaved_.data(), frames) == 0) return false;
    render_.scatter(interleaved_.data(), format_, frames);
    return true;
}

bool Rig::fillCapture() {
    const auto frames = static_cast<size_t>(options_.block);
    const auto channels = static_cast<size_t>(recorded_->format().channels);
    interleaved_.assign(frames * channels, 0.0F);
    if (recorded_->read(interleaved_.data(), frames) == 0) return false;
    for (const float sample : interleaved_)
        if (!std::isfinite(sample))
            throw Failure(ExitStatus::input, options_.recorded + ": holds samples that are no numbers; record it again");
    for (int c = 0; c < format_.channels; ++c) {
        const auto from = channels == 1 ? 0 : static_cast<size_t>(c);
        const bool heard = channels == 1 ? c == channel_ : from < channels;
        for (size_t i = 0; i < frames; ++i) capture_.slot(c)[i] = heard ? interleaved_[i * channels + from] : 0.0F;
    }
    return true;
}

void Rig::writePlayed() {
    const auto frames = static_cast<size_t>(options_.block);
    const auto channels = static_cast<size_t>(format_.channels);
    interleaved_.resize(frames * channels);
    for (size_t c = 0; c < channels; ++c)
        for (size_t i = 0; i < frames; ++i) interleaved_[i * channels + c] = render_.slot(static_cast<int>(c))[i];
    playWriter_->write(interleaved_.data(), frames);
}

bool Rig::step() {
    if (ended_) return false;
    interrupt_.check();
    if ((recorded_ && !fillCapture()) || !fillInput()) {
        ended_ = true;
        return false;
    }
    IOFormat input = format_;
    IOFormat output = format_;
    host_.process(render_.record(), input, output);
    if (playWriter_) writePlayed();
    for (size_t c = 0; c < plants_.size(); ++c)
        plants_[c].process(render_.slot(static_cast<int>(c)), capture_.slot(static_cast<int>(c)),
                           static_cast<size_t>(options_.block));
    IOFormat heard = format_;
    if (recorded_ || !plants_.empty()) host_.record(capture_.record(), heard);
    frames_ += static_cast<uint64_t>(options_.block);
    return true;
}

bool Rig::stepUntil(double seconds) {
    while (this->seconds() < seconds)
        if (!step()) return false;
    return true;
}

void Rig::commit() {
    if (!playWriter_) return;
    playWriter_->finish();
    playFile_->commit();
}

}  // namespace vx
