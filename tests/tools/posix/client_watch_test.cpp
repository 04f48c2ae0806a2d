// SPDX-License-Identifier: MIT
//
// vx watch and vx run --follow, with others changing the slot from processes of their own.
#include <thread>

#include "tests/tools/posix/client_fixture.h"

using test::ClientFixture;
using test::has;
using test::json;
using test::Outcome;
using test::Running;

TEST_CASE_FIXTURE(ClientFixture, "watch tells a change with its writer, its old and its new value, in sequence") {
    Running watch({"watch", "speakers", "--json", "--for", "60"});
    const json start = watch.jsonLine();
    CHECK(start["seq"] == 0);
    CHECK(start["kind"] == "start");
    CHECK(start["engine"] == "VXORLO");
    done({"set", "speakers", "bass", "0.5"});
    json event = watch.next("parameter", "bass");
    CHECK(event["seq"] == 1);
    CHECK(event["component"] == 3);
    CHECK(event["id"] == -12);
    CHECK(event["transient"] == false);
    CHECK(event["old"]["float"] == 0.5);
    CHECK(event["new"]["level"] == 0.5);
    CHECK(event["writer"]["id"].get<std::string>().size() == 38);
    done({"set", "speakers", "bass", "0.75"});
    event = watch.next("parameter", "bass");
    CHECK(event["seq"] == 2);
    CHECK(event["old"]["level"] == 0.5);
    CHECK(event["new"]["level"] == 0.75);
}

TEST_CASE_FIXTURE(ClientFixture, "a transient value comes with its mark, and the shared one again when its client has gone") {
    Running watch({"watch", "speakers", "--json", "--for", "60"});
    watch.jsonLine();
    Running setter({"raw", "speakers", "3,-12=f32:2", "--transient", "--for", "60"});
    CHECK(has(setter.line(), "while this runs"));
    json event = watch.next("parameter", "bass");
    CHECK(event["transient"] == true);
    CHECK(event["writer"]["kind"] == "client");
    CHECK(event["new"]["float"] == 2.0);
    setter.process().kill();
    setter.process().wait();
    event = watch.next("parameter", "bass");
    CHECK(event["transient"] == false);
    CHECK(event["writer"]["kind"] == "preset");
    CHECK(event["new"]["float"] == 0.5);
}

TEST_CASE_FIXTURE(ClientFixture, "watch tells a forced engine with its setter, and that it lapsed when the setter was killed") {
    Running watch({"watch", "speakers", "--json", "--for", "60"});
    watch.jsonLine();
    Running setter({"engine", "speakers", "KZNOVA", "--for", "60"});
    setter.line();
    json event = watch.next("selection", "engine");
    CHECK(event["old"] == "VXORLO");
    CHECK(event["new"] == "KZNOVA");
    CHECK(event["writer"]["kind"] == "client");
    setter.process().kill();
    setter.process().wait();
    event = watch.next("selection", "engine");
    CHECK(event["old"] == "KZNOVA");
    CHECK(event["new"] == "VXORLO");
}

TEST_CASE_FIXTURE(ClientFixture, "watch tells profiles, ends after --count, and --initial begins with what stands there") {
    Running watch({"watch", "speakers", "--json", "--count", "1", "--for", "60"});
    watch.jsonLine();
    done({"profile", "speakers", "Evening"});
    const json event = watch.next("selection", "profile");
    CHECK(event["old"] == "GlobalProfile");
    CHECK(event["new"] == "Evening");
    CHECK(watch.process().wait() == 0);
    const std::string initial = done({"watch", "speakers", "--initial", "--for", "0"});
    CHECK(has(initial, "bass           - -> 0.79966  by the preset"));
}

TEST_CASE_FIXTURE(ClientFixture, "a run that follows sounds different once another process has moved a slider, and says so") {
    const std::string in = makeSine("in.wav", 60, 0.1, 5 * 48000);
    done({"set", "speakers", "bass", "0"});
    Running run({"run", in, "-o", path("out.wav"), "--follow", "speakers", "--json"});
    // The mark of the receiver says when it runs.
    while (!doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["receiver"].get<bool>()) {
    }
    std::this_thread::sleep_for(std::chrono::seconds(1));  // of the sound as it was
    done({"set", "speakers", "bass", "1"});
    const json report = json::parse(run.process().readAll());
    CHECK(run.process().wait() == 0);
    CHECK(has(report["engine"]["file"], "VXORLO"));
    REQUIRE(report["followed"]["changes"].size() == 1);
    const json &change = report["followed"]["changes"][0];
    CHECK(change["name"] == "bass");
    CHECK(has(change["writer"], "client {"));
    CHECK(change["takenMs"].get<double>() > 0.0);
    CHECK(change["heardMs"].get<double>() >= change["takenMs"].get<double>());
    const auto samples = readSound("out.wav");
    const auto frame = static_cast<size_t>(change["seconds"].get<double>() * 48000);
    const auto peak = [&](size_t from, size_t to) {
        float loudest = 0.0F;
        for (size_t i = 2 * from; i < 2 * to; ++i) loudest = std::max(loudest, std::fabs(samples.at(i)));
        return loudest;
    };
    REQUIRE(frame > 960);
    REQUIRE(frame + 9600 < samples.size() / 2);
    CHECK(peak(frame + 4800, frame + 9600) > 1.5F * peak(frame - 960, frame));
}

TEST_CASE_FIXTURE(ClientFixture, "a run that follows begins with the settings that are stored") {
    const std::string in = makeSine("in.wav", 440, 0.4, 4800);
    done({"set", "speakers", "bypass", "on"});
    done({"run", in, "-q", "-o", path("out.wav"), "--follow", "speakers"});
    CHECK(readSound("out.wav") == readSound("in.wav"));
}

TEST_CASE_FIXTURE(ClientFixture, "a run that follows takes another engine, or says why not and plays on") {
    const std::string in = makeSine("in.wav", 440, 0.4, 3 * 48000);
    Running run({"run", in, "--follow", "speakers", "--apo", "EFX"});
    while (!doneJson({"list", "speakers"})["endpoints"][0]["slots"][0]["receiver"].get<bool>()) {
    }
    done({"engine", "speakers", "KZNOVA", "--for", "0.5"});
    CHECK(has(run.process().readAll(), "engine VXORLO -> KZNOVA"));
    CHECK(run.process().wait() == 0);
    CHECK(has(run.process().errors(), "the engine stays as it was: engine KZNOVA: there is no KZNOVA.dll"));
}

TEST_CASE_FIXTURE(ClientFixture, "following ends in 3 without an endpoint, a preset or the engine's module") {
    const std::string in = makeSine("in.wav", 440, 0.4, 4800);
    fails({"run", in, "--follow", "gramophone"}, 3, {"there is none of that id"});
    fails({"run", in, "--apo", "EFX"}, 2, {"--follow"});
    std::filesystem::remove(system / "VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip");
    fails({"run", in, "--follow", "speakers"}, 3, {"the slot has no engine", "vx doctor"});
    CHECK(vx({"run", in, "--follow", "speakers", "--engine", "SampleEngine", "-q"}).status == 0);
}

TEST_CASE_FIXTURE(ClientFixture, "--levels-plot draws levels over time with the numbers beside it") {
    const std::string in = makeSine("in.wav", 440, 0.5, 4800);
    const Outcome outcome = vx({"run", in, "-q", "--levels-plot", path("when.svg")}, {{"VX_GNUPLOT", "no-such-gnuplot"}});
    CHECK(outcome.status == 0);
    CHECK(readBytes("when.csv").starts_with("seconds,in_rms_db,out_rms_db\n0.025,-9.03"));
    CHECK(exists("when.svg.gp"));
}
