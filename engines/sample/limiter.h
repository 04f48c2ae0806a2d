// SPDX-License-Identifier: MIT
//
// A peak limiter without look-ahead: component 4, and once more behind the output gain, where it cannot be switched off. Render
// thread only. One gain serves all channels, so that the image stays. The gain falls at once, so no sample leaves above full scale,
// and recovers exponentially. While nothing exceeds full scale the gain is exactly 1 and no bit changes. Look-ahead would sound
// smoother and was turned down because the engine has no latency.
#pragma once

#include <algorithm>

#include "block.h"
#include "glide.h"

namespace sample_engine {

class Limiter {
  public:
    // The share of the excess that is left after one frame.
    void setRelease(double perFrame) { release_ = perFrame; }

    // `amount` is 1 for on and 0 for off.
    void snap(double amount) {
        amount_.snap(amount);
        level_ = 1.0;
    }
    void aim(double amount, int frames) { amount_.aim(amount, frames); }

    // Limits, and raises `peaks` (one entry a pair) to the largest magnitudes that came in.
    void process(Block &block, int begin, int count, Pair *peaks) {
        if (amount_.rests() && amount_.value() == 0.0) {
            level_ = 1.0;
            return;
        }
        withPairs(block.pairs, [&]<int Pairs>() { limit<Pairs>(block, begin, count, peaks); });
    }

  private:
    // An excess below -120 dB counts as none: the gain returns to exactly 1.
    static constexpr double kNoExcess = 1e-6;
    // What exceeds full scale by more than 60 dB is cut, so that the recovery takes a bounded time.
    static constexpr double kHighestLevel = 1000.0;

    static double magnitude(double value) { return value < 0.0 ? -value : value; }

    template <int Pairs>
    void limit(Block &block, int begin, int count, Pair *peaks) {
        Glide amount = amount_;
        double level = level_;
        const double release = release_;
        for (int frame = begin; frame < begin + count; ++frame) {
            Pair *row = block.rows[frame];
            double peak = 0.0;
            for (int pair = 0; pair < Pairs; ++pair)
                for (int lane = 0; lane < 2; ++lane) {
                    const double size = magnitude(row[pair][lane]);
                    peak = std::max(peak, size);
                    peaks[pair][lane] = std::max(peaks[pair][lane], size);
                }
            const double excess = (level - 1.0) * release;
            level = std::max(excess < kNoExcess ? 1.0 : 1.0 + excess, std::min(peak, kHighestLevel));
            const double on = amount.next();
            if (level == 1.0) continue;
            const double gain = 1.0 + on * (1.0 / level - 1.0);
            for (int pair = 0; pair < Pairs; ++pair) {
                row[pair] *= both(gain);
                if (on == 1.0)
                    for (int lane = 0; lane < 2; ++lane) row[pair][lane] = std::clamp(row[pair][lane], -1.0, 1.0);
            }
        }
        amount_ = amount;
        level_ = level;
    }

    Glide amount_;
    double level_ = 1.0;  // 1, or by what the samples are divided
    double release_ = 0.0;
};

}  // namespace sample_engine
