// SPDX-License-Identifier: MIT
//
// With the band-pass B = ts / (s^2 + dts + t^2) and the low-pass L = t^2 / (s^2 + dts + t^2), where t is the tuning and d the
// damping, each response below is 1 (or the gain) plus multiples of B and L. A shelf is tuned so that its midpoint lies at the
// frequency.
#include "filter_shape.h"

#include "deterministic_math.h"

namespace sample_engine {

FilterShape designBell(double frequencyHz, double quality, double gain, double sampleRate) {
    // Half of the boost narrows the denominator and half of it widens the numerator, so that boost and cut mirror each other.
    const double half = squareRoot(gain);
    FilterShape shape;
    shape.tuning = tanPi(frequencyHz / sampleRate);
    shape.damping = 1.0 / (quality * half);
    shape.bandPass = shape.damping * (gain - 1.0);
    return shape;
}

FilterShape designLowShelf(double frequencyHz, double quality, double gain, double sampleRate) {
    const double half = squareRoot(gain);
    FilterShape shape;
    shape.tuning = tanPi(frequencyHz / sampleRate) / squareRoot(half);
    shape.damping = 1.0 / quality;
    shape.bandPass = shape.damping * (half - 1.0);
    shape.lowPass = gain - 1.0;
    return shape;
}

FilterShape designHighShelf(double frequencyHz, double quality, double gain, double sampleRate) {
    const double half = squareRoot(gain);
    FilterShape shape;
    shape.tuning = tanPi(frequencyHz / sampleRate) * squareRoot(half);
    shape.damping = 1.0 / quality;
    shape.input = gain;
    shape.bandPass = shape.damping * (1.0 - half) * half;
    shape.lowPass = 1.0 - gain;
    return shape;
}

}  // namespace sample_engine
