// SPDX-License-Identifier: MIT
//
// fir_bench: how fast FftFirFilter::process is on blocks of 512 samples, beside overlap-add of the same size made with FFTW in
// double precision (complex, and real) and beside the plain form of the tests.
//
// A filter of each instruction set, the peers and the plain form take turns.
#include <fftw3.h>

#include <algorithm>
#include <complex>
#include <cstdio>
#include <random>
#include <string>
#include <vector>

#include "bench/support/block_fixture.h"
#include "bench/support/timing.h"
#include "measure/fir_kernels.h"
#include "tests/measure/plain_fir.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;
using namespace vxcomn::bench;

namespace {

constexpr int kBlock = 512;
constexpr int kRounds = 101;

using Complex = std::complex<double>;

template <typename T>
struct FftwArray {
    explicit FftwArray(int count) : values(static_cast<T *>(fftw_malloc(sizeof(T) * static_cast<size_t>(count)))) {
        std::fill(values, values + count, T{});
    }
    ~FftwArray() { fftw_free(values); }
    FftwArray(const FftwArray &) = delete;
    FftwArray &operator=(const FftwArray &) = delete;
    T *values;
};

fftw_complex *raw(Complex *values) {
    return reinterpret_cast<fftw_complex *>(values);
}

// Overlap-add with a complex transform, in place.
class ComplexPeer {
  public:
    ComplexPeer(const std::vector<float> &taps, int size)
        : size_(size), work_(size), response_(static_cast<size_t>(size)), overlap_(static_cast<size_t>(size / 2)) {
        forward_ = fftw_plan_dft_1d(size, raw(work_.values), raw(work_.values), FFTW_FORWARD, FFTW_PATIENT);
        inverse_ = fftw_plan_dft_1d(size, raw(work_.values), raw(work_.values), FFTW_BACKWARD, FFTW_PATIENT);
        std::fill(work_.values, work_.values + size, Complex{});
        std::copy(taps.begin(), taps.end(), work_.values);
        fftw_execute(forward_);
        for (int i = 0; i < size; ++i) response_[static_cast<size_t>(i)] = work_.values[i] / static_cast<double>(size);
    }
    ~ComplexPeer() {
        fftw_destroy_plan(forward_);
        fftw_destroy_plan(inverse_);
    }
    ComplexPeer(const ComplexPeer &) = delete;
    ComplexPeer &operator=(const ComplexPeer &) = delete;

    void process(const float *in, float *out, int count) {
        const int half = size_ / 2;
        double *const w = reinterpret_cast<double *>(work_.values);
        const double *const h = reinterpret_cast<const double *>(response_.data());
        for (int done = 0; done < count;) {
            const int length = std::min(half, count - done);
            for (int i = 0; i < length; ++i) work_.values[i] = in[done + i];
            std::fill(work_.values + length, work_.values + size_, Complex{});
            fftw_execute(forward_);
            for (int i = 0; i < 2 * size_; i += 2) {
                const double real = w[i] * h[i] - w[i + 1] * h[i + 1];
                w[i + 1] = w[i] * h[i + 1] + w[i + 1] * h[i];
                w[i] = real;
            }
            fftw_execute(inverse_);
            for (int i = 0; i < length; ++i) out[done + i] = static_cast<float>(overlap_[static_cast<size_t>(i)] + w[2 * i]);
            for (int i = length; i < half; ++i) {
                overlap_[static_cast<size_t>(i - length)] = static_cast<float>(overlap_[static_cast<size_t>(i)] + w[2 * i]);
            }
            for (int i = half; i < half + length; ++i) overlap_[static_cast<size_t>(i - length)] = static_cast<float>(w[2 * i]);
            done += length;
        }
    }

  private:
    int size_;
    FftwArray<Complex> work_;
    std::vector<Complex> response_;
    std::vector<float> overlap_;
    fftw_plan forward_;
    fftw_plan inverse_;
};

// Overlap-add with a transform of real values.
class RealPeer {
  public:
    RealPeer(const std::vector<float> &taps, int size)
        : size_(size),
          samples_(size),
          spectrum_(size / 2 + 1),
          response_(static_cast<size_t>(size / 2 + 1)),
          overlap_(static_cast<size_t>(size / 2)) {
        forward_ = fftw_plan_dft_r2c_1d(size, samples_.values, raw(spectrum_.values), FFTW_PATIENT);
        inverse_ = fftw_plan_dft_c2r_1d(size, raw(spectrum_.values), samples_.values, FFTW_PATIENT);
        std::fill(samples_.values, samples_.values + size, 0.0);
        std::copy(taps.begin(), taps.end(), samples_.values);
        fftw_execute(forward_);
        for (int i = 0; i <= size / 2; ++i) response_[static_cast<size_t>(i)] = spectrum_.values[i] / static_cast<double>(size);
    }
    ~RealPeer() {
        fftw_destroy_plan(forward_);
        fftw_destroy_plan(inverse_);
    }
    RealPeer(const RealPeer &) = delete;
    RealPeer &operator=(const RealPeer &) = delete;

    void process(const float *in, float *out, int count) {
        const int half = size_ / 2;
        double *const w = reinterpret_cast<double *>(spectrum_.values);
        const double *const h = reinterpret_cast<const double *>(response_.data());
        for (int done = 0; done < count;) {
            const int length = std::min(half, count - done);
            for (int i = 0; i < length; ++i) samples_.values[i] = in[done + i];
            std::fill(samples_.values + length, samples_.values + size_, 0.0);
            fftw_execute(forward_);
            for (int i = 0; i < 2 * (half + 1); i += 2) {
                const double real = w[i] * h[i] - w[i + 1] * h[i + 1];
                w[i + 1] = w[i] * h[i + 1] + w[i + 1] * h[i];
                w[i] = real;
            }
            fftw_execute(inverse_);
            const double *const y = samples_.values;
            for (int i = 0; i < length; ++i) out[done + i] = static_cast<float>(overlap_[static_cast<size_t>(i)] + y[i]);
            for (int i = length; i < half; ++i) {
                overlap_[static_cast<size_t>(i - length)] = static_cast<float>(overlap_[static_cast<size_t>(i)] + y[i]);
            }
            for (int i = half; i < half + length; ++i) overlap_[static_cast<size_t>(i - length)] = static_cast<float>(y[i]);
            done += length;
        }
    }

  private:
    int size_;
    FftwArray<double> samples_;
    FftwArray<Complex> spectrum_;
    std::vector<Complex> response_;
    std::vector<float> overlap_;
    fftw_plan forward_;
    fftw_plan inverse_;
};

struct Filter : FftFirFilter {
    Filter() { create(); }
    ~Filter() { dispose(); }
    Filter(const Filter &) = delete;
    Filter &operator=(const Filter &) = delete;
};

void measure(int tapCount) {
    std::mt19937 random(1);
    std::uniform_real_distribution<float> uniform(-1.0f, 1.0f);
    std::vector<float> taps(static_cast<size_t>(tapCount));
    for (float &tap : taps) tap = uniform(random);
    std::vector<float> in(kBlock);
    for (float &sample : in) sample = uniform(random);
    std::vector<float> out(kBlock);

    int size = 2;
    while (size < 2 * tapCount) size *= 2;
    ComplexPeer complexPeer(taps, size);
    RealPeer realPeer(taps, size);
    plain::Fir plainForm;
    plainForm.load(taps);

    std::vector<Work> works{repeat("c2c", [&] { complexPeer.process(in.data(), out.data(), kBlock); }),
                            repeat("r2c", [&] { realPeer.process(in.data(), out.data(), kBlock); }),
                            repeat("plain", [&] { plainForm.process(in.data(), out.data(), kBlock); })};
    Filter filters[kInstructionSets];
    const int best = static_cast<int>(bestInstructionSet());
    for (int i = 0; i <= best; ++i) {
        const auto set = static_cast<InstructionSet>(i);
        // A filter keeps to the kernels that it was loaded with, and to its plan as long as the number of taps stays.
        selectFirKernels(set);
        FftFirFilter &filter = filters[i];
        filter.load(taps.data(), 0, 48000);
        filter.load(taps.data(), tapCount, 48000);
        works.push_back(repeat(instructionSetName(set), [&] { filter.process(in.data(), out.data(), kBlock); }));
    }
    const auto figures = timeInTurns(works, kRounds);

    const double complexTime = nanosecondsOf(figures, "c2c"), realTime = nanosecondsOf(figures, "r2c");
    std::printf("%d taps, transform %d: FFTW c2c %.1f ns, r2c %.1f ns, plain form %.1f ns\n", tapCount, size, complexTime, realTime,
                nanosecondsOf(figures, "plain"));
    for (int i = 0; i <= best; ++i) {
        const auto set = static_cast<InstructionSet>(i);
        const double ours = nanosecondsOf(figures, instructionSetName(set));
        const std::string what = named("filter", set);
        if (set == InstructionSet::avx512) {
            printRatio(what, ours, complexTime / ours, "faster than FFTW c2c", tapCount >= 512 ? 1.3 : 1.0, false);
            printRatio(what, ours, nanosecondsOf(figures, "plain") / ours, "faster than the plain form", 8, false);
        } else if (set == InstructionSet::sse2) {
            printRatio(what, ours, ours / complexTime, "FFTW c2c", 1.5, true);
        } else {
            printRatio(what, ours, complexTime / ours, "faster than FFTW c2c");
        }
        printRatio(what, ours, realTime / ours, "faster than FFTW r2c");
    }
}

}  // namespace

int main() {
    printHeading("FIR filter, blocks of 512 samples");
    for (const int tapCount : {32, 128, 512, 1024, 4096}) measure(tapCount);
    return 0;
}
