// SPDX-License-Identifier: MIT
//
// What the client does when the system lets it down: an endpoint that vanishes, a reader that goes away, signals.
#include <signal.h>

#include "tests/tools/posix/client_fixture.h"

using test::ClientFixture;
using test::has;
using test::json;
using test::Outcome;
using test::Running;

namespace {

// Through a shell, which makes pipes and sends signals as a person would.
Outcome shell(const std::string &command) {
    return test::run("/bin/sh", {"-c", command});
}

const std::string kVx = test::builtProgram("vx");

}  // namespace

TEST_CASE_FIXTURE(ClientFixture, "watch tells that the endpoint has gone, and goes on") {
    Running watch({"watch", "speakers", "--json", "--for", "60"});
    watch.jsonLine();
    removeKey(kSpeakers);
    const json gone = watch.jsonLine();
    CHECK(gone["kind"] == "endpoint");
    CHECK(gone["state"] == "not present");
    putNumber(kSpeakers, "DeviceState", 1);
    CHECK(watch.jsonLine()["state"] == "active");
}

TEST_CASE_FIXTURE(ClientFixture, "watch ends by itself when nobody reads its output any more") {
    const Outcome outcome = shell(kVx + " watch speakers --json --for 60 | head -n 1");
    CHECK(outcome.status == 0);
    CHECK(json::parse(outcome.output)["kind"] == "start");
}

TEST_CASE_FIXTURE(ClientFixture, "Ctrl-C is the usual end of watch, activate and a forced engine, which is given back") {
    for (const char *verb : {"watch speakers", "activate speakers", "engine speakers KZNOVA"}) {
        const Outcome outcome = shell(kVx + " " + verb + " & sleep 0.5; kill -INT $!; wait $!");
        CAPTURE(verb);
        CHECK(outcome.status == 0);
        CHECK(outcome.errors == "");
    }
    CHECK(done({"engine", "speakers"}) == "VXORLO\n");
    const json engine = doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["engine"];
    CHECK_FALSE(engine.contains("ignored"));
}

TEST_CASE_FIXTURE(ClientFixture, "a run that follows keeps what it played when it is interrupted") {
    const std::string in = makeSine("in.wav", 440, 0.4, 20 * 48000);
    const Outcome outcome =
        shell(kVx + " run " + in + " -q --follow speakers -o " + path("out.wav") + " & sleep 1; kill -INT $!; wait $!");
    CHECK(outcome.status == 0);
    const size_t frames = readSound("out.wav").size() / 2;
    CHECK(frames > 0);
    CHECK(frames < 20 * 48000);
}
