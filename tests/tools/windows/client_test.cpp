// SPDX-License-Identifier: MIT
//
// The client's verbs on an endpoint of the system's, which cannot be laid out in the registry as the sample machine's are: each is
// a process of its own, and they meet in the real store.
#include <doctest/doctest.h>

#include <nlohmann/json.hpp>

#include "tests/support/sample_machine.h"
#include "tests/tools/vx_fixture.h"

using nlohmann::json;
using test::has;
using test::Outcome;

namespace {

struct ClientFixture : test::VxFixture {
    ClientFixture() { REQUIRE(machine.hasEndpoint()); }

    std::string done(const std::string &verb, const std::vector<std::string> &arguments = {}) {
        std::vector<std::string> all = {verb, endpoint};
        all.insert(all.end(), arguments.begin(), arguments.end());
        const Outcome outcome = vx(all);
        CAPTURE(verb);
        CAPTURE(outcome.errors);
        CHECK(outcome.status == 0);
        return outcome.output;
    }

    vxcomn::testing::SampleMachine machine;
    std::string endpoint = vxcomn::toUtf8(machine.endpointId());
};

}  // namespace

TEST_CASE_FIXTURE(ClientFixture, "a slider that one process sets another one reads, and a reset takes it back") {
    const std::string before = done("get", {"bass"});
    CHECK(done("set", {"bass", "0.7"}) == "bass      0.7\n");
    CHECK(done("get", {"bass"}) == "0.7\n");
    done("reset", {"bass"});
    CHECK(done("get", {"bass"}) == before);
    const json all = json::parse(done("get", {"--json"}));
    CHECK(all["parameters"].size() == 17);
}

TEST_CASE_FIXTURE(ClientFixture, "list and props tell the system's endpoint, and an unknown one is answered with those there are") {
    const json list = json::parse(done("list", {"--json"}));
    REQUIRE(list["endpoints"].size() == 1);
    CHECK(list["endpoints"][0]["id"] == endpoint);
    CHECK(list["endpoints"][0]["slots"].size() == 5);
    CHECK(has(done("props"), "FriendlyName"));
    const Outcome unknown = vx({"list", "no such endpoint"});
    CHECK(unknown.status == 3);
    CHECK(has(unknown.errors, endpoint));
}

TEST_CASE_FIXTURE(ClientFixture, "a watch tells what another process sets, with both values") {
    test::Process watch(test::builtProgram("vx"), {"watch", endpoint, "--json", "--for", "60"});
    REQUIRE(watch.readLine());  // that it listens
    done("set", {"voice", "0.25"});
    for (;;) {
        const auto line = watch.readLine();
        REQUIRE(line);
        const json event = json::parse(*line);
        if (event["kind"] != "parameter" || event["name"] != "voice") continue;
        CHECK(has(event.dump(), "0.25"));
        break;
    }
    watch.kill();
}

TEST_CASE_FIXTURE(ClientFixture, "the doctor names each finding with what to do") {
    done("get", {"bass"});
    const Outcome outcome = vx({"doctor", endpoint, "--json"});
    CAPTURE(outcome.errors);
    const json report = json::parse(outcome.output);
    CHECK(outcome.status == 1);  // nobody receives
    REQUIRE(!report["endpoints"][0]["findings"].empty());
    for (const json &finding : report["endpoints"][0]["findings"]) {
        CAPTURE(finding.dump());
        for (const char *field : {"what", "verdict", "found", "meaning", "do"}) CHECK(finding[field].get<std::string>() != "");
    }
}
