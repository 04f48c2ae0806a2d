// SPDX-License-Identifier: MIT
//
// A number that walks to a new value in a straight line, one step a frame, and arrives exactly. Render thread only. The steps are
// counted in frames, never in blocks, so the samples do not depend on how a stream is cut into blocks.
#pragma once

namespace sample_engine {

class Glide {
  public:
    // Stands at `value` at once.
    void snap(double value) {
        value_ = target_ = value;
        left_ = 0;
    }
    // Begins a walk to `target`, unless it is on its way there or there already.
    void aim(double target, int frames) {
        if (target == target_) return;
        target_ = target;
        step_ = (target - value_) / static_cast<double>(frames);
        left_ = frames;
    }
    double next() {
        if (left_ == 0) return value_;
        --left_;
        value_ = left_ == 0 ? target_ : value_ + step_;
        return value_;
    }
    double value() const { return value_; }
    int framesLeft() const { return left_; }
    bool rests() const { return left_ == 0; }

  private:
    double value_ = 0.0;
    double target_ = 0.0;
    double step_ = 0.0;
    int left_ = 0;
};

}  // namespace sample_engine
