// SPDX-License-Identifier: MIT
//
// vx measure spectrum, levels and load, and vx signal, as a script sees them.
#include <cmath>
#include <numbers>

#include "tests/tools/measure_fixture.h"

using nlohmann::json;
using test::has;
using test::MeasureFixture;
using test::Outcome;

TEST_CASE_FIXTURE(MeasureFixture, "pink noise is flat in octaves within 0.7 dB from 63 Hz to 16 kHz") {
    const json result = measure({"spectrum", "--bands", "1", "--seconds", "60"});
    CHECK(result["signal"] == "pink noise");
    const double middle = bandAt(result, 1000)["levelDb"];
    int looked = 0;
    for (double hz = 62.5; hz < 16001.0; hz *= 2.0, ++looked) {
        CAPTURE(hz);
        CHECK(std::fabs(bandAt(result, hz)["levelDb"].get<double>() - middle) < 0.7);
    }
    CHECK(looked == 9);
}

TEST_CASE_FIXTURE(MeasureFixture,
                  "a sine of full scale is 0 dB in its band and nothing elsewhere, at every tap and transform size") {
    for (const char *tap : {"input", "output", "record"})
        for (const char *fft : {"4096", "16384", "65536"}) {
            CAPTURE(tap);
            CAPTURE(fft);
            const json result = measure({"spectrum", "--signal", "sine", "--tap", tap, "--fft", fft, "--seconds", "2"});
            CHECK(std::fabs(bandAt(result, 1000)["levelDb"].get<double>()) < 0.1);
            CHECK(bandAt(result, 4000)["levelDb"] < -50.0);
            CHECK(result["fftSize"] == std::stoi(fft));
        }
}

TEST_CASE_FIXTURE(MeasureFixture, "white noise at the centres is flat per Hz, and a centre that falls on a bin is not measurable") {
    const json result = measure({"spectrum", "--signal", "white", "--centres", "--seconds", "60", "--bands", "3", "--fft", "4096"});
    // Uniform over a width of 2: a mean square of 1/3 about its mean, over 24 kHz.
    const double expected = 10.0 * std::log10(1.0 / 3.0 / 24000.0 / 0.5);
    double sum = 0.0;
    int counted = 0;
    for (const auto &band : result["bands"])
        if (band["state"] == "measured" && band["lowHz"] > 500.0) {
            sum += std::pow(10.0, band["levelDb"].get<double>() / 10.0);
            ++counted;
        }
    CHECK(counted > 12);
    CHECK(10.0 * std::log10(sum / counted) == doctest::Approx(expected).epsilon(0.02));
    // 1 kHz lies on bin 128 of 4096 at 32000 Hz.
    const json onBin =
        measure({"spectrum", "--signal", "white", "--centres", "--rate", "32000", "--fft", "4096", "--seconds", "2"});
    CHECK(has(bandAt(onBin, 1000)["why"].get<std::string>(), "falls on a bin exactly"));
}

TEST_CASE_FIXTURE(MeasureFixture, "the response of a chain is what its parts say") {
    const json result = measure({"spectrum", "--plant", "delay=50ms,gain=-6dB,band=100-8000", "--seconds", "20"});
    const auto second = [](double ratio) { return -10.0 * std::log10(1.0 + std::pow(ratio, 4.0)); };
    for (const double hz : {50.0, 100.0, 200.0, 1000.0, 4000.0}) {
        CAPTURE(hz);
        const json band = bandAt(result, hz);
        const double centre = band["centreHz"];
        CHECK(std::fabs(band["responseDb"].get<double>() - (-6.0 + second(100.0 / centre) + second(centre / 8000.0))) < 0.5);
    }
    CHECK(has(bandAt(measure({"spectrum", "--fft", "1024", "--seconds", "2"}), 400)["why"].get<std::string>(),
              "the window resolves"));
}

TEST_CASE_FIXTURE(MeasureFixture, "a band of the engine's equaliser shows in the response with the gain that was set") {
    const json lifted = measure({"spectrum", "--set", "input-gain=-20dB", "--set", "eq3=+6dB", "--seconds", "5"});
    // A third octave around the peak of a bell holds a little less than the peak.
    CHECK(std::fabs(bandAt(lifted, 125)["responseDb"].get<double>() + 14.2) < 0.3);
    CHECK(std::fabs(bandAt(lifted, 4000)["responseDb"].get<double>() + 20.0) < 0.1);
    CHECK(std::fabs(bandAt(measure({"spectrum", "--seconds", "2"}), 125)["responseDb"].get<double>()) < 0.001);  // bypassed
}

TEST_CASE_FIXTURE(MeasureFixture, "bands beyond half the rate, too narrow for the window and at 0 Hz say why; silence is silent") {
    const json result = measure({"spectrum", "--rate", "16000", "--bands", "12", "--seconds", "5"});
    CHECK(bandAt(result, 10000)["why"] == "reaches beyond half the sample rate");
    CHECK(has(bandAt(result, 10)["why"].get<std::string>(), "Hz wide, and the window resolves"));
    CHECK(bandAt(result, 1000)["state"] == "measured");
    const json silence = measure({"spectrum", "--signal", "silence", "--seconds", "2"});
    CHECK(bandAt(silence, 1000)["state"] == "silent");
    CHECK(bandAt(silence, 1000)["levelDb"].is_null());
    CHECK(has(vx({"measure", "spectrum", "--signal", "silence", "--seconds", "2"}).output, "silent"));
    const json brief = measure({"spectrum", "--recorded", makeSine("brief.wav", 1000, 0.5, 2400, 1)}, 1);
    CHECK(bandAt(brief, 1000)["why"] == "too little was heard for one transform");
}

TEST_CASE_FIXTURE(MeasureFixture, "a sound file is measured at its own rate and level") {
    const std::string in = makeSine("in.wav", 1000, 0.5, 96000, 2);
    const json played = measure({"spectrum", "--input", in, "--layout", "stereo", "--tap", "output", "--fft", "16384"});
    CHECK(bandAt(played, 1000)["levelDb"] == doctest::Approx(-6.02).epsilon(0.02));
    makeSine("mono.wav", 1000, 0.5, 96000, 1);
    const json heard = measure({"spectrum", "--recorded", path("mono.wav"), "--fft", "16384"});
    CHECK(bandAt(heard, 1000)["levelDb"] == doctest::Approx(-6.02).epsilon(0.02));
    CHECK_FALSE(bandAt(heard, 1000).contains("responseDb"));
}

TEST_CASE_FIXTURE(MeasureFixture, "the spectrum's CSV has its columns, and standard output takes it") {
    const Outcome outcome = vx({"measure", "spectrum", "--seconds", "2", "--csv", "-"});
    CHECK(outcome.status == 0);
    CHECK(outcome.output.starts_with("centre_hz,low_hz,high_hz,level_db,response_db\n"));
    CHECK(vx({"measure", "spectrum", "--seconds", "2", "--tap", "input", "--rate", "32000", "--csv", path("a.csv"), "-q"}).output ==
          "");
    const auto lines = readCsv("a.csv");
    REQUIRE(lines.size() == 35);
    CHECK(lines[0] == std::vector<std::string>{"centre_hz", "low_hz", "high_hz", "level_db"});
    CHECK(lines[34][3] == "");
}

TEST_CASE_FIXTURE(MeasureFixture,
                  "live bars come a picture for every tenth of a second, and a band's bar is as long as its level says") {
    const Outcome outcome = vx({"measure", "spectrum", "--live", "--signal", "sine", "--seconds", "1", "--bands", "1"});
    CHECK(outcome.status == 0);
    size_t pictures = 0;
    for (size_t at = outcome.output.find("bars from"); at != std::string::npos; at = outcome.output.find("bars from", at + 1))
        ++pictures;
    CHECK(pictures == 9);  // the first once the window is full
    const size_t line = outcome.output.find("    1 kHz");
    REQUIRE(line != std::string::npos);
    CHECK(outcome.output.substr(line, outcome.output.find('\n', line) - line).find("##########") != std::string::npos);
    CHECK_FALSE(has(outcome.output, "\033"));
}

TEST_CASE_FIXTURE(MeasureFixture, "levels reads the three meters: the signal, and what the chain makes of it") {
    const json result = measure({"levels", "--signal", "sine", "--layout", "stereo", "--plant", "gain=-6dB", "--seconds", "0.5"});
    REQUIRE(result["peaks"].size() == 6);
    CHECK(result["peaks"][0]["meter"] == "input 0");
    CHECK(result["peaks"][0]["peakDb"] == doctest::Approx(0.0).epsilon(0.01));
    CHECK(result["peaks"][3]["meter"] == "output 1");
    CHECK(result["peaks"][5]["meter"] == "record 1");
    CHECK(result["peaks"][5]["peakDb"] == doctest::Approx(-6.0).epsilon(0.01));
    const Outcome loud = vx({"measure", "levels", "--signal", "white", "--seconds", "1", "--csv", path("levels.csv")});
    CHECK(has(loud.output, "above full scale"));
    CHECK(readCsv("levels.csv")[0] == std::vector<std::string>{"meter", "peak", "peak_db"});
    CHECK(std::stod(readCsv("levels.csv")[1][1]) > 1.9);
    CHECK(has(vx({"measure", "levels", "--signal", "silence", "--seconds", "1"}).output, "silent"));
    // Eight channels in, four of them on the capture side.
    CHECK(measure({"levels", "--layout", "7.1", "--seconds", "0.2"})["peaks"].size() == 20);
}

TEST_CASE_FIXTURE(MeasureFixture, "load tells both functions, and what is too short for a reading") {
    const json result = measure({"load", "--seconds", "1.1", "--csv", path("load.csv")});
    REQUIRE(result["functions"].size() == 2);
    CHECK(result["functions"][0]["function"] == "VXDSPAPI_Process");
    CHECK(result["functions"][0]["readings"] == 4);
    for (const auto &function : result["functions"]) {
        CHECK(function["medianPercent"] > 0.0);
        CHECK(function["lowestPercent"] <= function["medianPercent"]);
        CHECK(function["medianPercent"] <= function["highestPercent"]);
    }
    CHECK(readCsv("load.csv").size() == 3);
    const json brief = measure({"load", "--seconds", "0.1"}, 1);
    CHECK(brief["functions"][1]["state"] == "not measurable");
}

TEST_CASE_FIXTURE(MeasureFixture, "vx signal writes each signal, as long and as loud as it says") {
    for (const char *name : {"white", "pink", "sine"}) {
        CAPTURE(name);
        const Outcome outcome =
            vx({"signal", name, "-o", path(std::string(name) + ".wav"), "--seconds", "1.5", "--layout", "stereo"});
        CHECK(outcome.status == 0);
        CHECK(readSound(std::string(name) + ".wav").size() == 2 * 72000);
    }
    double mean = 0.0;
    for (const float sample : readSound("white.wav")) {
        REQUIRE(sample >= 0.0F);
        mean += static_cast<double>(sample) / 144000.0;
    }
    CHECK(mean == doctest::Approx(1.0).epsilon(0.01));
    const std::vector<float> sine = readSound("sine.wav");
    CHECK(sine[2 * 12] == doctest::Approx(1.0));  // a quarter of 1 kHz
    CHECK(sine[0] == 0.0F);
    CHECK(readSound("pink.wav")[200] != readSound("pink.wav")[201]);
    const Outcome sweep = vx({"signal", "sweep", "-o", path("sweep.wav"), "--start", "100", "--stop", "1000", "--time", "1000"});
    CHECK(has(sweep.output, "sweep from 100 Hz to 1000 Hz"));
    const std::vector<float> samples = readSound("sweep.wav");
    CHECK(samples.size() > 48000);
    CHECK(samples.size() < 60000);
    CHECK(vx({"signal", "white", "-o", path("w.wav"), "--bits", "16", "--seconds", "0.1"}).errors.find("were clipped") !=
          std::string::npos);
    const Outcome pipe = vx({"signal", "sine", "-o", "-", "--seconds", "0.1"});
    CHECK(pipe.output.starts_with("RIFF"));
}
