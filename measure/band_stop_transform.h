// SPDX-License-Identifier: MIT
//
// From an analog low-pass with its edge at 1 rad/s to a digital band-stop. Control calls only.
#pragma once

#include "measure/elliptic_prototype.h"

namespace Dsp {

// Centre and width are in cycles per sample. A band that reaches below 0 or beyond half the rate is cut there.
void transformToBandStop(double center, double width, const Layout<kMaxPrototypePoles> &analog, Layout<kMaxDigitalPoles> &digital);

}  // namespace Dsp
