// SPDX-License-Identifier: MIT
//
// The filter and the analyser against a Fourier transform that other people have written and the world relies on: FFTW, in double
// and in single precision. The bits are judged elsewhere, by plain forms of the same arithmetic; this tells that the arithmetic
// filters and analyses at all, and how exactly.
#include <doctest/doctest.h>
#include <fftw3.h>

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>
#include <random>
#include <vector>

#include "measure/band_integration.h"
#include "measure/band_tables.h"
#include "tests/measure/fir_fixture.h"
#include "tests/measure/measure_sets.h"

using namespace vxcomn;

namespace {

constexpr double kHalfUlp = 0x1p-24;  // the relative error of rounding to single precision once

using Spectrum = std::vector<std::complex<double>>;

Spectrum transformOf(std::vector<double> samples) {
    Spectrum spectrum(samples.size() / 2 + 1);
    fftw_plan plan = fftw_plan_dft_r2c_1d(static_cast<int>(samples.size()), samples.data(),
                                          reinterpret_cast<fftw_complex *>(spectrum.data()), FFTW_ESTIMATE);
    fftw_execute(plan);
    fftw_destroy_plan(plan);
    return spectrum;
}

std::vector<double> samplesOf(Spectrum spectrum) {
    std::vector<double> samples(2 * (spectrum.size() - 1));
    fftw_plan plan = fftw_plan_dft_c2r_1d(static_cast<int>(samples.size()), reinterpret_cast<fftw_complex *>(spectrum.data()),
                                          samples.data(), FFTW_ESTIMATE);
    fftw_execute(plan);
    fftw_destroy_plan(plan);
    for (double &sample : samples) sample /= static_cast<double>(samples.size());
    return samples;
}

// The first samples.size() values of the convolution, through a transform that holds all of it.
std::vector<double> convolution(const std::vector<float> &samples, const std::vector<float> &taps) {
    size_t size = 2;
    while (size < samples.size() + taps.size()) size *= 2;
    std::vector<double> paddedSamples(samples.begin(), samples.end()), paddedTaps(taps.begin(), taps.end());
    paddedSamples.resize(size);
    paddedTaps.resize(size);
    Spectrum product = transformOf(std::move(paddedSamples));
    const Spectrum response = transformOf(std::move(paddedTaps));
    for (size_t i = 0; i < product.size(); ++i) product[i] *= response[i];
    std::vector<double> result = samplesOf(std::move(product));
    result.resize(samples.size());
    return result;
}

double largest(const std::vector<double> &values) {
    double result = 0.0;
    for (const double value : values) result = std::max(result, std::fabs(value));
    return result;
}

// The largest deviation of the filter from the convolution, as a share of the loudest sample. `length` 0 stands for a random cut.
double deviation(const std::vector<float> &taps, int length, size_t count, std::mt19937 &random) {
    fir::Filter filter(taps);
    const std::vector<float> samples = fir::randomValues(random, static_cast<int>(count));
    std::vector<float> filtered = samples;
    for (size_t done = 0; done < count;) {
        const size_t wanted = length != 0 ? static_cast<size_t>(length) : 1 + random() % 512;
        const size_t block = std::min(wanted, count - done);
        filter.process(filtered.data() + done, filtered.data() + done, static_cast<int>(block));
        done += block;
    }
    const std::vector<double> expected = convolution(samples, taps);
    std::vector<double> errors(count);
    for (size_t i = 0; i < count; ++i) errors[i] = static_cast<double>(filtered[i]) - expected[i];
    return largest(errors) / largest(expected);
}

// How often a sample is rounded to single precision on its way: once for each block that adds to it, since the tail of the earlier
// ones waits in single precision, and once when it leaves.
double roundings(int taps, int shortestBlock) {
    int half = 1;
    while (half < taps) half *= 2;
    return std::ceil(static_cast<double>(half) / shortestBlock) + 1.0;
}

struct Analyser : RealTimeAnalyser {
    explicit Analyser(int rate) { create(rate); }
    ~Analyser() { dispose(); }
    Analyser(const Analyser &) = delete;
    Analyser &operator=(const Analyser &) = delete;
};

// What the analyser hears: half a transform's samples, each kind a different spectrum.
std::vector<float> programme(size_t count, int kind) {
    std::mt19937 random(77);
    std::vector<float> samples = fir::randomValues(random, static_cast<int>(count));
    for (size_t i = 0; i < count; ++i) {
        const auto tone = static_cast<float>(std::sin(0.3 * static_cast<double>(i)) * 0.5);
        if (kind == 1) samples[i] = tone;
        if (kind == 2) samples[i] = tone + samples[i] * 0x1p-7F;
    }
    return samples;
}

double windowAt(size_t i, size_t count) {
    return 0.54 - 0.46 * std::cos(2.0 * std::numbers::pi * static_cast<double>(i) / static_cast<double>(count));
}

// Windowed, padded to twice the length, transformed: linear power of each bin, one side.
template <class Bin>
std::vector<double> powerOf(const std::vector<Bin> &spectrum) {
    const size_t half = spectrum.size() - 1;
    const double scale = 1.0 / (4.0 * static_cast<double>(half) * static_cast<double>(half));
    std::vector<double> power(spectrum.size());
    for (size_t k = 0; k <= half; ++k) {
        power[k] = std::norm(std::complex<double>(spectrum[k])) * scale * (k == 0 || k == half ? 1.0 : 2.0);
    }
    return power;
}

std::vector<double> powerInDouble(const std::vector<float> &samples) {
    std::vector<double> padded(2 * samples.size());
    for (size_t i = 0; i < samples.size(); ++i) padded[i] = static_cast<double>(samples[i]) * windowAt(i, samples.size());
    return powerOf(transformOf(std::move(padded)));
}

std::vector<double> powerInSingle(const std::vector<float> &samples) {
    std::vector<float> padded(2 * samples.size());
    for (size_t i = 0; i < samples.size(); ++i) padded[i] = samples[i] * static_cast<float>(windowAt(i, samples.size()));
    std::vector<std::complex<float>> spectrum(samples.size() + 1);
    fftwf_plan plan = fftwf_plan_dft_r2c_1d(static_cast<int>(padded.size()), padded.data(),
                                            reinterpret_cast<fftwf_complex *>(spectrum.data()), FFTW_ESTIMATE);
    fftwf_execute(plan);
    fftwf_destroy_plan(plan);
    return powerOf(spectrum);
}

// The largest deviation of a bin's power, as a share of the strongest bin's.
double deviation(const float *power, const std::vector<double> &expected) {
    std::vector<double> errors(expected.size());
    for (size_t k = 0; k < expected.size(); ++k) errors[k] = static_cast<double>(power[k]) - expected[k];
    return largest(errors) / largest(expected);
}

// The integrated bands of a spectrum, made by the library's own rule, which has a judge elsewhere.
std::vector<double> bandsOf(const std::vector<double> &power, int rate, int bandsPerOctave) {
    const float *edges = nullptr, *centres = nullptr;
    int tableSize = 0;
    BandTables::select(bandsPerOctave, &edges, &centres, &tableSize);
    const std::vector<float> rounded(power.begin(), power.end());
    std::vector<float> bands(static_cast<size_t>(tableSize) - 1);
    integrateBands(rounded.data(), static_cast<int>(power.size()) - 1, edges, centres, tableSize, bands.data(), rate, true);
    return {bands.begin(), bands.end()};
}

}  // namespace

TEST_CASE("in blocks of 512 the filter is as exact as its roundings to single precision, for 1 to 4096 taps") {
    fir::withEachInstructionSet([] {
        std::mt19937 random(11);
        std::vector<int> counts;
        for (int count = 1; count <= 40; ++count) counts.push_back(count);
        for (int count = 64; count <= 2048; count *= 2) counts.insert(counts.end(), {count - 1, count, count + 1});
        counts.insert(counts.end(), {1000, 3000, 4095, 4096});
        for (const int count : counts) {
            CAPTURE(count);
            CHECK_LT(deviation(fir::randomValues(random, count), 512, 5120, random), roundings(count, 512) * kHalfUlp);
        }
    });
}

TEST_CASE("in blocks of any length the filter is as exact as its roundings to single precision") {
    fir::withEachInstructionSet([] {
        std::mt19937 random(12);
        for (const int count : {1, 2, 31, 128, 300, 1024, 4096}) {
            for (const int length : {1, 7, 64, 441, 480, 511, 4096, 0}) {
                CAPTURE(count);
                CAPTURE(length);
                CHECK_LT(deviation(fir::randomValues(random, count), length, 4500, random),
                         roundings(count, length == 0 ? 1 : length) * kHalfUlp);
            }
        }
    });
}

// Each of the log2 N passes rounds a few times; the bound grants four roundings a pass, as a share of the strongest bin or band.
TEST_CASE("the analyser's power spectrum is FFTW's, in double and in single precision, for transforms of 256 to 65536") {
    onEachInstructionSet([] {
        for (int size = 256; size <= 65536; size *= 2) {
            for (const int kind : {0, 1, 2}) {
                CAPTURE(size);
                CAPTURE(kind);
                std::vector<float> samples = programme(static_cast<size_t>(size) / 2, kind);
                Analyser analyser(size);
                float *const channel = samples.data();
                analyser.feed(0, &channel, 1, size / 2);
                analyser.readBands(1, size, 12);
                const double bound = 4.0 * std::log2(size) * kHalfUlp;
                const std::vector<double> inDouble = powerInDouble(samples);
                CHECK_LT(deviation(analyser.work, inDouble), bound);
                CHECK_LT(deviation(analyser.work, powerInSingle(samples)), bound);
                CHECK_LT(deviation(analyser.bands, bandsOf(inDouble, size, 12)), bound);
            }
        }
    });
}
