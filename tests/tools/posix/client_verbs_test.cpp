// SPDX-License-Identifier: MIT
//
// The client's verbs doing what they are asked for, each a process of its own on the sample machine.
#include "tests/tools/posix/client_fixture.h"

using test::ClientFixture;
using test::has;
using test::json;
using test::Running;

namespace {

const std::string kSpeakersId = "{0.0.0.00000000}.{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B001}";

const json *slotOf(const json &endpoint, const std::string &apo) {
    for (const json &slot : endpoint["slots"])
        if (slot["apo"] == apo) return &slot;
    return nullptr;
}

}  // namespace

TEST_CASE_FIXTURE(ClientFixture, "list tells endpoints, slots and what is selected, and fills no store") {
    const json list = doneJson({"list", "speakers"});
    REQUIRE(list["endpoints"].size() == 1);
    const json &speakers = list["endpoints"][0];
    CHECK(speakers["id"] == kSpeakersId);
    CHECK(speakers["name"] == "Speakers");
    CHECK(speakers["flow"] == "render");
    CHECK(speakers["index"] == 0);
    CHECK(speakers["deviceId"] == "HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001");
    CHECK(speakers["subsystemId"] == "SUBSYS_5A170001");
    CHECK(speakers["slots"].size() == 5);
    const json *const efx = slotOf(speakers, "EFX");
    REQUIRE(efx != nullptr);
    CHECK((*efx)["engine"] == json({{"value", "VXORLO"}, {"origin", "preset"}}));
    CHECK((*efx)["ioConfig"] == json({{"value", "AnyOutput"}, {"origin", "derived"}}));
    CHECK((*efx)["profile"]["value"] == "GlobalProfile");
    CHECK((*efx)["content"]["value"] == "AnyContent");
    CHECK((*efx)["preset"]["entry"] == "0/0/EFX/AnyOutput/AnyContent/Preset.bin");
    CHECK((*efx)["preset"]["digestHolds"] == true);
    CHECK((*efx)["keyThere"] == false);
    CHECK((*efx)["parameters"]["filled"] == false);
    CHECK((*efx)["receiver"] == false);
}

TEST_CASE_FIXTURE(ClientFixture, "list --all shows the three endpoints of the machine as text, --names their names alone") {
    const std::string text = done({"list", "--all"});
    for (const char *part :
         {"Speakers, index 0, render", "Headphones, index 1, render", "Microphone, index 3, capture", "  EFX  VXORLO"})
        CHECK(has(text, part));
    const std::string names = done({"list", "--names"});
    CHECK(has(names, "Speakers\nHeadphones\n"));
    CHECK(has(names, "Microphone\n"));
}

TEST_CASE_FIXTURE(ClientFixture, "an endpoint is named by its id, its guid, its index or a part of its name") {
    for (const std::string &name : {kSpeakersId, std::string("{5d9a1c70-3b52-4e0f-9c41-0a6e27d1b001}"), std::string("0"),
                                    std::string("SPEAKERS"), std::string("eaker")})
        CHECK(doneJson({"list", name})["endpoints"][0]["id"] == kSpeakersId);
}

TEST_CASE_FIXTURE(ClientFixture, "an ambiguous name lists the candidates, an unknown one lists all") {
    fails({"list", "phone"}, 2, {"2 endpoints fit", "Headphones, index 1", "Microphone, index 3"});
    fails({"get", "gramophone"}, 3, {"there is none of that id, index or name", "Speakers, index 0"});
    fails({"get", ""}, 3, {"there is none"});
}

TEST_CASE_FIXTURE(ClientFixture, "props reads the eight properties, or any by its key") {
    const json props = doneJson({"props", "headphones"})["properties"];
    CHECK(props["DeviceID"] == "HDAUDIO\\FUNC_01&VEN_5A17&DEV_0001");
    CHECK(props["SSID"] == "SUBSYS_5A170001");
    CHECK(props["EndpointIndex"] == 1);
    CHECK(props["EngineName"] == "VXORLO");
    CHECK(has(props["PresetZipPath"], "VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip"));
    CHECK(props["PresetFilePath"] == "1/EFX/Headphones/AnyContent/Preset.bin");
    CHECK(done({"props", "speakers", "--key", "{A45C254E-DF1C-4EFD-8020-67D146A850E0},2"}) == "Speakers\n");
    fails({"props", "speakers", "--key", "{A45C254E-DF1C-4EFD-8020-67D146A850E1},2"}, 3, {"the endpoint has no such property"});
    fails({"props", "speakers", "--key", "2"}, 2, {"expected {GUID},NUMBER"});
}

TEST_CASE_FIXTURE(ClientFixture, "get reads the seventeen user parameters from the preset, and one alone as its value") {
    const json all = doneJson({"get", "speakers"});
    CHECK(all["engine"] == "VXORLO");
    REQUIRE(all["parameters"].size() == 17);
    CHECK(all["parameters"][0] == json({{"name", "power"}, {"id", 0}, {"value", 1.0}}));
    // A gain of 0.5 is -6.02 dB, which lies at 0.79966 of -54 to 6.
    CHECK(get("bass") == "0.79966");
    CHECK(get("bypass") == "off");
    CHECK(get("eq1") == "0.58333");
}

TEST_CASE_FIXTURE(ClientFixture, "set stores what get reads, in pairs and with an equals sign, switches and levels") {
    const std::string others = get("bass", "headphones");
    CHECK(done({"set", "speakers", "bass", "0.7"}) == "bass      0.7\n");
    CHECK(get("bass") == "0.7");
    done({"set", "speakers", "voice=0.25", "detail", "0.5", "eq", "off", "eq10=1"});
    CHECK(get("voice") == "0.25");
    CHECK(get("detail") == "0.5");
    CHECK(get("eq") == "off");
    CHECK(get("eq10") == "1");
    CHECK(get("bass", "headphones") == others);
    const json other = doneJson({"get", "speakers", "bass", "--apo", "MFX"});
    CHECK(other["apo"] == "MFX");
    CHECK(other["parameters"][0]["value"] != 0.7);
}

TEST_CASE_FIXTURE(ClientFixture, "what is no user parameter and no value of one ends in 2 and says what there is") {
    fails({"get", "speakers", "treble"}, 2, {"no user parameter \"treble\"", "power bass detail"});
    fails({"set", "speakers", "bass"}, 2, {"has no value"});
    fails({"set", "speakers", "bass", "1.5"}, 2, {"expected a level from 0 to 1"});
    fails({"set", "speakers", "bass", "nan"}, 2, {"expected a level from 0 to 1"});
    fails({"set", "speakers", "power", "0.5"}, 2, {"expected on or off"});
    fails({"set", "speakers", "bass", "0.5", "--apo", "XFX"}, 2, {"--apo"});
}

TEST_CASE_FIXTURE(ClientFixture, "raw reads and writes triples, and an unknown one ends in 3") {
    CHECK(doneJson({"raw", "speakers", "3,-12"})["value"]["float"] == 0.5);
    done({"raw", "speakers", "3,-12=f32:1"});
    CHECK(done({"raw", "speakers", "3,-12"}) == "1.0\n");
    CHECK(doneJson({"raw", "speakers", "-1,-18"})["value"]["on"] == false);
    done({"raw", "speakers", "5,9=hex:00ff10"});
    CHECK(doneJson({"raw", "speakers", "5,9"})["value"]["hex"] == "00ff10");
    fails({"raw", "speakers", "5,10"}, 3, {"parameter 5,10: neither the store nor the preset has it"});
    fails({"raw", "speakers", "5"}, 2, {"expected COMPONENT,ID[,CHANNEL]"});
    fails({"raw", "speakers", "99,1"}, 2, {"from -4 to 31"});
    fails({"raw", "speakers", "5,1", "--transient"}, 2, {"are for writing"});
}

TEST_CASE_FIXTURE(ClientFixture, "reset takes one parameter or all back to the preset's, with the power on") {
    done({"set", "speakers", "bass=0.1", "voice=0.1", "power=off"});
    done({"reset", "speakers", "bass"});
    CHECK(get("bass") == "0.79966");
    CHECK(get("voice") == "0.1");
    CHECK(has(done({"reset", "speakers"}), "all parameters are the preset's again"));
    CHECK(get("voice") != "0.1");
    CHECK(get("power") == "on");
    fails({"reset", "speakers", "bass", "--whole-store"}, 2, {"leave the names out"});
}

TEST_CASE_FIXTURE(ClientFixture, "a profile and a content type stay, and each has parameters of its own") {
    CHECK(done({"profile", "speakers"}) == "GlobalProfile\n");
    CHECK(done({"profile", "speakers", "Evening"}) == "profile GlobalProfile -> Evening\n");
    CHECK(done({"profile", "speakers"}) == "Evening\n");
    done({"set", "speakers", "bass", "0.2"});
    done({"profile", "speakers", "GlobalProfile"});
    CHECK(get("bass") == "0.79966");
    done({"profile", "speakers", "Evening"});
    CHECK(get("bass") == "0.2");
    CHECK(doneJson({"content", "speakers", "Movie"})["before"] == "AnyContent");
    CHECK(done({"content", "speakers"}) == "Movie\n");
    fails({"profile", "speakers", "a\\b"}, 2, {"is no name"});
}

TEST_CASE_FIXTURE(ClientFixture, "a forced engine counts while its setter lives, and the preset's comes back") {
    Running setter({"engine", "speakers", "KZNOVA", "--for", "60"});
    CHECK(setter.line() == "engine VXORLO -> KZNOVA, while this runs; Ctrl-C gives it back");
    CHECK(done({"engine", "speakers"}) == "KZNOVA\n");
    const json forced = doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["engine"];
    CHECK(forced["value"] == "KZNOVA");
    CHECK(forced["origin"] == "forced");
    fails({"get", "speakers", "bass"}, 3, {"the slot's engine has no such parameter"});
    setter.process().kill();
    setter.process().wait();
    CHECK(done({"engine", "speakers"}) == "VXORLO\n");
    const json lapsed = doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["engine"];
    CHECK(lapsed["ignored"] == "KZNOVA");
}

TEST_CASE_FIXTURE(ClientFixture, "a configuration is forced for a while") {
    CHECK(has(done({"ioconfig", "headphones", "AnyOutput", "--for", "0"}), "configuration Headphones -> AnyOutput"));
    CHECK(done({"ioconfig", "headphones"}) == "Headphones\n");
}

TEST_CASE_FIXTURE(ClientFixture, "activate opens a stream on an active endpoint and refuses another") {
    if (doneJson({"list", "speakers"})["endpoints"][0]["state"] == "active")
        CHECK(has(done({"activate", "speakers", "--for", "0.1"}), "Speakers: a silent stream is open"));
    putNumber(kSpeakers, "DeviceState", 8);
    fails({"activate", "speakers", "--for", "0.1"}, 3,
          {"Speakers: no stream can be opened on it", "only an active endpoint takes one"});
}

TEST_CASE_FIXTURE(ClientFixture, "hostile values in the registry are shown as far as they go, and nothing fails") {
    putText(kSpeakers + "\\Properties", "{A45C254E-DF1C-4EFD-8020-67D146A850E0},2", "Speak\x1B[31mers\n\"\\");
    putBytes(kSpeakersSlot, "IOConfig", {1, 2, 3});
    putNumber(kSpeakersSlot, "ContentType", 7);
    putText(kSpeakersSlot, "UserProfile", std::string(5000, 'p'));
    putText(kSpeakersSlot, "EngineName", "..\\..\\evil");
    putText(kSpeakersSlot, "EngineSetterID", "Global\\no\\such\\mutex");
    putBytes(kSpeakersSlot + "\\Clients", "{not a guid", {});
    putBytes(kSpeakersValues, "PresetSHA256", {1});
    putBytes(kSpeakersValues + "\\-1\\Data", "-2", {});
    const std::string text = done({"list", "0", "--color", "never"});
    CHECK(text.find('\x1B') == std::string::npos);
    CHECK(has(text, "Speak?[31mers?"));
    CHECK(doneJson({"list", "0"})["endpoints"].size() == 1);
    const test::Outcome doctor = vx({"doctor", "0", "--json"});
    CHECK(doctor.status == 1);
    CHECK(json::parse(doctor.output)["active"] == false);
}
