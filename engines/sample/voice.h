// SPDX-License-Identifier: MIT
//
// Component 0, voice: a wide bell over the octaves that carry speech, 1 to 4 kHz. The parameter is a linear gain g; the bell's
// middle is raised to 1 + g, so that 0 is neutral and the slider's upper end (+12 dB) a lift of 13.9 dB. Control threads design it;
// the stage is FilterStage<Straight>.
#pragma once

#include "filter_shape.h"

namespace sample_engine {

inline constexpr double kVoiceHz = 2000.0;
inline constexpr double kVoiceQuality = 0.7;

inline FilterShape designVoice(double gain, double sampleRate) {
    return designBell(kVoiceHz, kVoiceQuality, 1.0 + gain, sampleRate);
}

}  // namespace sample_engine
