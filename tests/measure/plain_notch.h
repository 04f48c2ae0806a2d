// SPDX-License-Identifier: MIT
//
// The tracking notch as its frames read, one after the other: the judge of the one that works in pieces, and the form that speed is
// compared with. Sine and cosine come in as functions.
#pragma once

#include <cmath>
#include <cstdint>
#include <vector>

#include "measure/tracking_notch.h"
#include "plain_generators.h"
#include "vxcomn/measurement_records.h"

namespace plain {

struct NotchLog {
    double in = 0.0, out = 0.0;
    std::vector<float> ratios = std::vector<float>(VX_MAX_DISTORTION, 1.0F);
    int32_t next = 0, points = 0;
    vxcomn::DistortionLog log() { return {in, out, ratios.data(), next, points}; }
};

template <class Sine, class Cosine>
void trackSweep(SweepGenerator &tracker, BiquadState &notch, NotchLog &log, float *samples, int count, int rate, Sine sineOf,
                Cosine cosineOf) {
    for (int t = 0; t < count; ++t) {
        const float x = samples[t];
        if (tracker.Position >= tracker.PreDelaySamples) log.in += std::fabs(x);
        const double w = 6.283185307179586 * static_cast<float>(tracker.CurrentFrequency) / static_cast<float>(rate);
        const double sine = sineOf(w), cosine = cosineOf(w);
        const double alpha = sine / (2.0 * 2.0), g = 1.0 / (1.0 + alpha);
        notch.b0 = notch.b2 = static_cast<float>(g);
        notch.b1 = notch.a1 = static_cast<float>(-2.0 * cosine * g);
        notch.a2 = static_cast<float>((1.0 - alpha) * g);
        sweepSample(tracker, [](double) { return 0.0F; });
        const float forward = notch.b0 * x + notch.b1 * notch.x1 + notch.b2 * notch.x2;
        const double y =
            static_cast<double>(forward) - static_cast<double>(notch.a1) * notch.y1 - static_cast<double>(notch.a2) * notch.y2;
        notch.x2 = notch.x1;
        notch.x1 = x;
        notch.y2 = notch.y1;
        notch.y1 = y;
        samples[t] = static_cast<float>(y);
        if (tracker.Position >= tracker.PreDelaySamples) log.out += std::fabs(samples[t]);
        const int j = log.next;
        if (j < log.points && j < static_cast<int>(tracker.TablePosition)) {
            log.ratios[static_cast<size_t>(j)] = log.in == 0.0 ? 1.0F : static_cast<float>(log.out / log.in);
            log.in = log.out = 0.0;
            ++log.next;
        }
    }
}

}  // namespace plain
