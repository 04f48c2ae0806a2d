// SPDX-License-Identifier: MIT
//
// fir_bench: how fast FftFirFilter::process is on blocks of 512 samples, beside overlap-add of the same size made with FFTW in
// double precision (complex, and real) and beside the plain form of the tests.
//
// All contenders take turns within each round, so that a change of clock or load meets all of them; a figure is the median over the
// rounds, a ratio the median of the rounds' ratios.
#include <fftw3.h>

#include <algorithm>
#include <chrono>
#include <complex>
#include <cstdio>
#include <functional>
#include <random>
#include <string>
#include <vector>

#include "measure/fir_kernels.h"
#include "tests/measure/plain_fir.h"
#include "vxcomn/measurement_records.h"

namespace {

constexpr int kBlock = 512;
constexpr int kRounds = 41;
constexpr double kSliceNanoseconds = 300e3;

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

struct Contender {
    std::string name;
    std::function<void(float *)> block;  // out of place from the common input
    int repeats = 1;
    std::vector<double> times;  // nanoseconds a block, one a round
};

double now() {
    return std::chrono::duration<double, std::nano>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

double timeOf(Contender &contender, float *out) {
    const double start = now();
    for (int i = 0; i < contender.repeats; ++i) contender.block(out);
    return (now() - start) / contender.repeats;
}

double median(std::vector<double> values) {
    std::nth_element(values.begin(), values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2), values.end());
    return values[values.size() / 2];
}

double medianRatio(const Contender &a, const Contender &b) {
    std::vector<double> ratios;
    for (size_t i = 0; i < a.times.size(); ++i) ratios.push_back(a.times[i] / b.times[i]);
    return median(ratios);
}

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

    std::vector<Contender> contenders;
    contenders.push_back({"fftw c2c", [&](float *to) { complexPeer.process(in.data(), to, kBlock); }, 1, {}});
    contenders.push_back({"fftw r2c", [&](float *to) { realPeer.process(in.data(), to, kBlock); }, 1, {}});
    contenders.push_back({"plain", [&](float *to) { plainForm.process(in.data(), to, kBlock); }, 1, {}});
    Filter filters[vxcomn::kInstructionSets];
    for (int i = 0; i <= static_cast<int>(vxcomn::bestInstructionSet()); ++i) {
        const auto set = static_cast<vxcomn::InstructionSet>(i);
        vxcomn::selectFirKernels(set);
        filters[i].load(taps.data(), 0, 48000);
        filters[i].load(taps.data(), tapCount, 48000);
        FftFirFilter &filter = filters[i];
        contenders.push_back({vxcomn::instructionSetName(set), [&](float *to) { filter.process(in.data(), to, kBlock); }, 1, {}});
    }

    for (Contender &contender : contenders) {
        for (int i = 0; i < 3; ++i) timeOf(contender, out.data());
        contender.repeats = std::max(1, static_cast<int>(kSliceNanoseconds / timeOf(contender, out.data())));
    }
    for (int round = 0; round < kRounds; ++round) {
        for (Contender &contender : contenders) contender.times.push_back(timeOf(contender, out.data()));
    }
    std::printf("%5d taps, transform %d\n", tapCount, size);
    for (const Contender &contender : contenders) {
        std::printf("  %-9s %9.2f us", contender.name.c_str(), median(contender.times) / 1000.0);
        if (&contender >= &contenders[3]) {
            std::printf("   c2c / this %5.2f   r2c / this %5.2f   plain / this %6.2f", medianRatio(contenders[0], contender),
                        medianRatio(contenders[1], contender), medianRatio(contenders[2], contender));
        }
        std::printf("\n");
    }
}

}  // namespace

int main() {
    std::printf("FIR filter, block %d; medians of %d paired rounds; %s, g++ %s\n", kBlock, kRounds, fftw_version, __VERSION__);
    for (const int tapCount : {32, 128, 512, 1024, 4096}) measure(tapCount);
    return 0;
}
