// SPDX-License-Identifier: MIT
//
// Every way in which vx measure and vx signal end without a result.
#include "tests/tools/measure_fixture.h"

using test::has;
using test::MeasureFixture;
using test::Outcome;

namespace {

struct MeasureErrors : MeasureFixture {
    void fails(const std::vector<std::string> &arguments, int status, const std::vector<std::string> &texts) {
        std::string line;
        for (const std::string &argument : arguments) line += argument + " ";
        CAPTURE(line);
        const Outcome outcome = vx(arguments);
        CAPTURE(outcome.errors);
        CHECK(outcome.status == status);
        CHECK(outcome.output == "");
        for (const std::string &text : texts) {
            CAPTURE(text);
            CHECK(has(outcome.errors, text));
        }
        CHECK(count(".part-") == 0);
    }
};

}  // namespace

TEST_CASE_FIXTURE(MeasureErrors, "usage errors of vx measure end in 2 and say what is expected") {
    fails({"measure"}, 2, {"subcommand"});
    fails({"measure", "hum"}, 2, {"subcommand"});
    fails({"measure", "sweep", "--loud"}, 2, {"--loud"});
    fails({"measure", "sweep", "--lead-in", "128"}, 2, {"--lead-in"});
    fails({"measure", "sweep", "--bands", "2"}, 2, {"--bands"});
    fails({"measure", "sweep", "--channel", "4"}, 2, {"--channel"});
    fails({"measure", "sweep", "--channel", "1"}, 2, {"--channel 1", "choose another --layout"});
    fails({"measure", "sweep", "--start", "1000", "--stop", "1000"}, 2, {"--start 1000 must be below --stop 1000"});
    fails({"measure", "sweep", "--start", "1000", "--stop", "1010"}, 2, {"two whole bands"});
    fails({"measure", "sweep", "--stop", "23000"}, 2, {"--stop 23000", "22627 Hz", "1/3 octave bands end"});
    fails({"measure", "sweep", "--rate", "32000"}, 2, {"half the sample rate lies"});
    fails({"measure", "sweep", "--plant", "hum=1"}, 2, {"--plant", "\"hum=1\""});
    fails({"measure", "sweep", "--plant", "invert", "--recorded", path("x.wav")}, 2, {"exclude each other"});
    fails({"measure", "sweep", "--json", "--csv", "-"}, 2, {"both want standard output"});
    fails({"measure", "sweep", "--play", "-"}, 2, {"--play -"});
    fails({"measure", "sweep", "--play", path("p.wav"), "--csv", path("x.csv")}, 2, {"need a result"});
    fails({"measure", "sweep", "--plot", path("x.pdf")}, 2, {".svg or .png"});
    fails({"measure", "sweep", "--set", "bass=9"}, 2, {"--set bass=9"});
    fails({"measure", "levels", "--layout", "0x3FFFF"}, 2, {"has 18 speakers; the library takes 8"});
    fails({"measure", "levels", "--layout", "6.1"}, 2, {"layout \"6.1\" is unknown"});
    fails({"measure", "polarity", "--half-length", "64"}, 2, {"--half-length"});
    fails({"measure", "polarity", "--plot", path("x.png")}, 2, {"--plot"});
    fails({"measure", "spectrum", "--fft", "5000"}, 2, {"--fft 5000", "a power of two from 256 to 65536"});
    fails({"measure", "spectrum", "--fft", "131072"}, 2, {"--fft 131072"});
    fails({"measure", "spectrum", "--signal", "sweep"}, 2, {"--signal"});
    fails({"measure", "spectrum", "--signal", "sine", "--frequency", "24000"}, 2, {"--frequency 24000", "half the sample rate"});
    fails({"measure", "spectrum", "--signal", "pink", "--input", path("x.wav")}, 2, {"--input"});
    fails({"measure", "spectrum", "--live", "--json"}, 2, {"--live draws bars"});
    fails({"measure", "spectrum", "--live", "--play", path("p.wav")}, 2, {"nothing to hear"});
    fails({"measure", "spectrum", "--recorded", path("x.wav"), "--tap", "input"}, 2, {"heard at the record tap"});
    fails({"measure", "spectrum", "--seconds", "0"}, 2, {"--seconds must be more than 0"});
    fails({"measure", "load", "--play", path("p.wav")}, 2, {"measures nothing"});
    fails({"measure", "equaliser"}, 2, {"--fit"});
    fails({"measure", "equaliser", "--fit", "-", "--target", "-"}, 2, {"both want standard input"});
    fails({"measure", "equaliser", "--fit", path("x.csv"), "--from", "500", "--to", "100"}, 2, {"--from 500 must be below"});
    fails({"signal"}, 2, {"subcommand"});
    fails({"signal", "pink"}, 2, {"--output"});
    fails({"signal", "pink", "-o", path("p.wav"), "--seconds", "0"}, 2, {"--seconds must be more than 0"});
    fails({"signal", "sine", "-o", path("p.wav"), "--frequency", "24000"}, 2, {"half the sample rate"});
    CHECK_FALSE(exists("p.wav"));
}

TEST_CASE_FIXTURE(MeasureErrors, "recordings and inputs that do not suit end in 3 and say why") {
    fails({"measure", "sweep", "--recorded", path("none.wav")}, 3, {"none.wav: cannot be opened"});
    writeBytes("text.wav", "this is no sound");
    fails({"measure", "polarity", "--recorded", path("text.wav")}, 3, {"text.wav"});
    const std::string stereo = makeSine("stereo.wav", 1000, 0.5, 4800, 2);
    fails({"measure", "sweep", "--recorded", stereo, "--rate", "44100"}, 3, {"has 48000 Hz and 44100 Hz are wanted"});
    fails({"measure", "sweep", "--recorded", stereo, "--layout", "quad", "--channel", "2"}, 3,
          {"has channels 0 to 1, and channel 2 is measured"});
    fails({"measure", "spectrum", "--input", stereo}, 3, {"has 2 channels", "choose another --layout"});
    fails({"measure", "sweep", "--engine", "NoSuchEngine"}, 3, {"there is no NoSuchEngine.dll"});
    makeSound("nan.wav", 1, 0x4, 4800, [](size_t i, int) { return i == 4000 ? std::nan("") : 0.0; });
    fails({"measure", "polarity", "--recorded", path("nan.wav")}, 3, {"samples that are no numbers"});
}

TEST_CASE_FIXTURE(MeasureErrors, "curves that are none end in 3 with file and line") {
    fails({"measure", "equaliser", "--fit", path("none.csv")}, 3, {"none.csv: cannot be opened"});
    const auto curve = [&](const std::string &text, const std::vector<std::string> &texts) {
        writeBytes("c.csv", text);
        fails({"measure", "equaliser", "--fit", path("c.csv")}, 3, texts);
    };
    curve("", {"c.csv: holds 0 points; expected at least 3"});
    curve("hz,db\n100,1\n200,2\n", {"holds 2 points"});
    curve("a,b\n1,2\n", {"line 1: names no columns that are known"});
    curve("hz,db\n100,1\n200\n", {"line 3: has too few columns"});
    curve("hz,db\n100,1\n200,loud\n", {"line 3: \"loud\" is no level"});
    curve("hz,db\n100,1\n200,nan\n", {"line 3: \"nan\" is no level"});
    curve("hz,db\n100,1\nlow,3\n", {"line 3: \"low\" is no frequency"});
    curve("hz,db\n-1,1\n", {"is no frequency"});
    curve("100,1\n100,2\n300,3\n", {"line 2: frequencies have to rise"});
    curve("1,1\n2,2\n3,3\n", {"fewer than three points between --from and --to"});
    curve(std::string(5 << 20, 'x'), {"larger than 4 MiB"});
    fails({"measure", "equaliser", "--fit", path("")}, 3, {});
}

TEST_CASE_FIXTURE(MeasureErrors, "vx measure and vx signal write over nothing unasked, and do with --force") {
    for (const char *name : {"k.csv", "k.png", "k.wav"}) writeBytes(name, "mine");
    for (const std::vector<std::string> &command :
         std::vector<std::vector<std::string>>{{"measure", "levels", "--seconds", "0.1", "--csv", path("k.csv")},
                                               {"measure", "levels", "--seconds", "0.1", "--plot", path("k.png")},
                                               {"measure", "levels", "--seconds", "0.1", "--plot", path("k.svg")},  // its CSV
                                               {"measure", "polarity", "--play", path("k.wav")},
                                               {"signal", "sine", "-o", path("k.wav"), "--seconds", "0.1"}}) {
        const Outcome outcome = vx(command);
        CHECK(outcome.status != 0);
        CHECK(has(outcome.errors, "exists already"));
        for (const char *name : {"k.csv", "k.png", "k.wav"}) CHECK(readBytes(name) == "mine");
    }
    CHECK(vx({"signal", "sine", "-o", path("k.wav"), "--seconds", "0.1", "--force", "-q"}).status == 0);
    CHECK(readSound("k.wav").size() == 4800);
    CHECK(vx({"measure", "levels", "--seconds", "0.1", "--csv", path("k.csv"), "--force", "-q"}).status == 0);
    CHECK(readBytes("k.csv").starts_with("meter,"));
}

TEST_CASE_FIXTURE(MeasureErrors, "a folder that is not there ends in 4") {
    fails({"measure", "polarity", "--play", path("no/such/tone.wav")}, 4, {"cannot be written"});
    fails({"signal", "sine", "-o", path("no/such/tone.wav")}, 4, {"cannot be written"});
}

TEST_CASE("each verb of vx measure and vx signal explains itself") {
    for (const char *verb : {"sweep", "polarity", "spectrum", "levels", "load", "equaliser"}) {
        const Outcome outcome = test::VxFixture::vx({"measure", verb, "--help"});
        CAPTURE(verb);
        CHECK(outcome.status == 0);
        CHECK(has(outcome.output, "Example"));
        CHECK(has(outcome.output, "efinition"));
    }
    for (const char *verb : {"white", "pink", "sine", "sweep"}) CHECK(test::VxFixture::vx({"signal", verb, "--help"}).status == 0);
    CHECK(has(test::VxFixture::vx({"measure", "--help"}).output, "Exit status"));
}
