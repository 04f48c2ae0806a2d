// SPDX-License-Identifier: MIT
//
// What of the client needs no machine: its help, and how the doctor judges facts.
#include <doctest/doctest.h>

#include "tests/tools/vx_fixture.h"
#include "tools/vx_client/doctor.h"

using test::has;

TEST_CASE("every verb of the client prints its help") {
    for (const char *verb : {"list", "doctor", "props", "engine", "ioconfig", "profile", "content", "get", "set", "raw", "reset",
                             "watch", "activate"}) {
        const test::Outcome outcome = test::VxFixture::vx({verb, "--help"});
        CAPTURE(verb);
        CHECK(outcome.status == 0);
        CHECK(has(outcome.output, "Examples:"));
    }
}

TEST_CASE("the judge calls a module that does not load or is no engine wrong") {
    vx::client::DoctorFacts facts;
    facts.device.name = "Speakers";
    facts.slot.engine = {"VXORLO", vx::client::Origin::preset, "", ""};
    facts.engineFile = "VXORLO.dll";
    const auto verdictOf = [&](const char *what) {
        for (const auto &finding : vx::client::judge(facts))
            if (finding.what == what) return finding.found;
        return std::string();
    };
    facts.engineModule = {"/lib/VXORLO.so", false, false, "bad header", {}};
    CHECK(verdictOf("engine module") == "/lib/VXORLO.so cannot be loaded: bad header");
    facts.engineModule = {"/lib/VXORLO.so", true, false, "", {}};
    CHECK(verdictOf("engine module") == "/lib/VXORLO.so does not export VXDSPAPI_Initialize");
    facts.engineFile.clear();
    CHECK(verdictOf("engine module") == "\"VXORLO\" is no module name");
    facts.openProblem = "it is gone";
    CHECK(vx::client::anythingWrong(vx::client::judge(facts)));
}
