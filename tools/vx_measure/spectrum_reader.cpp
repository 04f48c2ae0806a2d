// SPDX-License-Identifier: MIT
#include "tools/vx_measure/spectrum_reader.h"

#include <VXDSPAPI.h>

#include <bit>
#include <cmath>
#include <limits>

#include "tools/vx/text.h"
#include "tools/vx_measure/data_bytes.h"

namespace vx {

namespace {

constexpr int kUsualSize = 65536;
constexpr int kSmallestSize = 256;
// Mean square of the window 0.54 - 0.46 cos, times the half of the transform that it covers: what the library's powers add up to
// for a signal of mean square 1.
constexpr double kPowerScale = 0.5 * (0.54 * 0.54 + 0.46 * 0.46 / 2.0);
constexpr double kSineMeanSquare = 0.5;
// The window's noise bandwidth and the half of its main lobe, in bins of the samples that it covers.
constexpr double kNoiseBandwidth = 1.363;
constexpr double kHalfLobe = 2.0;
constexpr double kSilenceDb = -180.0;

}  // namespace

int analyserOf(const std::string &tap) {
    return tap == "input" ? 0 : tap == "output" ? 1 : 2;
}

int fftSizeOf(const SpectrumSettings &settings, int rate) {
    const auto largest = static_cast<int>(std::bit_floor(static_cast<unsigned>(2 * rate)));
    if (settings.fftSize == 0) return std::min(kUsualSize, largest);
    if (!std::has_single_bit(static_cast<unsigned>(settings.fftSize)) || settings.fftSize < kSmallestSize ||
        settings.fftSize > largest)
        throw Failure(ExitStatus::usage,
                      textf("--fft %d: expected a power of two from %d to %d", settings.fftSize, kSmallestSize, largest));
    return settings.fftSize;
}

std::string spectrumDefinition(const SpectrumSettings &settings, int rate) {
    const int size = fftSizeOf(settings, rate);
    return makeBandGrid(settings.bandsPerOctave).name() +
           (settings.atCentres ? " bands, power per Hz at the centre" : " bands, power integrated between the edges") +
           textf("; Hamming window of %d samples, zero-padded to %d; 0 dB: sine at full scale", size / 2, size) +
           (settings.atCentres ? ", per Hz" : "");
}

SpectrumReader::SpectrumReader(Rig &rig, const SpectrumSettings &settings, int analyser)
    : rig_(rig),
      settings_(settings),
      analyser_(analyser),
      fftSize_(fftSizeOf(settings, rig.rate())),
      grid_(makeBandGrid(settings.bandsPerOctave)),
      power_(grid_.centres.size()) {
    const uint32_t choice = settings.listen == "0" ? 0 : settings.listen == "1" ? 1 : 2;
    rig.command(VXDSP_DATA_RTA_CHANNEL, DataWriter().u8(choice).bytes());
    rig.command(VXDSP_DATA_RTA_ENABLE, DataWriter().u8(static_cast<uint32_t>(analyser)).u8(1).bytes());
}

const float *SpectrumReader::readout() {
    DataWriter bytes;
    bytes.u8(static_cast<uint32_t>(analyser_)).u8(0).u8(settings_.atCentres ? 0 : 1);
    bytes.u32(static_cast<uint32_t>(fftSize_)).u32(static_cast<uint32_t>(settings_.bandsPerOctave));
    return DataReader(rig_.command(VXDSP_DATA_RTA_READ, bytes.bytes())).floats();
}

void SpectrumReader::skip() {
    readout();
}

void SpectrumReader::read() {
    const float *bands = readout();
    for (size_t i = 0; i < power_.size(); ++i) power_[i] += static_cast<double>(bands[i]);
    ++readouts_;
}

std::string SpectrumReader::whyNot(size_t band) const {
    const double binHz = static_cast<double>(rig_.rate()) / (fftSize_ / 2);
    const double width = grid_.edges[band + 1] - grid_.edges[band];
    if (grid_.edges[band + 1] > rig_.rate() / 2.0) return "reaches beyond half the sample rate";
    if (readouts_ == 0) return "too little was heard for one transform";
    if (grid_.edges[band] < kHalfLobe * binHz) return "lies in the window's lobe around 0 Hz";
    if (!settings_.atCentres && width < kNoiseBandwidth * binHz)
        return textf("%.2g Hz wide, and the window resolves %.2g Hz", width, kNoiseBandwidth * binHz);
    // Kept: the library's interpolation gives 0 for a centre that falls on a bin exactly.
    const double bins = static_cast<float>(grid_.centres[band]) * static_cast<float>(fftSize_) / static_cast<float>(rig_.rate());
    if (settings_.atCentres && bins == std::floor(bins)) return "its centre falls on a bin exactly, where the library reads 0";
    return "";
}

std::vector<SpectrumBand> SpectrumReader::bands() const {
    std::vector<SpectrumBand> bands;
    const double perHz = settings_.atCentres ? static_cast<double>(fftSize_) / rig_.rate() : 1.0;
    for (size_t i = 0; i < power_.size(); ++i) {
        SpectrumBand band = {grid_.centres[i], grid_.edges[i], grid_.edges[i + 1], 0.0, whyNot(i)};
        const double meanSquare = power_[i] / std::max(readouts_, 1) / kPowerScale * perHz;
        const double decibels = 10.0 * std::log10(meanSquare / kSineMeanSquare);
        band.levelDb = !band.why.empty()       ? std::numeric_limits<double>::quiet_NaN()
                       : decibels < kSilenceDb ? -std::numeric_limits<double>::infinity()
                                               : decibels;
        bands.push_back(band);
    }
    return bands;
}

}  // namespace vx
