// SPDX-License-Identifier: MIT
//
// What only this system can refuse or offer: full devices, file size limits, folders without rights, pipes, and FLAC.
#include <doctest/doctest.h>

#include "tests/tools/vx_fixture.h"

using test::has;
using test::Outcome;
using test::VxFixture;

namespace {

struct ShellFixture : VxFixture {
    std::string in = makeSine("in.wav", 1000, 0.5, 48000);

    // Runs a shell command in which $vx is the program and the folder is the current one.
    Outcome shell(const std::string &command) const {
        return test::run("/bin/sh", {"-c", "cd \"$folder\" && " + command}, {},
                         {{"vx", test::builtProgram("vx")}, {"folder", folder.string()}});
    }
};

}  // namespace

TEST_CASE_FIXTURE(ShellFixture, "a full device ends in 4 with the system's words") {
    const Outcome outcome = shell("\"$vx\" run in.wav -o /dev/full");
    CHECK(outcome.status == 4);
    CHECK(has(outcome.errors, "/dev/full: cannot be written: No space left on device; make room"));
}

TEST_CASE_FIXTURE(ShellFixture, "a disk that fills in the middle leaves no half file and keeps the old one") {
    writeBytes("old.wav", "mine");
    const Outcome outcome = shell("trap '' XFSZ; ulimit -f 64; \"$vx\" run in.wav --force -o old.wav");
    CHECK(outcome.status == 4);
    CHECK(has(outcome.errors, "old.wav: cannot be written: File too large"));
    CHECK(readBytes("old.wav") == "mine");
    CHECK(count(".part-") == 0);
}

TEST_CASE_FIXTURE(ShellFixture, "full standard output ends in 4") {
    CHECK(shell("\"$vx\" run in.wav --json >/dev/full").status == 4);
}

TEST_CASE_FIXTURE(ShellFixture, "a WAV goes through pipes on both sides") {
    CHECK(shell("cat in.wav | \"$vx\" run - -o - --set bypass=on 2>/dev/null | cat >piped.wav").status == 0);
    CHECK(readBytes("piped.wav") == readBytes("in.wav"));
    const Outcome cut = shell("head -c 1000 in.wav | \"$vx\" run - -q");
    CHECK(cut.status == 3);
    CHECK(has(cut.errors, "standard input: truncated: it announces 48000 frames and holds 117"));
}

TEST_CASE_FIXTURE(ShellFixture, "FLAC is read and written, in 24 bits if nothing is asked for") {
    CHECK(shell("\"$vx\" run in.wav -q -o out.flac --set bypass=on").status == 0);
    const std::vector<float> before = readSound("in.wav");
    const std::vector<float> after = readSound("out.flac");
    REQUIRE(after.size() == before.size());
    for (size_t i = 0; i < after.size(); ++i) REQUIRE(std::fabs(after[i] - before[i]) <= 0x1p-24F);
    CHECK(shell("\"$vx\" run out.flac -q -o again.wav --set bypass=on").status == 0);
    CHECK(readSound("again.wav") == after);
    const Outcome asFloat = shell("\"$vx\" run in.wav -q -o other.flac --bits 32f");
    CHECK(asFloat.status == 2);
    CHECK(has(asFloat.errors, "FLAC holds no float samples"));
    CHECK(shell("head -c 60000 out.flac >cut.flac; \"$vx\" run cut.flac -q -o no.wav").status == 3);
    CHECK_FALSE(exists("no.wav"));
}

TEST_CASE_FIXTURE(ShellFixture, "an interrupted run leaves no file") {
    const Outcome outcome = shell("\"$vx\" run in.wav -q --loop 10000 --bits 16 -o long.wav & sleep 0.5; kill -TERM $!; wait $!");
    CHECK(outcome.status == 4);
    CHECK(has(outcome.errors, "interrupted; nothing was written"));
    CHECK_FALSE(exists("long.wav"));
    CHECK(count(".part-") == 0);
}

TEST_CASE_FIXTURE(ShellFixture, "gnuplot draws both kinds of picture") {
    const Outcome outcome =
        shell("\"$vx\" run in.wav --plot load.svg --plot load.png && \"$vx\" levels in.wav in.wav --plot levels.png");
    CHECK(outcome.status == 0);
    CHECK(has(readBytes("load.svg"), "microseconds in VXDSPAPI_Process"));
    CHECK(readBytes("load.png").starts_with("\x89PNG"));
    CHECK(readBytes("levels.png").starts_with("\x89PNG"));
    CHECK(count(".gp") == 0);
}
