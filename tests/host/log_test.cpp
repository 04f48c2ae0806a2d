// SPDX-License-Identifier: MIT
//
// What the control calls write to the log, in their order and words.
#include <doctest/doctest.h>

#include <algorithm>

#include "diag/debug_trace.h"
#include "tests/support/data_command.h"
#include "tests/support/host_log.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

}  // namespace

TEST_CASE("logging is off unless the registry switches it on") {
    const DebugCapture capture;
    HostInstance host;
    host.setFormat(formatOf(0x3));
    CHECK_EQ(host.context().trace->Enabled, 0);
    CHECK_EQ(capture.lines(), Texts{});
}

TEST_CASE("opening an instance logs its arguments and the outcome") {
    const HostLog log;
    HostInstance::Options options;
    options.platform = "Float";
    options.hardware = 7;
    options.commandLine = "/words";
    options.recordRate = 44100;
    options.hostType = 2;
    HostInstance host(options);
    CHECK_EQ(log.texts(), Texts{
                              "{ VXDSPAPI_InitializeLibrary()",
                              "EngineName = MockEngine, PlatformName = Float, Hardware = 1, CommandLine = /words, APOPresetPath = "
                              "(null), RecordSampleRate = 44100, HostType = 2.",
                              "Done.",
                              "} VXDSPAPI_InitializeLibrary()",
                          });
}

TEST_CASE("a first format logs what is created, a change what is disposed of before, and the same formats only that") {
    const HostLog log;
    HostInstance host;
    const Texts created = {"Creating FFTFIR...",
                           "Creating pinknoise generator...",
                           "Creating sinewave generator...",
                           "Creating sinesweep generators...",
                           "Creating polarity tone generators...",
                           "Allocating RTAs..."};
    size_t before = log.texts().size();
    host.setFormat(formatOf(0x3));
    Texts expected = {"{ VXDSPAPI_SetIOFormat()"};
    expected.insert(expected.end(), created.begin(), created.end());
    expected.emplace_back("} VXDSPAPI_SetIOFormat()");
    CHECK_EQ(log.texts(before), expected);

    before = log.texts().size();
    host.setFormat(formatOf(0x3));
    CHECK_EQ(log.texts(before), Texts{"{ VXDSPAPI_SetIOFormat()", "Format hasn't changed", "} VXDSPAPI_SetIOFormat()"});

    before = log.texts().size();
    host.setFormat(formatOf(0x3, 480, 44100));
    expected = {"{ VXDSPAPI_SetIOFormat()", "Disposing RTAs...", "Disposing fftfir...", "Done."};
    expected.insert(expected.end(), created.begin(), created.end());
    expected.emplace_back("} VXDSPAPI_SetIOFormat()");
    CHECK_EQ(log.texts(before), expected);
}

TEST_CASE("components, gain and clearing log under their names; idle work does not") {
    const HostLog log;
    HostInstance host;
    host.setFormat(formatOf(0x3));
    const size_t before = log.texts().size();
    VXDSPAPI_SetInputGain(host.handle, 0.5F);
    VXDSPAPI_CreateComponent(host.handle, 0, -1, 96000, 48000);
    VXDSPAPI_CreateComponent(host.handle, 1, 2, 96000, 48000);
    VXDSPAPI_DisposeComponent(host.handle, 1, 2);
    VXDSPAPI_Clear(host.handle, 1);
    VXDSPAPI_OnIdle(host.handle);
    CHECK_EQ(log.texts(before), Texts{
                                    "{ VXDSPAPI_SetInputGain()",
                                    "Gain = 0.500000.",
                                    "} VXDSPAPI_SetInputGain()",
                                    "{ VXDSPAPI_CreateComponent()",
                                    "Setting sinewave generator's samplerate 96000.",
                                    "} VXDSPAPI_CreateComponent()",
                                    "{ VXDSPAPI_CreateComponent()",
                                    "} VXDSPAPI_CreateComponent()",
                                    "{ VXDSPAPI_DisposeComponent()",
                                    "Waiting for processing and recording routines to exit...",
                                    "Done.",
                                    "} VXDSPAPI_DisposeComponent()",
                                    "{ VXDSPAPI_Clear()",
                                    "} VXDSPAPI_Clear()",
                                });
}

TEST_CASE("disposing of a component of an instance that isn't initialised says so") {
    const HostLog log;
    HostInstance host;
    host.context().initialised = 0;
    const size_t before = log.texts().size();
    VXDSPAPI_DisposeComponent(host.handle, 1, 2);
    host.context().initialised = 1;
    CHECK_EQ(log.texts(before), Texts{"{ VXDSPAPI_DisposeComponent()", "Not initialized!", "} VXDSPAPI_DisposeComponent()"});
}

TEST_CASE("a parameter logs its address and first byte, and the routing what it knows") {
    const HostLog log;
    HostInstance host;
    const size_t before = log.texts().size();
    uint8_t data[2] = {0xAB, 0};
    VXDSPAPI_SetParameter(host.handle, 3, 40, 2, data, 2);
    VXDSPAPI_SetParameter(host.handle, 3, 41, 0, data, 0);
    data[0] = 1;
    VXDSPAPI_SetParameter(host.handle, 3, -6, 0, data, 1);
    CHECK_EQ(log.texts(before), Texts{
                                    "{ VXDSPAPI_SetParameter()",
                                    "ComponentId = 3, ParamId = 40, Channel = 2, Data[0] = 0xAB, DataSize = 2",
                                    "} VXDSPAPI_SetParameter()",
                                    "{ VXDSPAPI_SetParameter()",
                                    "ComponentId = 3, ParamId = 41, Channel = 0, Data[0] = 0xAB, DataSize = 0",
                                    "} VXDSPAPI_SetParameter()",
                                    "{ VXDSPAPI_SetParameter()",
                                    "ComponentId = 3, ParamId = -6, Channel = 0, Data[0] = 0x01, DataSize = 1",
                                    "ISSTModuleLoaded = 0, enable = 1.",
                                    "ISSTModuleLoaded = 0.",
                                    "} VXDSPAPI_SetParameter()",
                                });
}

TEST_CASE("freeing logs the teardown and says last that the context goes") {
    const HostLog log;
    HostInstance host;
    host.setFormat(formatOf(0x3));
    const size_t before = log.texts().size();
    host.free();
    const Texts texts = log.texts(before);
    REQUIRE(texts.size() >= 6);
    CHECK_EQ(texts[0], "{ VXDSPAPI_FreeLibrary()");
    CHECK_EQ(Texts(texts.begin() + 1, texts.begin() + 6),
             Texts{"{ VXDSPAPI_SetIOFormat()", "Disposing RTAs...", "Disposing fftfir...", "Done.", "} VXDSPAPI_SetIOFormat()"});
    CHECK(std::find(texts.begin(), texts.end(), "Disposing library context.") != texts.end());
}

TEST_CASE("diagnostic commands and blocks log nothing") {
    const HostLog log;
    HostInstance host;
    host.setFormat(formatOf(0x3));
    const size_t before = log.lines().size();
    for (int32_t id = -29; id < 0; ++id) command(host, id, std::vector<uint8_t>(20, 0));
    Block block;
    host.process(block, formatOf(0x3), formatOf(0x3));
    CHECK_EQ(log.lines().size(), before);
}
