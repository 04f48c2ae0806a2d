// SPDX-License-Identifier: MIT
//
// vx run and its neighbours doing what they are asked for, as a script sees it.
#include <doctest/doctest.h>

#include <nlohmann/json.hpp>

#include "tests/tools/vx_fixture.h"

using nlohmann::json;
using test::has;
using test::Outcome;
using test::VxFixture;

namespace {

double peakOf(const std::vector<float> &samples) {
    double peak = 0.0;
    for (const float sample : samples) peak = std::max(peak, std::fabs(static_cast<double>(sample)));
    return peak;
}

}  // namespace

TEST_CASE_FIXTURE(VxFixture, "bypass gives the input back to the bit, as float") {
    const std::string in = makeSine("in.wav", 440, 0.4);
    const Outcome run = vx({"run", in, "-o", path("out.wav"), "--set", "bypass=on", "-q"});
    CHECK(run.errors == "");
    CHECK(run.output == "");
    CHECK(run.status == 0);
    CHECK(readSound("out.wav") == readSound("in.wav"));
    CHECK(readBytes("out.wav") == readBytes("in.wav"));
}

TEST_CASE_FIXTURE(VxFixture, "a slider and the parameter that it stands for give the same samples") {
    const std::string in = makeSine("in.wav", 60, 0.1);
    // Half of the way from -54 to 6 dB is -24 dB, a gain of 0.0630957...
    CHECK(vx({"run", in, "-q", "-o", path("a.wav"), "--set", "bass=0.5"}).status == 0);
    CHECK(vx({"run", in, "-q", "-o", path("b.wav"), "--param", "3,-12=f32:0.06309573"}).status == 0);
    CHECK(vx({"run", in, "-q", "-o", path("c.wav"), "--set", "bass=-24dB"}).status == 0);
    CHECK(vx({"run", in, "-q", "-o", path("d.wav"), "--set", "bass=1"}).status == 0);
    CHECK(readBytes("a.wav") == readBytes("b.wav"));
    CHECK(readBytes("a.wav") == readBytes("c.wav"));
    CHECK(peakOf(readSound("d.wav")) > 2.0 * peakOf(readSound("a.wav")));
}

TEST_CASE_FIXTURE(VxFixture, "the block length does not change the samples, and the digest tells") {
    const std::string in = makeSine("in.wav", 1000, 0.3, 10007);
    const Outcome whole = vx({"run", in, "-q", "--digest", "--set", "voice=0.8", "--block", "512"});
    CHECK(whole.output.size() == 17);
    for (const char *block : {"1", "127", "480"}) {
        CAPTURE(block);
        CHECK(vx({"run", in, "-q", "--digest", "--set", "voice=0.8", "--block", block}).output == whole.output);
    }
    CHECK(vx({"run", in, "-q", "--digest", "--set", "voice=0.7"}).output != whole.output);
}

TEST_CASE_FIXTURE(VxFixture, "the library folds 7.1 into the layout that the engine gets") {
    const std::string in = makeSound("in.wav", 8, 0x63F, 4800, [](size_t, int channel) { return channel == 6 ? 0.5 : 0.0; });
    const Outcome run = vx({"run", in, "-o", path("out.wav"), "--layout", "stereo", "--set", "bypass=on", "--json"});
    REQUIRE(run.status == 0);
    const json report = json::parse(run.output);
    CHECK(report["format"]["in"]["layout"] == "stereo");
    CHECK(report["input"]["channels"] == 8);
    const std::vector<float> samples = readSound("out.wav");
    REQUIRE(samples.size() == 9600);
    CHECK(samples[0] == 0.5F * 0.7083F);  // side left into front left
    CHECK(samples[1] == 0.0F);
}

TEST_CASE_FIXTURE(VxFixture, "every platform name plays, the fixed-point ones to 24 bits") {
    const std::string in = makeSine("in.wav", 1000, 0.5, 4800);
    for (const char *platform : {"Float", "HiFi2", "iSST", "AIC326x"}) {
        CAPTURE(platform);
        const Outcome run = vx({"run", in, "--force", "-q", "-o", path("out.wav"), "--platform", platform, "--set", "bypass=on"});
        CHECK(run.errors == "");
        REQUIRE(run.status == 0);
        const std::vector<float> before = readSound("in.wav");
        const std::vector<float> after = readSound("out.wav");
        REQUIRE(after.size() == before.size());
        for (size_t i = 0; i < after.size(); ++i) CHECK(std::fabs(after[i] - before[i]) <= 0x1p-23F);
    }
}

TEST_CASE_FIXTURE(VxFixture, "--json is one document with levels, load and clipped samples") {
    const std::string in = makeSine("in.wav", 997, 2.0, 9600);
    const Outcome run = vx({"run", in, "--json", "--set", "bypass=on"});
    CHECK(run.errors == "");
    const json report = json::parse(run.output);
    CHECK(report["frames"] == 9600);
    CHECK(report["load"]["blocks"] == 20);
    CHECK(report["load"]["max"]["us"] >= report["load"]["p50"]["us"]);
    CHECK(report["levels"]["in"][0]["peak"].get<double>() == doctest::Approx(2.0).epsilon(0.001));
    // A sine of 2 exceeds 1 for two thirds of its time.
    CHECK(report["levels"]["in"][0]["clipped"].get<double>() == doctest::Approx(6400).epsilon(0.02));
}

TEST_CASE_FIXTURE(VxFixture, "--loop and --seconds lengthen and shorten the run") {
    const std::string in = makeSine("in.wav", 1000, 0.1, 1000);
    const auto frames = [&](std::vector<std::string> more) {
        more.insert(more.begin(), {"run", in, "--json"});
        return json::parse(vx(more).output)["frames"].get<int>();
    };
    CHECK(frames({}) == 1000);
    CHECK(frames({"--loop", "7"}) == 7000);
    CHECK(frames({"--seconds", "0.01"}) == 480);
    CHECK(frames({"--loop", "7", "--seconds", "0.1"}) == 4800);
}

TEST_CASE_FIXTURE(VxFixture, "--bits chooses the file's samples and --levels-csv has a row a block") {
    const std::string in = makeSine("in.wav", 1000, 0.5, 4800);
    REQUIRE(vx({"run", in, "-q", "-o", path("16.wav"), "--bits", "16", "--levels-csv", path("levels.csv")}).status == 0);
    CHECK(vx::openAudioFile(path("16.wav"))->format().encoding == "WAV, 16-bit PCM");
    const std::string table = readBytes("levels.csv");
    CHECK(table.starts_with("seconds,in_FL,in_FR,out_FL,out_FR,load_us\n0.000000,0.5,0.5,"));
    CHECK(std::count(table.begin(), table.end(), '\n') == 11);
}

TEST_CASE_FIXTURE(VxFixture, "progress is a line every tenth on standard error") {
    const std::string in = makeSine("in.wav", 1000, 0.5, 48000);
    const Outcome run = vx({"run", in});
    CHECK(has(run.errors, "run: 10 %\nrun: 20 %\n"));
    CHECK(has(run.errors, "run: 100 %\n"));
    CHECK(has(run.output, "100 blocks of 10.000 ms"));
}

TEST_CASE_FIXTURE(VxFixture, "colour is off in a pipe, on when asked for") {
    const std::string in = makeSine("in.wav", 1000, 0.5, 480);
    CHECK_FALSE(has(vx({"run", in}).output, "\033["));
    CHECK(has(vx({"run", in, "--color", "always"}).output, "\033[1m"));
    CHECK_FALSE(has(vx({"run", in, "--color", "never"}).output, "\033["));
}

TEST_CASE_FIXTURE(VxFixture, "names beyond ASCII reach the file system whole") {
    makeSine("gr\xC3\xBC\xC3\x9F \xE2\x99\xAA.wav", 440, 0.4, 480);
    CHECK(vx({"run", path("gr\xC3\xBC\xC3\x9F \xE2\x99\xAA.wav"), "-q", "-o", path("\xC3\xB6.wav")}).status == 0);
    CHECK(exists("\xC3\xB6.wav"));
}

TEST_CASE_FIXTURE(VxFixture, "vx join puts recordings side by side, or each in its turn") {
    const std::string left = makeSound("l.wav", 1, 0x4, 3, [](size_t frame, int) { return 0.25 + static_cast<double>(frame); });
    const std::string right = makeSound("r.wav", 1, 0x4, 2, [](size_t, int) { return 0.5; });
    REQUIRE(vx({"join", left, right, "-q", "-o", path("both.wav")}).status == 0);
    CHECK(readSound("both.wav") == std::vector<float>{0.25F, 0.5F, 1.25F, 0.5F, 2.25F, 0.0F});
    REQUIRE(vx({"join", "--in-turn", left, right, "-q", "-o", path("turn.wav")}).status == 0);
    CHECK(readSound("turn.wav") == std::vector<float>{0.25F, 0.0F, 1.25F, 0.0F, 2.25F, 0.0F, 0.0F, 0.5F, 0.0F, 0.5F});
    CHECK(vx({"join", left, "-q", "-o", path("no.wav"), "--layout", "5.1"}).status == 2);
    CHECK(vx({"join", path("both.wav"), right, "-q", "-o", path("no.wav")}).status == 3);
    CHECK_FALSE(exists("no.wav"));
}

TEST_CASE_FIXTURE(VxFixture, "vx levels: a sine at full scale is 0 dB in its octave, a gain is a change") {
    const std::string full = makeSine("full.wav", 1000, 1.0);
    const std::string half = makeSine("half.wav", 1000, 0.5);
    const json report = json::parse(vx({"levels", full, half, "--json"}).output);
    CHECK(report["before"]["bands"][5]["octaveHz"] == 1000.0);
    CHECK(std::fabs(report["before"]["bands"][5]["levelDb"].get<double>()) < 0.05);
    CHECK(report["changeDb"][5].get<double>() == doctest::Approx(-6.0206).epsilon(0.001));
    CHECK(report["before"]["bands"][0]["levelDb"].get<double>() < -50.0);
    const Outcome text = vx({"levels", full, half});
    CHECK(has(text.output, "1k Hz"));
    CHECK(has(text.output, "-6.0"));
}

TEST_CASE_FIXTURE(VxFixture, "vx levels says silent and not measurable instead of a wild number") {
    const std::string silent = makeSound("silent.wav", 1, 0x4, 48000, [](size_t, int) { return 0.0; });
    CHECK(has(vx({"levels", silent}).output, "silent"));
    std::string slow = readBytes("silent.wav");
    slow[24] = static_cast<char>(8000 & 0xFF);
    slow[25] = static_cast<char>(8000 >> 8);
    writeBytes("slow.wav", slow);
    const json report = json::parse(vx({"levels", path("slow.wav"), "--json"}).output);
    CHECK(report["before"]["bands"][9]["state"] == "not measurable");
    CHECK(report["before"]["bands"][9]["levelDb"].is_null());
    CHECK(report["before"]["bands"][5]["state"] == "silent");
}
