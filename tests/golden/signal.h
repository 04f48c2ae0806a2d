// SPDX-License-Identifier: MIT
//
// What the scenes play: signals made of integers and exact conversions alone, so that every compiler and platform hears the same.
#pragma once

#include <cstdint>

namespace golden {

enum class Signal : uint8_t {
    programme,  // triangle waves of several pitches and some noise, a different one in each slot, peaks near -6 dB
    noise,      // white, between -1 and 1
    silence,
    threshold,   // 1e-6 as f32: silence, just
    quiet,       // noise below the last bit of a 24-bit sample
    impulses,    // one full sample in 1000
    fullScale,   // a square wave between -1 and 1
    overload,    // programme at eight times full scale
    direct,      // a constant 0.25
    denormals,   // noise of the smallest numbers
    notANumber,  // programme with a NaN in each 700 samples
    infinities   // programme with infinities of both signs
};

// A source of samples for one slot. Samples come in order, whatever the cut into blocks.
class SignalSource {
  public:
    SignalSource(Signal signal, int slot);
    float next();

  private:
    uint32_t random();
    float whiteSample();
    float programmeSample();

    Signal signal_;
    int slot_;
    uint32_t state_;
    uint32_t position_ = 0;
};

}  // namespace golden
