// SPDX-License-Identifier: MIT
//
// vx measure sweep and vx measure polarity from the shell, over simulated chains whose truth is known, and over files.
#include <cmath>

#include "tests/tools/measure_fixture.h"
#include "tools/vx_measure/sweep_measurement.h"

using nlohmann::json;
using test::has;
using test::MeasureFixture;
using test::Outcome;

namespace {

// What a notch of quality 2 at the fundamental passes of harmonic n, well below half the sample rate.
double passed(int n) {
    const double away = static_cast<double>(n) * n - 1.0;
    return away / std::sqrt(away * away + n / 2.0 * (n / 2.0));
}

int measuredBands(const json &result) {
    int count = 0;
    for (const auto &band : result["bands"]) count += band["state"] == "measured" ? 1 : 0;
    return count;
}

}  // namespace

TEST_CASE_FIXTURE(MeasureFixture, "a chain of known harmonics gives the known distortion within a tenth") {
    struct Case {
        const char *plant;
        double expected;
    };
    for (const Case &known :
         {Case{"h2=-30dB", std::pow(10.0, -1.5) * passed(2)}, Case{"h3=-30dB,delay=33ms", std::pow(10.0, -1.5) * passed(3)},
          Case{"h2=-20dB,delay=7ms,gain=-20dB,invert", 0.1 * passed(2)}}) {
        CAPTURE(known.plant);
        const json result = measure({"sweep", "--plant", known.plant, "--time", "20000"});
        CHECK(result["onset"] == true);
        int looked = 0;
        for (const auto &band : result["bands"]) {
            if (band["centreHz"] < 200.0 || band["highHz"] > 6000.0) continue;
            CAPTURE(band.dump());
            REQUIRE(band["state"] == "measured");
            CHECK(band["distortionPercent"] == doctest::Approx(100.0 * known.expected).epsilon(0.1));
            CHECK(band["distortionDb"] ==
                  doctest::Approx(20.0 * std::log10(band["distortionPercent"].get<double>() / 100.0)).epsilon(1e-6));
            ++looked;
        }
        CHECK(looked == 14);
    }
}

TEST_CASE_FIXTURE(MeasureFixture, "a chain without distortion is below the floor in every band, and the band says so") {
    const std::vector<std::vector<std::string>> sweeps = {{"--time", "5000"},
                                                          {"--time", "20000"},
                                                          {"--bands", "48", "--start", "200", "--time", "4000"},
                                                          {"--bands", "1", "--time", "4000"},
                                                          {"--bands", "12", "--lead-in", "120"}};
    for (const std::vector<std::string> &sweep : sweeps) {
        for (const char *plant : {"delay=0ms", "delay=4ms", "delay=10ms", "delay=300ms,gain=-30dB"}) {
            CAPTURE(sweep[1]);
            CAPTURE(plant);
            std::vector<std::string> arguments = {"sweep", "--plant", plant};
            arguments.insert(arguments.end(), sweep.begin(), sweep.end());
            const json result = measure(arguments, 1);
            CHECK(result["onset"] == true);
            CHECK(measuredBands(result) == 0);
            CHECK(has(test::MeasureFixture::bandAt(result, 1000.0)["why"].get<std::string>(), "below the floor of this sweep"));
            CHECK(MeasureFixture::bandAt(result, 1000.0)["distortionPercent"].is_null());
        }
    }
}

TEST_CASE("the floor falls as a sweep grows longer, and is larger at low frequencies and in the first band") {
    vx::SweepSettings settings;
    constexpr int kBand = 20;  // at 1 kHz
    const double usual = vx::sweepFloor(settings, kBand, 48000);
    CHECK(usual < 0.004);
    CHECK(vx::sweepFloor(settings, 5, 48000) > 2.0 * usual);
    CHECK(vx::sweepFloor(settings, 3, 48000) > 2.0 * vx::sweepFloor(settings, 4, 48000));
    settings.timeMs *= 2;
    CHECK(vx::sweepFloor(settings, kBand, 48000) == doctest::Approx(usual / 2.0).epsilon(0.01));
}

TEST_CASE_FIXTURE(MeasureFixture,
                  "bands that cannot be measured say why: outside the sweep, harmonics beyond half the rate, the last band") {
    const json result = measure({"sweep", "--plant", "h2=-20dB", "--start", "100", "--stop", "20000", "--time", "5000"});
    CHECK(bandAt(result, 50)["why"] == "outside the sweep");
    CHECK(bandAt(result, 1000)["state"] == "measured");
    CHECK(bandAt(result, 1000)["highestOrder"] == 21);
    CHECK(bandAt(result, 10000)["highestOrder"] == 2);
    CHECK(bandAt(result, 10000)["state"] == "measured");
    CHECK(bandAt(result, 12700)["why"] == "harmonic 2 lies beyond half the sample rate");
    CHECK(result["bands"].back()["why"] == "the library ends one band short of its table");
    CHECK(result["bands"].size() == 34);
}

TEST_CASE_FIXTURE(MeasureFixture, "every number of bands an octave ends, knowing its end") {
    for (const char *bands : {"1", "3", "6", "12", "24", "48"}) {
        CAPTURE(bands);
        const json result = measure(
            {"sweep", "--plant", "h2=-20dB,delay=20ms", "--bands", bands, "--start", "200", "--stop", "22000", "--time", "4000"});
        CHECK(result["onset"] == true);
        CHECK(bandAt(result, 2000)["distortionPercent"] == doctest::Approx(10.0 * passed(2)).epsilon(0.15));
    }
}

TEST_CASE_FIXTURE(MeasureFixture, "without an onset nothing is measured, and that is said") {
    const Outcome outcome =
        vx({"measure", "sweep", "--plant", "gain=-160dB", "--time", "1000", "--start", "100", "--stop", "5000"});
    CHECK(outcome.status == 1);
    CHECK(has(outcome.errors, "no onset came"));
    CHECK(has(outcome.output, "not measurable: no onset came"));
    const json result = measure({"sweep", "--plant", "noise=0dB,gain=-40dB", "--time", "1000"}, 1);
    CHECK(result["onset"] == false);
    CHECK(measuredBands(result) == 0);
}

TEST_CASE_FIXTURE(MeasureFixture,
                  "what the host plays, recorded with a delay and a lead of silence, gives what a simulated chain gives") {
    const std::vector<std::string> sweep = {"--start", "100", "--stop", "5000", "--time", "6000"};
    std::vector<std::string> play = {"measure", "sweep", "--play", path("play.wav")};
    play.insert(play.end(), sweep.begin(), sweep.end());
    const Outcome played = vx(play);
    CHECK(played.status == 0);
    CHECK(has(played.output, "--recorded in place of --play"));
    const std::vector<float> sound = readSound("play.wav");
    // A loudspeaker and a microphone: 5 % of second harmonic, 0.7 s late.
    constexpr size_t kLate = 33600;
    makeSound("heard.wav", 1, 0x4, sound.size() + kLate, [&](size_t i, int) {
        const double x = i < kLate ? 0.0 : static_cast<double>(sound[i - kLate]);
        return 0.5 * (x + 0.05 * 2.0 * x * x);
    });
    std::vector<std::string> heard = {"sweep", "--recorded", path("heard.wav")};
    heard.insert(heard.end(), sweep.begin(), sweep.end());
    const json result = measure(heard);
    // The squared sine holds a mean besides, which a notch passes: sqrt(1/2 + 1) of what the harmonic alone has, about.
    CHECK(bandAt(result, 1000)["distortionPercent"] > 4.5);
    CHECK(bandAt(result, 1000)["distortionPercent"] < 9.0);
    // Cut off in the middle: the rest says so.
    makeSound("cut.wav", 1, 0x4, sound.size() / 2,
              [&](size_t i, int) { return static_cast<double>(sound[i]) * (1.0 - 0.2 * static_cast<double>(sound[i])); });
    heard[2] = path("cut.wav");
    const json cut = measure(heard);
    CHECK(bandAt(cut, 300)["state"] == "measured");
    CHECK(bandAt(cut, 4000)["why"] == "the recording ended before the sweep came here");
}

TEST_CASE_FIXTURE(MeasureFixture, "the sweep on a further channel of a layout is measured there") {
    const json result =
        measure({"sweep", "--layout", "quad", "--channel", "3", "--plant", "h3=-20dB", "--time", "4000", "--start", "100"});
    CHECK(bandAt(result, 1000)["distortionPercent"] == doctest::Approx(10.0 * passed(3)).epsilon(0.1));
}

TEST_CASE_FIXTURE(MeasureFixture, "the sweep's CSV, plot and text hold what the JSON holds") {
    const Outcome outcome =
        vx({"measure", "sweep", "--plant", "h2=-30dB", "--time", "4000", "--csv", path("a.csv"), "--plot", path("b.png")});
    CHECK(outcome.status == 0);
    CHECK(has(outcome.output, "1 kHz"));
    CHECK(has(outcome.output, "mean magnitude behind a notch"));
    CHECK(has(outcome.output, "wrote " + path("b.png")));
    CHECK(readBytes("a.csv") == readBytes("b.csv"));
    const auto lines = readCsv("a.csv");
    REQUIRE(lines.size() == 35);
    CHECK(lines[0] == std::vector<std::string>{"centre_hz", "low_hz", "high_hz", "distortion_percent", "distortion_db",
                                               "highest_order", "floor_percent"});
    for (const auto &line : lines) CHECK(line.size() == 7);
    CHECK(lines[1][3] == "");  // outside the sweep
    CHECK((exists("b.png") || exists("b.png.gp")));
}

TEST_CASE_FIXTURE(MeasureFixture,
                  "polarity is told for chains that keep and invert it, from 0 to 300 ms, with noise, band limits and distortion") {
    for (const char *delay : {"0", "1.5", "12", "100", "299.9"})
        for (const char *rest : {"", ",noise=-50dB,gain=-10dB", ",band=80-16000", ",h2=-40dB,h3=-40dB,noise=-60dB"})
            for (const bool invert : {false, true}) {
                const std::string plant = "delay=" + std::string(delay) + "ms" + rest + (invert ? ",invert" : "");
                CAPTURE(plant);
                const json result = measure({"polarity", "--plant", plant});
                CHECK(result["polarity"] == (invert ? "inverted" : "kept"));
                // The tone begins downwards: the library gives -1 for a chain that keeps the polarity.
                CHECK(result["raw"] == (invert ? 1 : -1));
            }
}

TEST_CASE_FIXTURE(MeasureFixture, "polarity of half lengths from 15 to 63 ms is told, and nothing from silence") {
    for (const char *length : {"15", "20", "40", "63"}) CHECK(measure({"polarity", "--half-length", length})["polarity"] == "kept");
    CHECK(has(vx({"measure", "polarity"}).output, "polarity kept"));
    const json nothing = measure({"polarity", "--plant", "gain=-160dB"}, 1);
    CHECK(nothing["polarity"] == "not measurable");
    CHECK(nothing["why"] == "no onset came");
}

TEST_CASE_FIXTURE(MeasureFixture, "polarity of a recording, of a stereo one on its channel") {
    CHECK(vx({"measure", "polarity", "--play", path("tone.wav"), "-q"}).status == 0);
    const std::vector<float> tone = readSound("tone.wav");
    makeSound("stereo.wav", 2, 0x3, tone.size() + 9600, [&](size_t i, int channel) {
        return i < 9600 ? 0.0 : (channel == 0 ? 0.3 : -0.3) * static_cast<double>(tone[i - 9600]);
    });
    CHECK(measure({"polarity", "--recorded", path("stereo.wav")})["polarity"] == "kept");
    CHECK(measure({"polarity", "--recorded", path("stereo.wav"), "--layout", "stereo", "--channel", "1"})["polarity"] ==
          "inverted");
}
