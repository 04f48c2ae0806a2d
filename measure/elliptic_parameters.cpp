// SPDX-License-Identifier: MIT
#include "measure/elliptic_parameters.h"

#include <array>
#include <charconv>
#include <cmath>

#include "measure/elliptic_math.h"

namespace Dsp {
namespace {

using vxcomn::exponential;
using vxcomn::kPi;
using vxcomn::logarithm;

double linearControl(double value, double minimum, double maximum) {
    return (value - minimum) / (maximum - minimum);
}
double linearValue(double position, double minimum, double maximum) {
    return (maximum - minimum) * position + minimum;
}

double toLinear(const ParamInfo &info, double value) {
    return linearControl(value, info.minimum, info.maximum);
}
double fromLinear(const ParamInfo &info, double position) {
    return linearValue(position, info.minimum, info.maximum);
}

double fromWhole(const ParamInfo &info, double position) {
    return std::floor(linearValue(position, info.minimum, info.maximum) + 0.5);
}

double logToBase(double value) {
    return logarithm(value) / logarithm(1.5);
}
double toLogarithmic(const ParamInfo &info, double value) {
    return linearControl(logToBase(value), logToBase(info.minimum), logToBase(info.maximum));
}
double fromLogarithmic(const ParamInfo &info, double position) {
    return exponential(linearValue(position, logToBase(info.minimum), logToBase(info.maximum)) * logarithm(1.5));
}

// The range of a power of two is in exponents.
double toPowerOfTwo(const ParamInfo &info, double value) {
    return linearControl(logarithm(value) / logarithm(2.0), info.minimum, info.maximum);
}
double fromPowerOfTwo(const ParamInfo &info, double position) {
    return exponential(linearValue(position, info.minimum, info.maximum) * logarithm(2.0));
}

// With a point whatever the language of the process is.
std::string fixed(double value, int decimals) {
    std::array<char, 400> text;
    const auto result = std::to_chars(text.data(), text.data() + text.size(), value, std::chars_format::fixed, decimals);
    return std::string(text.data(), result.ptr);
}

std::string wholeText(double value) {
    return fixed(value, 0);
}
std::string frequencyText(double value) {
    return fixed(value, 0) + " Hz";
}
std::string decibelText(double value) {
    const double magnitude = std::fabs(value);
    return fixed(value, magnitude < 1.0 ? 3 : magnitude < 10.0 ? 2 : 1) + " dB";
}
std::string plainText(double value) {
    return fixed(value, 3);
}

constexpr int32_t idOf(ParamId id) {
    return static_cast<int32_t>(id);
}

constexpr ParamInfo kInfos[kParamIds] = {
    {idOf(ParamId::sampleRate), "Fs", "Sample Rate", 11025, 192000, 44100, toLinear, fromLinear, frequencyText},
    {idOf(ParamId::frequency), "Fc", "Cutoff Frequency", 10, 22040, 2000, toLogarithmic, fromLogarithmic, frequencyText},
    {idOf(ParamId::q), "Q", "Resonance", -4, 4, 1, toPowerOfTwo, fromPowerOfTwo, plainText},
    {idOf(ParamId::bandwidth), "BW", "Bandwidth (Octaves)", -4, 4, 1, toPowerOfTwo, fromPowerOfTwo, plainText},
    {idOf(ParamId::bandwidthHz), "BW", "Bandwidth (Hz)", 10, 22040, 1720, toLogarithmic, fromLogarithmic, frequencyText},
    {idOf(ParamId::gain), "Gain", "Gain", -24, 24, -6, toLinear, fromLinear, decibelText},
    {idOf(ParamId::slope), "Slope", "Slope", -2, 2, 1, toPowerOfTwo, fromPowerOfTwo, plainText},
    {idOf(ParamId::order), "Order", "Order", 1, 6, 2, toLinear, fromWhole, wholeText},
    {idOf(ParamId::rippleDb), "Ripple", "Ripple dB", 0.001, 12, 0.01, toLinear, fromLinear, decibelText},
    {idOf(ParamId::stopDb), "Stop", "Stopband dB", 3, 60, 48, toLinear, fromLinear, decibelText},
    {idOf(ParamId::rolloff), "W", "Transition Width", -16, 4, 0, toLinear, fromLinear, plainText},
    {idOf(ParamId::poleDistance), "Pd", "Pole Distance", 0, 1, 0.5, toLinear, fromLinear, plainText},
    {idOf(ParamId::poleAngle), "Pa", "Pole Angle", 0, kPi, kPi / 2, toLinear, fromLinear, plainText},
    // Kept: the zero's distance and angle bear the pole's short names.
    {idOf(ParamId::zeroDistance), "Pd", "Zero Distance", 0, 1, 0.5, toLinear, fromLinear, plainText},
    {idOf(ParamId::zeroAngle), "Pa", "Zero Angle", 0, kPi, kPi / 2, toLinear, fromLinear, plainText},
    {idOf(ParamId::poleReal), "A1", "Pole Real", -1, 1, 0.25, toLinear, fromLinear, plainText},
    {idOf(ParamId::zeroReal), "B1", "Zero Real", -1, 1, -0.25, toLinear, fromLinear, plainText},
};

}  // namespace

ParamInfo familyParamInfo(ParamId id) {
    return kInfos[idOf(id)];
}

ParamInfo centerFrequencyInfo() {
    ParamInfo info = familyParamInfo(ParamId::frequency);
    info.label = "Center Frequency";
    return info;
}

}  // namespace Dsp
