// SPDX-License-Identifier: MIT
//
// The block, and what leads up to it. Everything that process() reaches is arithmetic on members: no allocation, no lock, no call
// into the system or the C library. Components run by their positions in the engine's description: 1, 3, 2, 0, 4, 5.
#include "engine.h"

#include <algorithm>

#include "sample_edge.h"

namespace sample_engine {
namespace {

Sample *samplesOf(float *const *channels, int slot) {
    return reinterpret_cast<Sample *>(channels[slot]);
}

}  // namespace

Engine::Engine() {
    publish();
}

bool Engine::setFormat(const IOFormat &input, const IOFormat &output) {
    const std::lock_guard lock(mutex_);
    plan_ = planSpeakers(input, output, kFixedPoint);
    if (isSupported(output)) sampleRate_ = static_cast<double>(output.sampleRate);
    block_.pairs = plan_.pairs;
    for (int pair = 0; pair < plan_.pairs; ++pair) {
        const int slot = plan_.pairSlot[pair];
        surround_.tap().leftAndRight[pair] = slot != VX_SLOT_FRONT_CENTER && plan_.processed[slot] && plan_.processed[slot + 1];
    }
    publish();
    clear();
    return plan_.pairs > 0;
}

void Engine::publish() {
    targets_.publish(makeTargets(settings_, sampleRate_));
}

void Engine::process(float *const *channels, int frames) {
    if (plan_.pairs == 0 || frames < 1 || frames > VX_MAX_FRAMES) return;
    takeTargets();
    routeSpeakers(channels, frames);
    for (int done = 0; done < frames;) {
        if (effects_.rests() && effects_.value() == 0.0) break;
        // A span ends where a crossfade ends, so that a bypass begins with the very frame.
        const int count = effects_.rests() ? frames - done : std::min(frames - done, effects_.framesLeft());
        processSpan(channels, done, count);
        done += count;
    }
    raisePeaks();
}

void Engine::processSpan(float *const *channels, int begin, int count) {
    readSpan(channels, begin, count);
    inputGain_.process(block_, begin, count);
    surround_.process(block_, begin, count);
    bass_.process(block_, begin, count);
    detail_.process(block_, begin, count);
    voice_.process(block_, begin, count);
    limiter_.process(block_, begin, count, blockPeaks_);
    equaliser_.process(block_, begin, count);
    outputGain_.process(block_, begin, count);
    outputLimiter_.process(block_, begin, count, blockPeaks_);
    writeSpan(channels, begin, count);
}

void Engine::takeTargets() {
    const bool news = targets_.take() != nullptr;
    const Targets &targets = targets_.current();
    limiter_.setRelease(targets.limiterRelease);
    outputLimiter_.setRelease(targets.limiterRelease);
    // The load keeps the usual block from writing to a line that control threads share.
    if (restartPending_.load(std::memory_order_relaxed) && restartPending_.exchange(false, std::memory_order_acquire)) {
        snapStages(targets);
        effects_.snap(targets.effects);
    } else if (news) {
        const bool resting = effects_.rests() && effects_.value() == 0.0;
        if (resting)
            snapStages(targets);
        else
            aimStages(targets);
        effects_.aim(targets.effects, targets.glideFrames);
    }
}

void Engine::snapStages(const Targets &targets) {
    inputGain_.snap(targets.inputGain);
    surround_.snap(targets.surround);
    bass_.snap(targets.bass);
    detail_.snap(targets.detail);
    voice_.snap(targets.voice);
    limiter_.snap(targets.limiter);
    equaliser_.snap(targets.equaliser);
    outputGain_.snap(targets.outputGain);
    outputLimiter_.snap(1.0);
}

void Engine::aimStages(const Targets &targets) {
    const int frames = targets.glideFrames;
    inputGain_.aim(targets.inputGain, frames);
    surround_.aim(targets.surround, frames);
    bass_.aim(targets.bass, frames);
    detail_.aim(targets.detail, frames);
    voice_.aim(targets.voice, frames);
    limiter_.aim(targets.limiter, frames);
    equaliser_.aim(targets.equaliser, frames);
    outputGain_.aim(targets.outputGain, frames);
}

void Engine::routeSpeakers(float *const *channels, int frames) const {
    for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) {
        Sample *target = samplesOf(channels, slot);
        if (plan_.silenced[slot]) std::fill_n(target, frames, Sample{0});
        if (plan_.copyFrom[slot] >= 0) std::copy_n(samplesOf(channels, plan_.copyFrom[slot]), frames, target);
    }
}

void Engine::readSpan(float *const *channels, int begin, int count) {
    for (int pair = 0; pair < plan_.pairs; ++pair)
        for (int lane = 0; lane < 2; ++lane) {
            const int slot = plan_.pairSlot[pair] + lane;
            const Sample *samples = samplesOf(channels, slot);
            for (int frame = begin; frame < begin + count; ++frame)
                block_.rows[frame][pair][lane] = plan_.processed[slot] ? readSample(samples[frame]) : 0.0;
        }
}

void Engine::writeSpan(float *const *channels, int begin, int count) {
    for (int pair = 0; pair < plan_.pairs; ++pair)
        for (int lane = 0; lane < 2; ++lane) {
            const int slot = plan_.pairSlot[pair] + lane;
            if (!plan_.processed[slot]) continue;
            Sample *samples = samplesOf(channels, slot);
            Glide effects = effects_;
            for (int frame = begin; frame < begin + count; ++frame) {
                const double processed = block_.rows[frame][pair][lane];
                if (effects.rests()) {
                    samples[frame] = writeSample(processed);
                } else {
                    const double untouched = readSample(samples[frame]);
                    samples[frame] = writeSample(untouched + effects.next() * (processed - untouched));
                }
            }
        }
    for (int frame = 0; frame < count && !effects_.rests(); ++frame) effects_.next();
}

void Engine::raisePeaks() {
    for (int pair = 0; pair < plan_.pairs; ++pair)
        for (int lane = 0; lane < 2; ++lane) {
            auto &peak = peaks_[plan_.pairSlot[pair] + lane];
            const auto now = static_cast<float>(blockPeaks_[pair][lane]);
            if (now > peak.load(std::memory_order_relaxed)) peak.store(now, std::memory_order_relaxed);
            blockPeaks_[pair][lane] = 0.0;
        }
}

}  // namespace sample_engine
