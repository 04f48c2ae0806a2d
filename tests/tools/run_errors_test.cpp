// SPDX-License-Identifier: MIT
//
// Every way in which vx ends without a result: its exit status, that its message names what was found and what to do, and that no
// half file is left.
#include <doctest/doctest.h>

#include "tests/tools/vx_fixture.h"

using test::has;
using test::Outcome;
using test::VxFixture;

namespace {

struct ErrorFixture : VxFixture {
    std::string in = makeSine("in.wav", 1000, 0.5, 4800);

    void fails(std::vector<std::string> arguments, int status, const std::vector<std::string> &texts) {
        CAPTURE(arguments.back());
        const Outcome outcome = vx(arguments);
        CHECK(outcome.status == status);
        CHECK(outcome.output == "");
        for (const std::string &text : texts) {
            CAPTURE(text);
            CAPTURE(outcome.errors);
            CHECK(has(outcome.errors, text));
        }
        CHECK_FALSE(exists("out.wav"));
        CHECK(count(".part-") == 0);
    }
};

}  // namespace

TEST_CASE_FIXTURE(ErrorFixture, "usage errors end in 2 and say what is expected") {
    const std::string out = path("out.wav");
    fails({}, 2, {"subcommand"});
    fails({"play"}, 2, {"vx --help"});
    fails({"run"}, 2, {"INPUT", "vx run --help"});
    fails({"run", in, "--loud"}, 2, {"--loud"});
    fails({"run", in, "-o", out, "--block", "0"}, 2, {"--block"});
    fails({"run", in, "-o", out, "--block", "513"}, 2, {"--block"});
    fails({"run", in, "-o", out, "--block", "12x"}, 2, {"--block"});
    fails({"run", in, "-o", out, "--platform", "hifi2"}, 2, {"--platform"});
    fails({"run", in, "-o", out, "--layout", "6.1"}, 2, {"layout \"6.1\" is unknown; expected mono, stereo"});
    fails({"run", in, "-o", out, "--file-layout", "5.1"}, 2, {"has 6 speakers, and the file has 2 channels"});
    fails({"run", in, "-o", out, "--bits", "12"}, 2, {"--bits"});
    fails({"run", in, "-o", out, "--seconds", "0"}, 2, {"--seconds must be more than 0"});
    fails({"run", in, "-o", "-", "--json"}, 2, {"--json and -o - both want standard output"});
    fails({"run", in, "-o", out, "--plot", path("x.pdf")}, 2, {"ends in .svg or .png"});
    fails({"run", "-", "--loop", "2"}, 2, {"--loop needs a file"});
}

TEST_CASE_FIXTURE(ErrorFixture, "parameters and settings that are none end in 2 and say what is expected") {
    for (const char *text :
         {"3", "3,-12", "3,-12=", "3,-12=2.0", "3,-12=f32:", "3,-12=f32:nan", "3,-12=u8:256", "3,-12=u8:-1", "3,-12=hex:0",
          "3,-12=hex:0g", "x,-12=u8:1", "99,-12=u8:1", "3,257=u8:1", "3,-12,-1=u8:1", "1,2,3,4=u8:1", "3,-12=f32:1e39"})
        fails({"run", in, "-o", path("out.wav"), "--param", text}, 2, {std::string("--param ") + text + ": "});
    for (const char *text : {"bass", "bass=", "bass=1.5", "bass=-0.1", "bass=7dB", "bass=loud", "treble=1", "eq0=0.5", "eq11=0.5",
                             "eq3=+19dB", "bypass=2", "input-gain=2"})
        fails({"run", in, "-o", path("out.wav"), "--set", text}, 2, {std::string("--set ") + text + ": "});
}

TEST_CASE_FIXTURE(ErrorFixture, "an engine that is not there ends in 3 and says where was looked") {
    fails({"run", in, "-o", path("out.wav"), "--engine", "NoSuchEngine"}, 3,
          {"there is no NoSuchEngine.dll; looked for", "Put the engine beside vx"});
    fails({"run", in, "-o", path("out.wav"), "--engine", "NoSuchEngine", "--platform", "HiFi2"}, 3, {"NoSuchEngine.DSP.HiFi2.dll"});
}

TEST_CASE_FIXTURE(ErrorFixture, "an engine that declines, a module that is none and a file that is no module are told apart") {
    fails({"run", in, "-o", path("out.wav"), "--command-line", "/decline"}, 3, {"declined to run", "--command-line"});
    fails({"run", in, "-o", path("out.wav"), "--engine", "NoInitializeEngine"}, 3, {"does not export VXDSPAPI_Initialize"});
    writeBytes("Text.dll", "this is no module");
    fails({"run", in, "-o", path("out.wav"), "--engine", path("Text")}, 3, {"cannot be loaded: "});
}

TEST_CASE_FIXTURE(ErrorFixture, "a format that the engine does not take ends in 3 and tells what it offers") {
    // Top centre is none of the eight speakers that the sample engine knows.
    fails({"run", in, "-o", path("out.wav"), "--layout", "0x803"}, 3,
          {"SampleEngine: does not take", "as input (its answer is 1)", "try --layout stereo"});
    fails({"run", in, "-o", path("out.wav"), "--output-layout", "0x803"}, 3,
          {"as output (its answer is 2)", "try --output-layout stereo"});
    fails({"run", in, "-o", path("out.wav"), "--engine", "BareEngine", "--layout", "5.1"}, 3, {"it offers stereo"});
}

TEST_CASE_FIXTURE(ErrorFixture, "an input that is not there, no sound file, empty or truncated ends in 3") {
    const std::string out = path("out.wav");
    fails({"run", path("none.wav"), "-o", out}, 3, {"none.wav: cannot be opened"});
    writeBytes("text.wav", "RIFF, but not really a sound file");
    fails({"run", path("text.wav"), "-o", out}, 3, {"text.wav: offset 12: ", "expected \"RIFF\" and \"WAVE\""});
    makeSine("empty.wav", 1000, 0.5, 0);
    fails({"run", path("empty.wav"), "-o", out}, 3, {"holds no audio"});
    const std::string whole = readBytes("in.wav");
    writeBytes("cut.wav", whole.substr(0, whole.size() - 800));
    fails({"run", path("cut.wav"), "-o", out}, 3, {"truncated: it announces 4800 frames and holds 4700", "--seconds"});
    CHECK(vx({"run", path("cut.wav"), "-q", "--seconds", "0.0979"}).status == 0);
    fails({"levels", path("cut.wav")}, 3, {"truncated: it announces 4800 frames and holds 4700"});
}

TEST_CASE_FIXTURE(ErrorFixture, "nothing is written over unasked") {
    for (const char *name : {"kept.wav", "kept.csv", "kept.png"}) writeBytes(name, "mine");
    const std::vector<std::vector<std::string>> commands = {
        {"run", in, "-o", path("kept.wav")},        {"run", in, "--levels-csv", path("kept.csv")},
        {"run", in, "--plot", path("kept.png")},    {"run", in, "--plot", path("kept.svg")},
        {"levels", in, "--plot", path("kept.png")}, {"join", in, "--layout", "mono", "-o", path("kept.wav")}};
    for (const auto &command : commands) {
        const Outcome outcome = vx(command);
        CAPTURE(outcome.errors);
        CHECK(outcome.status != 0);
        for (const char *name : {"kept.wav", "kept.csv", "kept.png"}) CHECK(readBytes(name) == "mine");
    }
    CHECK(has(vx(commands.front()).errors, "kept.wav: exists already; nothing was written"));
    CHECK(vx({"run", in, "-q", "--force", "-o", path("kept.wav")}).status == 0);
    CHECK(readSound("kept.wav").size() == 9600);
}

TEST_CASE_FIXTURE(ErrorFixture, "an output folder that is not there ends in 4 and says so") {
    const Outcome outcome = vx({"run", in, "-o", path("no/such/out.wav")});
    CHECK(outcome.status == 4);
    CHECK(has(outcome.errors, "cannot be written: "));
    CHECK(has(outcome.errors, "create the folder first"));
}

TEST_CASE_FIXTURE(ErrorFixture, "without gnuplot the script and the numbers are left, and that is said") {
    const Outcome outcome = vx({"run", in, "--plot", path("load.png")}, {{"VX_GNUPLOT", "no-such-gnuplot"}});
    CHECK(outcome.status == 0);
    CHECK(has(outcome.errors, "gnuplot is not there"));
    CHECK(exists("load.png.gp"));
    CHECK_FALSE(exists("load.png"));
    CHECK(has(readBytes("load.png.gp"), "$data << EOD"));
    CHECK(readBytes("load.csv").starts_with("from_us,to_us,blocks,"));
    CHECK(count(".part-") == 0);
}

TEST_CASE_FIXTURE(ErrorFixture, "an answer of 0 to a parameter is passed on as a remark") {
    const Outcome outcome = vx({"run", in, "--param", "9,-12=f32:1"});
    CHECK(outcome.status == 0);
    CHECK(has(outcome.output, "answered with 0: the engine may not have taken it"));
}

TEST_CASE("help and version are no errors") {
    for (const std::vector<std::string> &arguments :
         {std::vector<std::string>{"--help"}, {"-h"}, {"-V"}, {"run", "--help"}, {"levels", "-h"}, {"join", "--help"}}) {
        const Outcome outcome = VxFixture::vx(arguments);
        CHECK(outcome.status == 0);
        CHECK(outcome.errors == "");
        CHECK(outcome.output != "");
    }
}
