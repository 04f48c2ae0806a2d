// SPDX-License-Identifier: MIT
//
// What an analyser would be with a packaged transform: window, FFTW in single precision, power. Bands are the caller's.
#pragma once

#include <fftw3.h>

#include <vector>

namespace vxcomn::bench {

class ReadoutPeer {
  public:
    // Takes the transform of `size` complex points, or of as many real values.
    ReadoutPeer(int size, bool real);
    ~ReadoutPeer();
    ReadoutPeer(const ReadoutPeer &) = delete;
    ReadoutPeer &operator=(const ReadoutPeer &) = delete;

    // size / 2 samples, padded with as many zeros; the power of the bins 0 to size / 2.
    const std::vector<float> &run(const float *samples, const float *window);

  private:
    int size_;
    bool real_;
    float *in_;
    fftwf_complex *out_;
    fftwf_plan plan_;
    std::vector<float> power_;
};

}  // namespace vxcomn::bench
