// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include <algorithm>
#include <cstring>

#include "host/adapters.h"
#include "host/library_loader.h"
#include "tests/support/host_instance.h"
#include "tests/support/leak_allowed.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

VXHandle open(const char *engine, const char *platform, const char *commandLine = nullptr, int hostType = 0) {
    return VXDSPAPI_InitializeLibrary(engine, platform, 0, commandLine, nullptr, 48000, hostType);
}

}  // namespace

TEST_CASE("a module that isn't there, an empty name, no name at all and a file that is no module give null") {
    CHECK_EQ(open("NoSuchEngine", nullptr), nullptr);
    CHECK_EQ(open("", nullptr), nullptr);
    CHECK_EQ(open(nullptr, nullptr), nullptr);
    CHECK_EQ(open(nullptr, "Float"), nullptr);
    CHECK_EQ(open("NotAModule", nullptr), nullptr);
    CHECK_EQ(open(std::string(5000, 'x').c_str(), nullptr), nullptr);
}

TEST_CASE("the platform name hifi2 fails in the load, even though the module name was composed without a platform part") {
    CHECK_EQ(open("MockEngine", "hifi2"), nullptr);
    CHECK_EQ(open("MockEngine", "Other"), nullptr);
    HostInstance::Options options;
    options.platform = "Float";
    CHECK_NE(HostInstance(options).handle, nullptr);
}

TEST_CASE("at host type 3 a platform name with a known adapter loads the module without platform part") {
    HostInstance::Options options;
    options.platform = "HiFi2";
    options.hostType = 3;
    HostInstance host(options);
    CHECK_EQ(std::string(host.context().engineFileName), "MockEngine.dll");
    CHECK((host.context().processAdapter == &fixedPointProcess));
}

TEST_CASE("a module without VXDSPAPI_Initialize gives null") {
    const LeakAllowed contextOfTheModule;
    CHECK_EQ(open("NoInitializeEngine", nullptr), nullptr);
}

TEST_CASE("an engine that declines gives null, after its context had been set up") {
    Module keep;
    MockEngine &engine = mockEngine("MockEngine.dll", keep);
    engine = MockEngine();
    engine.decline = true;
    CHECK_EQ(open("MockEngine", nullptr, "/decline", 2), nullptr);
    REQUIRE_NE(engine.context, nullptr);
    CHECK_EQ(engine.context->hostType, 2);
    CHECK_EQ(engine.context->blockFrames, 512);
    CHECK_EQ(engine.commandLine, "/decline");
    // Kept: nothing frees this context; the test does, so that leak checks stay sharp for everything else.
    LibraryContext *left = engine.context;
    freeText(left->commandLine);
    freeText(left->engineShortName);
    Module release(left->engineModule);
    destroyContext(left);
    engine = MockEngine();
}

TEST_CASE("the engine is started with the caller's arguments and finds its context in the handle's first word") {
    HostInstance::Options options;
    options.platform = "Float";
    options.hardware = 3;
    options.commandLine = "/a /b";
    options.hostType = 4;
    HostInstance host(options);
    const MockEngine &engine = host.engine();
    CHECK_EQ(engine.hardware, 3);
    CHECK_EQ(engine.platformName, "Float");
    CHECK_EQ(engine.commandLine, "/a /b");
    CHECK_EQ(engine.hostType, 4);
    CHECK_EQ(engine.context, &host.context());
    CHECK((engine.callback != nullptr));
    engine.callback(engine.context, 0, 0, "nobody listens");
    engine.callback(nullptr, 0, 0, nullptr);
}

TEST_CASE("a fresh instance has its defaults") {
    HostInstance::Options options;
    options.hardware = 2;
    options.recordRate = 44100;
    HostInstance host(options);
    const LibraryContext &context = host.context();
    CHECK_EQ(context.initialised, 1);
    CHECK_EQ(context.recordSampleRate, 44100);
    CHECK_EQ(context.sampleRate, 0);
    CHECK_EQ(context.blockFrames, 512);
    CHECK_EQ(context.recordFirResetPending, 1);
    CHECK_EQ(context.processFirResetPending, 1);
    CHECK_EQ(context.processFirLength, 128);
    for (const uint32_t length : context.recordFirLength) CHECK_EQ(length, 128);
    CHECK_EQ(context.analyserFeedMode, 2);
    for (int i = 0; i < VX_SLOT_COUNT; ++i) {
        CHECK_EQ(context.recordPeak[i], 1e-6F);
        CHECK_EQ(context.inputPeak[i], 1e-6F);
        CHECK_EQ(context.outputPeak[i], 1e-6F);
        CHECK_EQ(context.recordFixedPointers[i], context.recordFixedBuffers[i]);
        CHECK_EQ(context.processFixedPointers[i], context.processFixedBuffers[i]);
    }
    CHECK_EQ(context.totalFrames, 0);
    CHECK_EQ(context.maxComponentId, 0);
    CHECK_EQ(context.hardwareFlag0, 0);
    CHECK_EQ(context.hardwareFlag1, 1);
    CHECK_EQ(context.apoPresetPath, nullptr);
    CHECK_EQ(context.commandLine, nullptr);
    CHECK_EQ(context.projectParameters, nullptr);
    CHECK_EQ(context.thisModuleVersion, 0);
    CHECK_EQ(context.apoModuleVersion, 0);
    CHECK_EQ(std::string(context.engineShortName), "VXORLO");
    CHECK_EQ(context.engineDescription.Size, 8);
    CHECK_EQ(context.engineDescription.ComponentCount, 6);
    CHECK_EQ(std::string(context.engineFileName), "MockEngine.dll");
    CHECK_EQ(context.trace, context.ownTrace);
}

TEST_CASE("all fourteen exports are bound, and a bare module leaves all but one null") {
    {
        HostInstance host;
        const LibraryContext &c = host.context();
        CHECK((c.engineInitialize != nullptr));
        CHECK((c.engineFree != nullptr));
        CHECK((c.engineIsInputFormatSupported != nullptr));
        CHECK((c.engineIsOutputFormatSupported != nullptr));
        CHECK((c.engineSetIOFormat != nullptr));
        CHECK((c.engineSetInputGain != nullptr));
        CHECK((c.engineCreateComponent != nullptr));
        CHECK((c.engineDisposeComponent != nullptr));
        CHECK((c.engineClear != nullptr));
        CHECK((c.engineSetParameter != nullptr));
        CHECK((c.engineReadWriteData != nullptr));
        CHECK((c.engineProcess != nullptr));
        CHECK((c.engineRecord != nullptr));
        CHECK((c.engineOnIdle != nullptr));
    }
    HostInstance::Options options;
    options.engine = "BareEngine";
    HostInstance bare(options);
    const LibraryContext &c = bare.context();
    CHECK((c.engineFree == nullptr));
    CHECK((c.engineProcess == nullptr));
    CHECK((c.engineOnIdle == nullptr));
}

TEST_CASE("every call tolerates an engine without exports") {
    HostInstance::Options options;
    options.engine = "BareEngine";
    HostInstance host(options);
    IOFormat input = formatOf(0x3);
    IOFormat output = formatOf(0x3);
    CHECK_EQ(VXDSPAPI_SetIOFormat(host.handle, &input, &output), 0);
    VXDSPAPI_SetInputGain(host.handle, 0.5F);
    VXDSPAPI_CreateComponent(host.handle, 1, 7, 48000, 48000);
    CHECK_EQ(host.context().maxComponentId, 0);
    VXDSPAPI_DisposeComponent(host.handle, 1, 7);
    VXDSPAPI_Clear(host.handle, 0);
    VXDSPAPI_OnIdle(host.handle);
    uint8_t data[4] = {};
    CHECK_EQ(VXDSPAPI_SetParameter(host.handle, -1, -2, 0, data, 4), 0);
    Block block(480);
    std::fill_n(block.slot(0), 480, 0.5F);
    const Block before = block;
    host.process(block, input, output);
    VXDSPAPI_Record(host.handle, &block.buffers, &input);
    CHECK(block == before);
}

TEST_CASE("a command line of /wrpresetbinoff sets that switch and leaves boardParamsWriteOff 0") {
    HostInstance::Options options;
    options.commandLine = "/wrpresetbinoff";
    HostInstance host(options);
    CHECK_EQ(host.context().presetBinWriteOff, 1);
    CHECK_EQ(host.context().boardParamsWriteOff, 0);
    CHECK_EQ(std::string(host.context().commandLine), "/wrpresetbinoff");
}

TEST_CASE("the command line's switches are plain substrings") {
    HostInstance::Options options;
    options.commandLine = "x/wrboardparamsoffy/wrpresetbin";
    HostInstance host(options);
    CHECK_EQ(host.context().presetBinWriteOff, 0);
    CHECK_EQ(host.context().boardParamsWriteOff, 1);
}

TEST_CASE("VXDSPAPI_Initialize and VXDSPAPI_Free of the host change nothing and fail in no way") {
    HostInstance host;
    const LibraryContext &context = host.context();
    const size_t calls = host.engine().calls.size();
    std::vector<uint8_t> before(sizeof context);
    std::memcpy(before.data(), static_cast<const void *>(&context), before.size());
    VXDSPAPI_Initialize();
    VXDSPAPI_Free();
    CHECK_EQ(std::memcmp(before.data(), static_cast<const void *>(&context), before.size()), 0);
    CHECK_EQ(host.engine().calls.size(), calls);
}

TEST_CASE("freeing tears the formats down, then frees the engine's instance, and returns what releasing the module returned") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    host.engine().calls.clear();
    CHECK_NE(host.free(), 0);
    CHECK_EQ(host.engine().calls, std::vector<std::string>{"Free"});
}

TEST_CASE("freeing a context that holds no module returns 0") {
    HostInstance host;
    Module module(host.context().engineModule);
    host.context().engineModule = nullptr;
    CHECK_EQ(host.free(), 0);
}

TEST_CASE("several instances of one module stand side by side") {
    HostInstance first;
    const VXHandle second = open("MockEngine", nullptr);
    REQUIRE_NE(second, nullptr);
    CHECK_NE(second, first.handle);
    LibraryContext &context = **static_cast<LibraryContext **>(second);
    CHECK_NE(&context, &first.context());
    first.setFormat(formatOf(0x3));
    CHECK_EQ(context.inputFormat.channels, 0);
    CHECK_NE(VXDSPAPI_FreeLibrary(second), 0);
    CHECK_EQ(first.context().inputFormat.channels, 2);
}
