// SPDX-License-Identifier: MIT
//
// Runs one FilterShape over a block and walks smoothly to another one. Render thread only. What the filter listens to and where its
// result goes is the tap's business: Straight replaces each channel by its filtered self; the surround stage brings a tap of its
// own. A stage whose shape is neutral is passed over, so that it changes no bit and costs nothing.
#pragma once

#include <algorithm>

#include "block.h"
#include "filter_shape.h"

namespace sample_engine {

// The coefficients of one step, drawn from a shape; both lanes alike.
struct FilterStep {
    Pair a1, a2, a3, input, bandPass, lowPass;

    explicit FilterStep(const FilterShape &shape) {
        const double scale = 1.0 / (1.0 + shape.tuning * (shape.tuning + shape.damping));
        a1 = both(scale);
        a2 = both(shape.tuning * scale);
        a3 = both(shape.tuning * (shape.tuning * scale));
        input = both(shape.input);
        bandPass = both(shape.bandPass);
        lowPass = both(shape.lowPass);
    }
};

struct FilterState {
    Pair first = {0.0, 0.0};  // of the two integrators
    Pair second = {0.0, 0.0};
};

// One frame of one pair: the formula that every loop uses.
inline Pair filterFrame(Pair in, const FilterStep &step, FilterState &state) {
    const Pair difference = in - state.second;
    const Pair band = step.a1 * state.first + step.a2 * difference;
    const Pair low = state.second + (step.a2 * state.first + step.a3 * difference);
    state.first = band + band - state.first;
    state.second = low + low - state.second;
    return step.input * in + (step.bandPass * band + step.lowPass * low);
}

// Each channel goes through the filter by itself.
struct Straight {
    Pair operator()(Pair in, int, const FilterStep &step, FilterState &state) const { return filterFrame(in, step, state); }
};

template <class Tap>
class FilterStage {
  public:
    explicit FilterStage(Tap tap = {}) : tap_(tap) {}

    Tap &tap() { return tap_; }

    // Stands at `shape` at once, with cleared histories.
    void snap(const FilterShape &shape) {
        asked_ = now_ = target_ = shape;
        left_ = 0;
        clear();
    }

    // Begins a walk to `shape` over so many frames.
    void aim(const FilterShape &shape, int frames) {
        if (shape == asked_) return;
        asked_ = target_ = shape;
        // From and to neutral only the mixture walks: tuning means nothing while nothing of the filter is heard.
        if (left_ == 0 && now_.isNeutral()) {
            now_.tuning = target_.tuning;
            now_.damping = target_.damping;
        } else if (target_.isNeutral()) {
            target_.tuning = now_.tuning;
            target_.damping = now_.damping;
        }
        const double scale = 1.0 / static_cast<double>(frames);
        step_ = {(target_.tuning - now_.tuning) * scale, (target_.damping - now_.damping) * scale,
                 (target_.input - now_.input) * scale, (target_.bandPass - now_.bandPass) * scale,
                 (target_.lowPass - now_.lowPass) * scale};
        left_ = frames;
    }

    void process(Block &block, int begin, int count) {
        const int walking = std::min(left_, count);
        if (walking > 0) {
            withPairs(block.pairs, [&]<int Pairs>() { walk<Pairs>(block, begin, walking); });
            left_ -= walking;
            if (left_ == 0) arrive();
        }
        if (walking < count && !now_.isNeutral())
            withPairs(block.pairs, [&]<int Pairs>() { stand<Pairs>(block, begin + walking, count - walking); });
    }

  private:
    void clear() { std::fill(std::begin(states_), std::end(states_), FilterState{}); }

    void arrive() {
        now_ = target_;
        if (now_.isNeutral()) clear();
    }

    template <int Pairs>
    void stand(Block &block, int begin, int count) {
        const FilterStep step(now_);
        const Tap tap = tap_;
        FilterState states[Pairs];
        std::copy_n(states_, Pairs, states);
        for (int frame = begin; frame < begin + count; ++frame)
            for (int pair = 0; pair < Pairs; ++pair)
                block.rows[frame][pair] = tap(block.rows[frame][pair], pair, step, states[pair]);
        std::copy_n(states, Pairs, states_);
    }

    template <int Pairs>
    void walk(Block &block, int begin, int count) {
        for (int frame = begin; frame < begin + count; ++frame) {
            now_.tuning += step_.tuning;
            now_.damping += step_.damping;
            now_.input += step_.input;
            now_.bandPass += step_.bandPass;
            now_.lowPass += step_.lowPass;
            const FilterStep step(now_);
            for (int pair = 0; pair < Pairs; ++pair)
                block.rows[frame][pair] = tap_(block.rows[frame][pair], pair, step, states_[pair]);
        }
    }

    Tap tap_;
    FilterShape asked_;  // as told last
    FilterShape now_;
    FilterShape target_;                            // `asked_`, with the tuning kept on the way to neutral
    FilterShape step_ = {0.0, 0.0, 0.0, 0.0, 0.0};  // added each frame of a walk
    int left_ = 0;                                  // frames of the walk
    FilterState states_[kMaxPairs];
};

}  // namespace sample_engine
