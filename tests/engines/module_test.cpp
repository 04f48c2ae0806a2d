// SPDX-License-Identifier: MIT
//
// The module files: their names, the start, and the version record.
#include <doctest/doctest.h>

#include <vxcomn/version_record.h>

#include <fstream>
#include <iterator>

#include "engine_rig.h"

namespace {

int events = 0;
std::string lastText;
LibraryContext *lastContext = nullptr;

void rememberEvent(LibraryContext *context, int32_t, int32_t, const char *text) {
    ++events;
    lastText = text;
    lastContext = context;
}

}  // namespace

TEST_CASE("every file name exports all fourteen functions and starts") {
    for (const char *name : {"SampleEngine", "SampleEngine.DSP", "SampleEngine.DSP.HiFi2", "SampleEngine.DSP.AIC326x",
                             "Tarnlight.Orlo.DSP.HiFi2", "VXORHF64U"}) {
        CAPTURE(std::string(name));
        EngineRig rig(name);
        REQUIRE(rig.handle() != nullptr);
        CHECK(rig.setFormat(kStereo, 48000) == 0);
    }
}

TEST_CASE("a command line with /decline makes the engine decline, and others do not") {
    CHECK(EngineRig("SampleEngine", "/wrpresetbinoff /decline").handle() == nullptr);
    CHECK(EngineRig("SampleEngine", "/wrpresetbinoff").handle() != nullptr);
    CHECK(EngineRig("SampleEngine", "").handle() != nullptr);
    CHECK(EngineRig("SampleEngine", nullptr).handle() != nullptr);

    EngineModule module("SampleEngine");
    auto *context = reinterpret_cast<LibraryContext *>(&events);  // only passed along
    events = 0;
    CHECK(module.initialize(0, nullptr, "/decline", rememberEvent, context, 3) == nullptr);
    CHECK(events == 1);
    CHECK(lastContext == context);
    CHECK(lastText.find("declines") != std::string::npos);
}

TEST_CASE("the first word of the instance is the host's and holds the context from the start") {
    EngineModule module("SampleEngine");
    int anything = 0;
    auto *context = reinterpret_cast<LibraryContext *>(&anything);
    VXEngineHandle handle = module.initialize(0, "Float", nullptr, nullptr, context, 1);
    CHECK(*static_cast<LibraryContext **>(handle) == context);
    *static_cast<void **>(handle) = nullptr;
    IOFormat format = makeFormat(kStereo, 48000);
    CHECK(module.setIOFormat(handle, &format, &format) == 0);
    module.free(handle);
}

TEST_CASE("instances of one module do not know each other") {
    EngineRig loud;
    EngineRig neutral;
    loud.setFormat(kStereo, 48000);
    neutral.setFormat(kStereo, 48000);
    setEverything(loud);
    const Stream in = testSignal(2000, 0.5F);
    CHECK_FALSE(sameBits(in, loud.run(in)));
    CHECK(sameBits(in, neutral.run(in)));
}

TEST_CASE("the module file bears version 2.1.0.0") {
    const EngineModule module("SampleEngine");
    std::ifstream file(module.path(), std::ios::binary);
    const std::string bytes((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    // The same thirteen words begin with the signature in an ELF section and in a Windows version resource.
    const std::string signature("\xBD\x04\xEF\xFE\x00\x00\x01\x00", 8);
    const std::size_t at = bytes.find(signature);
    REQUIRE(at != std::string::npos);
    VXVersionRecord record;
    REQUIRE(at + sizeof record <= bytes.size());
    std::memcpy(&record, bytes.data() + at, sizeof record);
    CHECK(record.fileVersionHigh == 0x00020001);
    CHECK(record.fileVersionLow == 0);
    CHECK(record.productVersionHigh == 0x00020001);
    CHECK(record.productVersionLow == 0);
    CHECK(record.fileType == 2);
}
