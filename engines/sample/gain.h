// SPDX-License-Identifier: MIT
//
// The input and the output gain: a linear factor on every channel that glides to a new value. Render thread only. At 1 the stage is
// passed over.
#pragma once

#include "block.h"
#include "glide.h"

namespace sample_engine {

class GainStage {
  public:
    void snap(double gain) { gain_.snap(gain); }
    void aim(double gain, int frames) { gain_.aim(gain, frames); }

    void process(Block &block, int begin, int count) {
        if (gain_.rests() && gain_.value() == 1.0) return;
        for (int frame = begin; frame < begin + count; ++frame) {
            const Pair gain = both(gain_.next());
            for (int pair = 0; pair < block.pairs; ++pair) block.rows[frame][pair] *= gain;
        }
    }

  private:
    Glide gain_;
};

}  // namespace sample_engine
