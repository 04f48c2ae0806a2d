// SPDX-License-Identifier: MIT
//
// The analog low-pass that an elliptic design starts from: pass-band edge at 1 rad/s, given by its poles and zeros. And the pairs
// of poles and zeros that all steps of a design hand on. Control calls only.
#pragma once

#include <array>
#include <complex>
#include <limits>

namespace Dsp {

inline constexpr int kMaxPrototypePoles = 6;
inline constexpr int kMaxDigitalPoles = 2 * kMaxPrototypePoles;
inline constexpr double kInfinity = std::numeric_limits<double>::infinity();

// Two poles and two zeros: either conjugate or both real.
struct PoleZeroPair {
    std::complex<double> poles[2];
    std::complex<double> zeros[2];
};

// `poleCount` poles in pairs. The last pair of an odd count holds one pole and one zero.
template <int MaxPoles>
struct Layout {
    int poleCount = 0;
    std::array<PoleZeroPair, (MaxPoles + 1) / 2> pairs{};
    double normalFrequency = 0.0;  // rad/s, or rad/sample
    double normalGain = 1.0;       // what the response is there

    int pairCount() const noexcept { return (poleCount + 1) / 2; }
};

namespace Elliptic {

class AnalogLowPass : public Layout<kMaxPrototypePoles> {
  public:
    // Ripple in dB; the width sets how far the stop band lies beyond the pass band. Does nothing if all three are as before. An
    // order outside 1 to 6 is held inside.
    void design(int order, double rippleDb, double width);

  private:
    int order_ = -1;
    double rippleDb_ = 0.0;
    double width_ = 0.0;
};

}  // namespace Elliptic
}  // namespace Dsp
