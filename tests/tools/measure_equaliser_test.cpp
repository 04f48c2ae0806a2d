// SPDX-License-Identifier: MIT
//
// vx measure equaliser: curves that ten known bands made come back as those bands, and whatever is printed says the same.
#include <cmath>

#include "tests/tools/measure_fixture.h"
#include "tools/vx_measure/equaliser_fit.h"

using nlohmann::json;
using test::has;
using test::MeasureFixture;
using test::Outcome;
using vx::PeakBands;

namespace {

constexpr double kKnownDb[vx::kFitBands] = {3, -2, 4, 0, -6, 2.5, -1, 5, -3, 1.5};

// A room whose response is the opposite of the known bands', 7 dB louder.
std::string roomCsv(const PeakBands &bands) {
    std::string csv = "centre_hz,low_hz,high_hz,level_db\n";
    for (double hz = 20.0; hz < 20000.0; hz *= std::exp2(1.0 / 12.0))
        csv += vx::textf("%.6f,0,0,%.6f\n", hz, 7.0 - vx::equaliserResponse(bands, hz, 48000.0));
    return csv;
}

}  // namespace

TEST_CASE("one peaking filter has its gain at its frequency, half of it at its edges, and mirrors boost and cut") {
    const vx::PeakBand band = {1000.0, 2.0, 6.0};
    CHECK(vx::peakResponse(band, 1000.0, 192000.0) == doctest::Approx(6.0));
    CHECK(vx::peakResponse(band, 1000.0 * 1.28078, 192000.0) == doctest::Approx(3.0).epsilon(0.01));
    CHECK(vx::peakResponse(band, 20.0, 192000.0) < 0.01);
    CHECK(vx::peakResponse({1000.0, 2.0, -6.0}, 1234.0, 48000.0) == doctest::Approx(-vx::peakResponse(band, 1234.0, 48000.0)));
}

TEST_CASE_FIXTURE(MeasureFixture, "a curve that ten sliders made comes back as those sliders, with nothing left") {
    PeakBands bands = vx::sliderBands();
    for (size_t i = 0; i < bands.size(); ++i) bands[i].decibels = kKnownDb[i];
    writeBytes("room.csv", roomCsv(bands));
    const json fit = measure({"equaliser", "--fit", path("room.csv")});
    REQUIRE(fit["bands"].size() == 10);
    for (size_t i = 0; i < 10; ++i) {
        CAPTURE(i);
        CHECK(std::fabs(fit["bands"][i]["gainDb"].get<double>() - kKnownDb[i]) < 0.02);
    }
    CHECK(fit["levelDb"] == doctest::Approx(7.0).epsilon(0.005));
    CHECK(fit["before"]["rmsDb"] > 2.0);
    CHECK(fit["after"]["rmsDb"] < 0.01);
    CHECK(fit["bands"][2]["option"] == "--set eq3=+4.00dB");
    CHECK(fit["bands"][2]["filter"] == "Filter 3: ON PK Fc 125 Hz Gain 4.0 dB Q 1.44");
    CHECK(fit["bands"][3]["filter"] == "Filter 4: OFF PK Fc 250 Hz Gain 0.0 dB Q 1.44");
    CHECK(fit["preampDb"] < -3.0);
}

TEST_CASE_FIXTURE(MeasureFixture, "free bands fit what the sliders cannot") {
    PeakBands bands = {};
    for (size_t i = 0; i < bands.size(); ++i)
        bands[i] = {94.0 * std::exp2(0.7 * static_cast<double>(i)), 3.0, i % 2 == 0 ? 5.0 : -4.0};
    writeBytes("room.csv", roomCsv(bands));
    const json sliders = measure({"equaliser", "--fit", path("room.csv")});
    const json free = measure({"equaliser", "--fit", path("room.csv"), "--free"});
    CHECK(free["after"]["rmsDb"] < 0.5 * sliders["after"]["rmsDb"].get<double>());
    CHECK(free["after"]["rmsDb"] < 1.0);
    for (const auto &band : free["bands"]) CHECK_FALSE(has(band["filter"].get<std::string>(), "e+"));
    CHECK(free["bands"][0]["option"].get<std::string>().starts_with("--param 5,117=u8:1,f32:"));
}

TEST_CASE_FIXTURE(MeasureFixture, "a target other than flat is come to, and the printed deviation is that of the CSV") {
    PeakBands bands = vx::sliderBands();
    bands[5].decibels = 6.0;
    writeBytes("room.csv", roomCsv(vx::sliderBands()));  // flat
    std::string target = "# wanted\nfreq\tspl\n";
    for (double hz = 20.0; hz < 20000.0; hz *= 1.1)
        target += vx::textf("%.4f\t%.5f\n", hz, vx::equaliserResponse(bands, hz, 48000.0));
    writeBytes("target.txt", target);
    const Outcome outcome = vx({"measure", "equaliser", "--fit", path("room.csv"), "--target", path("target.txt"), "--csv",
                                path("fit.csv"), "--plot", path("fit.png")});
    CHECK(outcome.status == 0);
    CHECK(has(outcome.output, "Filter 6: ON PK Fc 1000 Hz Gain "));
    CHECK(has(outcome.output, "--set eq6=+"));
    const json fit = measure({"equaliser", "--fit", path("room.csv"), "--target", path("target.txt")});
    for (size_t i = 0; i < 10; ++i) CHECK(std::fabs(fit["bands"][i]["gainDb"].get<double>() - bands[i].decibels) < 0.1);
    CHECK(has(outcome.output, "deviation from the target"));
    const auto lines = readCsv("fit.csv");
    CHECK(lines[0] == std::vector<std::string>{"hz", "measured_db", "target_db", "corrected_db", "equaliser_db"});
    double square = 0.0;
    for (size_t i = 1; i < lines.size(); ++i) square += std::pow(std::stod(lines[i][3]) - std::stod(lines[i][2]), 2.0);
    CHECK(std::sqrt(square / static_cast<double>(lines.size() - 1)) < 0.1);
}

TEST_CASE_FIXTURE(MeasureFixture, "a measured response goes straight into the fit, and the fit makes it flatter") {
    CHECK(vx({"measure", "spectrum", "--plant", "band=150-6000", "--seconds", "10", "--csv", path("speaker.csv"), "-q"}).status ==
          0);
    const json fit = measure({"equaliser", "--fit", path("speaker.csv"), "--from", "60", "--to", "12000"});
    CHECK(fit["before"]["rmsDb"] > 2.5);
    CHECK(fit["after"]["rmsDb"] < 0.4 * fit["before"]["rmsDb"].get<double>());
}
