// SPDX-License-Identifier: MIT
//
// A component that is absent or off gets the neutral shape: it glides out of the sound like any other change.
#include "targets.h"

#include "bass.h"
#include "detail.h"
#include "deterministic_math.h"
#include "surround.h"
#include "voice.h"

namespace sample_engine {
namespace {

constexpr double kGlideSeconds = 0.02;    // long enough to be no click, short enough to feel immediate
constexpr double kReleaseSeconds = 0.15;  // the excess falls to 1/e

}  // namespace

Targets makeTargets(const Settings &settings, double sampleRate) {
    const auto on = [&](int id) { return settings.components[id].present && settings.components[id].enabled; };
    const auto level = [&](int id) { return on(id) ? settings.components[id].level : 0.0; };

    Targets targets;
    targets.surround = designSurround(level(kSurround), sampleRate);
    targets.bass = designBass(level(kBass), sampleRate);
    targets.detail = designDetail(level(kDetail), sampleRate);
    targets.voice = designVoice(level(kVoice), sampleRate);
    if (on(kEqualiser) && settings.equaliserOn)
        for (int band = 0; band < kEqualiserBands; ++band) targets.equaliser[band] = designBand(settings.bands[band], sampleRate);
    targets.limiter = on(kLimiter) ? 1.0 : 0.0;
    targets.inputGain = settings.inputGainOff ? 1.0 : settings.inputGain;
    targets.outputGain = settings.outputGainOff ? 1.0 : settings.outputGain;
    targets.effects = settings.power && !settings.bypass ? 1.0 : 0.0;
    targets.limiterRelease = exp2(-kLog2E / (kReleaseSeconds * sampleRate));
    targets.glideFrames = static_cast<int>(nearestInteger(kGlideSeconds * sampleRate));
    return targets;
}

}  // namespace sample_engine
