// SPDX-License-Identifier: MIT
//
// vx doctor: that a sound slot is called sound, and that each thing that can be wrong is found, explained and answered.
#include "tests/tools/posix/client_fixture.h"

using test::ClientFixture;
using test::has;
using test::json;
using test::Outcome;
using test::Running;

namespace {

struct DoctorFixture : ClientFixture {
    json doctor(const std::string &endpoint = "speakers", const std::string &apo = "EFX") {
        const Outcome outcome = vx({"doctor", endpoint, "--apo", apo, "--json"});
        CAPTURE(outcome.errors);
        const json report = json::parse(outcome.output);
        CHECK(outcome.status == (report["active"].get<bool>() ? 0 : 1));
        for (const json &finding : report["endpoints"][0]["findings"]) {
            CAPTURE(finding.dump());
            for (const char *field : {"what", "verdict", "found", "meaning", "do"}) CHECK(finding[field].get<std::string>() != "");
        }
        return report["endpoints"][0];
    }

    static json finding(const json &report, const std::string &what) {
        for (const json &finding : report["findings"])
            if (finding["what"] == what) return finding;
        return {{"verdict", "absent"}, {"found", ""}, {"do", ""}};
    }

    void finds(const std::string &what, const std::string &verdict, const std::string &found, const std::string &advice) {
        const json seen = finding(doctor(), what);
        CAPTURE(seen.dump());
        CHECK(seen["verdict"] == verdict);
        CHECK(has(seen["found"], found));
        CHECK(has(seen["do"], advice));
    }

    std::filesystem::path package = system / "VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip";
};

}  // namespace

TEST_CASE_FIXTURE(DoctorFixture, "a slot whose receiver runs is sound from end to end") {
    Running run({"run", makeSine("in.wav", 440, 0.4, 5 * 48000), "--follow", "speakers", "-q"});
    while (!doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["receiver"].get<bool>()) {
    }
    const json report = doctor();
    for (const json &seen : report["findings"]) {
        CAPTURE(seen.dump());
        if (seen["what"] != "endpoint") CHECK(seen["verdict"] != "wrong");
    }
    CHECK(finding(report, "parameters")["meaning"] == "consistent with the preset");
    CHECK(has(finding(report, "engine module")["found"], "VXORLO"));
    CHECK(finding(report, "receiver")["found"] == "one runs");
    CHECK(report["slot"]["clients"].size() >= 1);
    CHECK(report["library"]["version"] == "2.1.0.0");
    CHECK(report["slot"]["preset"]["digestHolds"] == true);
    if (report["endpoint"]["state"] == "active") CHECK(report["active"] == true);
}

TEST_CASE_FIXTURE(DoctorFixture, "looking changes nothing: an unused slot stays unused") {
    finds("parameters", "note", "is not filled yet", "vx get");
    finds("receiver", "wrong", "none runs", "vx run FILE --follow");
    CHECK(doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["keyThere"] == false);
}

TEST_CASE_FIXTURE(DoctorFixture, "an endpoint that is unplugged, and effects that the system has switched off") {
    putNumber(kSpeakers + "\\Properties", "{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},5", 1);
    finds("system's switch", "wrong", "switched off", "sound settings");
    putNumber(kSpeakers, "DeviceState", 8);
    CHECK(finding(doctor(), "endpoint")["verdict"] == "wrong");
}

TEST_CASE_FIXTURE(DoctorFixture, "a package that is missing, and one that is no package") {
    writeBytes("text.zip", "this is no archive, though it is longer than twenty-three bytes");
    std::filesystem::copy_file(folder / "text.zip", package, std::filesystem::copy_options::overwrite_existing);
    finds("preset", "wrong", "the loader says", "vx preset check");
    std::filesystem::remove(package);
    finds("package", "wrong", "VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip is not in", "put the file there");
    finds("preset", "wrong", "there is none for", "vx preset compile");
    finds("engine", "wrong", "none", "mend the preset");
}

TEST_CASE_FIXTURE(DoctorFixture, "an engine without its module, and one that a client forces") {
    Running setter({"engine", "speakers", "KZNOVA", "--for", "60"});
    setter.line();
    finds("engine", "note", "KZNOVA, forced by client {", "end that client");
    finds("engine module", "wrong", "KZNOVA.dll is not there; looked for", "install the engine's module");
    setter.process().kill();
    setter.process().wait();
    finds("engine", "note", "VXORLO, of the preset; KZNOVA was forced by client", "vx engine");
}

TEST_CASE_FIXTURE(DoctorFixture, "parameters of another preset, power off and bypass on") {
    done({"set", "speakers", "power=off", "bypass=on"});
    finds("parameters", "ok", "GlobalProfile", "nothing to do");
    finds("power", "wrong", "off", "power on");
    finds("bypass", "wrong", "on", "bypass off");
    putBytes(kSpeakersValues, "PresetSHA256", std::vector<uint8_t>(32, 7));
    finds("parameters", "wrong", "0707", "which brings them into line");
    CHECK(get("bypass") == "on");
    finds("parameters", "ok", "GlobalProfile", "nothing to do");
}

TEST_CASE_FIXTURE(DoctorFixture, "a client that was killed is counted as gone") {
    Running activated({"raw", "speakers", "3,-12=f32:1", "--transient", "--for", "60"});
    activated.line();
    finds("clients", "ok", "1 alive {", "nothing to do");
    activated.process().kill();
    activated.process().wait();
    finds("clients", "ok", "0 alive, 1 gone", "nothing to do");
}

TEST_CASE_FIXTURE(DoctorFixture, "as text every line has a verdict, and what is wrong says what to do") {
    const Outcome outcome = vx({"doctor", "speakers"});
    CHECK(outcome.status == 1);
    CHECK(has(outcome.output, "Speakers, EFX: the effect is not active, or may not be: "));
    CHECK(has(outcome.output, "  ok    device           HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001, SUBSYS_5A170001, endpoint index 0\n"));
    CHECK(has(outcome.output, "  wrong receiver         none runs\n"));
    CHECK(has(outcome.output, "; do: play something through the endpoint"));
    CHECK(vx({"doctor", "speakers", "-q"}).output == "");
}
