// SPDX-License-Identifier: MIT
//
// What the elliptic band-stop tells of itself and of its parameters.
#include <doctest/doctest.h>

#include <cmath>
#include <limits>
#include <stdexcept>
#include <string>

#include "measure/elliptic_filter.h"
#include "measure/elliptic_math.h"

namespace {

constexpr double kPi = 3.14159265358979323846;

struct Row {
    int id;
    const char *shortName;
    const char *label;
    double minimum, maximum, defaultValue;
};

void checkRow(const Dsp::ParamInfo &info, const Row &row) {
    CAPTURE(row.id);
    CHECK_EQ(info.id, row.id);
    CHECK_EQ(std::string(info.shortName), row.shortName);
    CHECK_EQ(std::string(info.label), row.label);
    CHECK_EQ(info.minimum, row.minimum);
    CHECK_EQ(info.maximum, row.maximum);
    CHECK_EQ(info.defaultValue, row.defaultValue);
}

double control(const Dsp::ParamInfo &info, double value) {
    return info.toControl(info, value);
}
double value(const Dsp::ParamInfo &info, double position) {
    return info.toValue(info, position);
}

}  // namespace

TEST_CASE("the design names itself") {
    const Dsp::EllipticBandStop filter;
    const Dsp::Filter &base = filter;
    CHECK_EQ(static_cast<int>(base.kind()), 1);
    CHECK_EQ(base.name(), "Elliptic Band Stop");
    CHECK_EQ(base.parameterCount(), 6);
    CHECK_EQ(base.channelCount(), 1);
}

TEST_CASE("the design's six parameters are numbered as told") {
    const Dsp::EllipticBandStop filter;
    checkRow(filter.parameterInfo(0), {0, "Fs", "Sample Rate", 11025, 192000, 44100});
    checkRow(filter.parameterInfo(1), {7, "Order", "Order", 1, 6, 2});
    checkRow(filter.parameterInfo(2), {1, "Fc", "Center Frequency", 10, 22040, 2000});
    checkRow(filter.parameterInfo(3), {4, "BW", "Bandwidth (Hz)", 10, 22040, 1720});
    checkRow(filter.parameterInfo(4), {8, "Ripple", "Ripple dB", 0.001, 12, 0.01});
    checkRow(filter.parameterInfo(5), {10, "W", "Transition Width", -16, 4, 0});
}

TEST_CASE("a parameter index outside the table raises a logic error") {
    const Dsp::EllipticBandStop filter;
    for (const int index : {6, 7, 1000, -1}) {
        CHECK_THROWS_AS(filter.parameterInfo(index), std::logic_error);
        CHECK_THROWS_WITH(filter.parameterInfo(index), "invalid usage of ParamInfo");
    }
}

TEST_CASE("the family's seventeen parameters are as told") {
    const Row rows[] = {{0, "Fs", "Sample Rate", 11025, 192000, 44100},
                        {1, "Fc", "Cutoff Frequency", 10, 22040, 2000},
                        {2, "Q", "Resonance", -4, 4, 1},
                        {3, "BW", "Bandwidth (Octaves)", -4, 4, 1},
                        {4, "BW", "Bandwidth (Hz)", 10, 22040, 1720},
                        {5, "Gain", "Gain", -24, 24, -6},
                        {6, "Slope", "Slope", -2, 2, 1},
                        {7, "Order", "Order", 1, 6, 2},
                        {8, "Ripple", "Ripple dB", 0.001, 12, 0.01},
                        {9, "Stop", "Stopband dB", 3, 60, 48},
                        {10, "W", "Transition Width", -16, 4, 0},
                        {11, "Pd", "Pole Distance", 0, 1, 0.5},
                        {12, "Pa", "Pole Angle", 0, kPi, kPi / 2},
                        {13, "Pd", "Zero Distance", 0, 1, 0.5},
                        {14, "Pa", "Zero Angle", 0, kPi, kPi / 2},
                        {15, "A1", "Pole Real", -1, 1, 0.25},
                        {16, "B1", "Zero Real", -1, 1, -0.25}};
    for (const Row &row : rows) checkRow(Dsp::familyParamInfo(static_cast<Dsp::ParamId>(row.id)), row);
}

TEST_CASE("the linear scale runs from minimum to maximum") {
    const Dsp::ParamInfo gain = Dsp::familyParamInfo(Dsp::ParamId::gain);
    CHECK_EQ(control(gain, -24), 0.0);
    CHECK_EQ(control(gain, 24), 1.0);
    CHECK_EQ(control(gain, -6), 0.375);
    CHECK_EQ(value(gain, 0.375), -6.0);
}

TEST_CASE("the whole-number scale rounds the way back to the nearest") {
    const Dsp::ParamInfo order = Dsp::familyParamInfo(Dsp::ParamId::order);
    CHECK_EQ(control(order, 2), doctest::Approx(0.2));
    CHECK_EQ(value(order, 0.0), 1.0);
    CHECK_EQ(value(order, 0.2), 2.0);
    CHECK_EQ(value(order, 0.29), 2.0);
    CHECK_EQ(value(order, 0.31), 3.0);
    CHECK_EQ(value(order, 1.0), 6.0);
}

TEST_CASE("the logarithmic scale is linear over logarithms") {
    const Dsp::ParamInfo frequency = Dsp::familyParamInfo(Dsp::ParamId::frequency);
    CHECK_EQ(control(frequency, 10), 0.0);
    CHECK_EQ(control(frequency, 22040), doctest::Approx(1.0));
    CHECK_EQ(control(frequency, std::sqrt(10.0 * 22040.0)), doctest::Approx(0.5));
    for (const double hz : {10.0, 100.0, 2000.0, 22040.0})
        CHECK_EQ(value(frequency, control(frequency, hz)), doctest::Approx(hz).epsilon(1e-12));
}

TEST_CASE("the power-of-two scale has its range in exponents") {
    const Dsp::ParamInfo q = Dsp::familyParamInfo(Dsp::ParamId::q);
    CHECK_EQ(control(q, 1.0), doctest::Approx(0.5));
    CHECK_EQ(control(q, 16.0), doctest::Approx(1.0));
    CHECK_EQ(control(q, 1.0 / 16.0), doctest::Approx(0.0));
    CHECK_EQ(value(q, 0.0), doctest::Approx(1.0 / 16.0));
    CHECK_EQ(value(q, 0.75), doctest::Approx(4.0));
}

TEST_CASE("values print as whole numbers, frequencies, decibels or with three decimals") {
    using Dsp::ParamId;
    const auto text = [](ParamId id, double v) { return Dsp::familyParamInfo(id).toText(v); };
    CHECK_EQ(text(ParamId::order, 4), "4");
    CHECK_EQ(text(ParamId::sampleRate, 44100), "44100 Hz");
    CHECK_EQ(text(ParamId::frequency, 1999.999), "2000 Hz");
    CHECK_EQ(text(ParamId::bandwidthHz, 1720), "1720 Hz");
    CHECK_EQ(text(ParamId::rippleDb, 0.01), "0.010 dB");
    CHECK_EQ(text(ParamId::gain, -0.5), "-0.500 dB");
    CHECK_EQ(text(ParamId::gain, 1.0), "1.00 dB");
    CHECK_EQ(text(ParamId::gain, -6.0), "-6.00 dB");
    CHECK_EQ(text(ParamId::stopDb, 10.0), "10.0 dB");
    CHECK_EQ(text(ParamId::stopDb, 48.0), "48.0 dB");
    CHECK_EQ(text(ParamId::rolloff, -0.25), "-0.250");
    CHECK_EQ(text(ParamId::poleAngle, kPi / 2), "1.571");
    CHECK_EQ(text(ParamId::q, 1e308).size(), 313);
}

TEST_CASE("the design's own functions agree with the C library's") {
    const auto near = [](double a, double b) { return std::fabs(a - b) <= 4e-16 * std::max(1.0, std::fabs(b)); };
    for (int i = -4000; i <= 4000; ++i) {
        const double x = i * 0.2137;
        CAPTURE(x);
        REQUIRE(near(vxcomn::sine(x), std::sin(x)));
        REQUIRE(near(vxcomn::cosine(x), std::cos(x)));
        REQUIRE(std::fabs(vxcomn::tangent(x) - std::tan(x)) <= 1e-15 * (1.0 + std::tan(x) * std::tan(x)));
        const double power = x / 3.0;
        REQUIRE(std::fabs(vxcomn::exponential(power) - std::exp(power)) <= 1e-15 * std::exp(power));
        const double positive = std::exp(power / 2.0);
        REQUIRE(near(vxcomn::logarithm(positive), std::log(positive)));
    }
    const double infinity = std::numeric_limits<double>::infinity();
    CHECK_EQ(vxcomn::exponential(infinity), infinity);
    CHECK_EQ(vxcomn::exponential(-infinity), 0.0);
    CHECK_EQ(vxcomn::logarithm(0.0), -infinity);
    CHECK_EQ(vxcomn::logarithm(infinity), infinity);
    CHECK(std::isnan(vxcomn::logarithm(-1.0)));
    CHECK(std::isnan(vxcomn::sine(infinity)));
    CHECK(std::fabs(vxcomn::sine(1e300)) <= 1.0);
}
