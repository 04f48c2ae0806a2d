// SPDX-License-Identifier: MIT
//
// One instance of the sample engine: the settings that control threads write, the hand-over, and the stages that the render thread
// runs. The exports (engine_exports.cpp) are thin calls into it. Control calls may come from any number of threads and during a
// block, except for setFormat, which the caller keeps away from blocks.
#pragma once

#include <atomic>
#include <cstdint>
#include <mutex>

#include "filter_stage.h"
#include "gain.h"
#include "latest_value.h"
#include "limiter.h"
#include "speaker_layout.h"
#include "surround.h"
#include "targets.h"

namespace sample_engine {

class Engine {
  public:
    Engine();
    Engine(const Engine &) = delete;
    Engine &operator=(const Engine &) = delete;

    // [control, no block runs] Takes the formats and starts anew: cleared histories, settings kept. False if the output format is
    // unsupported; blocks then pass as they are.
    bool setFormat(const IOFormat &input, const IOFormat &output);
    // [control] Changes the settings with `change`, a function of Settings &, and hands the outcome to the render thread.
    template <class Change>
    auto change(Change &&change) {
        const std::lock_guard lock(mutex_);
        const auto result = change(settings_);
        publish();
        return result;
    }
    // [control] The next block starts with cleared histories and without glides.
    void clear() { restartPending_.store(true, std::memory_order_release); }
    // [control] Reads and empties the largest magnitude ahead of a limiter, linear, of a slot.
    float takePeak(int slot) { return peaks_[slot].exchange(0.0F, std::memory_order_relaxed); }
    // [control, formats set] The speakers of the output.
    const SpeakerPlan &plan() const { return plan_; }

    // [render] Processes one block in place.
    void process(float *const *channels, int frames);

  private:
    void publish();
    void takeTargets();
    void snapStages(const Targets &targets);
    void aimStages(const Targets &targets);
    void routeSpeakers(float *const *channels, int frames) const;
    void processSpan(float *const *channels, int begin, int count);
    void readSpan(float *const *channels, int begin, int count);
    void writeSpan(float *const *channels, int begin, int count);
    void raisePeaks();

    // Control threads', under the lock.
    std::mutex mutex_;
    Settings settings_;
    double sampleRate_ = 48000.0;

    LatestValue<Targets> targets_;                  // control: publishes; render: takes
    std::atomic<bool> restartPending_ = true;       // control: raises; render: takes
    std::atomic<float> peaks_[VX_SLOT_COUNT] = {};  // render: raises; control: takes

    // Written by setFormat, read by blocks.
    SpeakerPlan plan_;

    // The render thread's, in the order of processing.
    GainStage inputGain_;
    SurroundStage surround_;
    FilterStage<Straight> bass_;
    FilterStage<Straight> detail_;
    FilterStage<Straight> voice_;
    Limiter limiter_;
    Equaliser equaliser_;
    GainStage outputGain_;
    Limiter outputLimiter_;
    Glide effects_;  // 1 processed, 0 untouched, between the two a crossfade
    Pair blockPeaks_[kMaxPairs] = {};
    Block block_;
};

}  // namespace sample_engine
