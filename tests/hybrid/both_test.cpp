// SPDX-License-Identifier: MIT
//
// Both files of the hybrid module beside the program: loading, unloading, routing and the block.
#include <doctest/doctest.h>

#include "platform/thread_id.h"
#include "tests/hybrid/hybrid_host.h"
#include "tests/support/data_command.h"
#include "tests/support/host_log.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const IOFormat kStereo = formatOf(0x3);

const Calls kCreated = {"CreateComponent(1, 0, 48000, 48000)", "CreateComponent(3, 1, 48000, 48000)",
                        "CreateComponent(2, 2, 48000, 48000)", "CreateComponent(0, 3, 48000, 48000)",
                        "CreateComponent(4, 4, 48000, 48000)", "CreateComponent(5, 5, 48000, 48000)"};
const Calls kDisposed = {"DisposeComponent(1, 0)", "DisposeComponent(3, 1)", "DisposeComponent(2, 2)",
                         "DisposeComponent(0, 3)", "DisposeComponent(4, 4)", "DisposeComponent(5, 5)"};

Calls joined(std::initializer_list<Calls> parts) {
    Calls all;
    for (const Calls &part : parts) all.insert(all.end(), part.begin(), part.end());
    return all;
}

// The state of the module behind the first file name.
MockEngine &module() {
    static Module keep;
    static MockEngine &state = mockEngine("Tarnlight.Orlo.DSP.HiFi2.dll", keep);
    return state;
}

// A host of a type with the stereo format set and a fresh module behind the name.
struct Hybrid {
    explicit Hybrid(int32_t type, bool withFormat = true) : host(options(type)) {
        module() = MockEngine();
        if (withFormat) host.setFormat(kStereo);
        host.engine().calls.clear();
    }
    static HostInstance::Options options(int32_t type) {
        HostInstance::Options options = hostType(type);
        options.commandLine = "/some words";
        return options;
    }
    // Both call lists emptied, with the module running.
    void load(uint32_t mode = 1) {
        setHardwareMode(host, mode);
        host.engine().calls.clear();
        module().calls.clear();
    }

    HostInstance host;
};

}  // namespace

TEST_CASE("-25 with bit 0 loads the module, gives it the main context, the format and its six components") {
    for (const int32_t type : {2, 3, 4}) {
        Hybrid hybrid(type);
        const uint32_t mode = 0x80000001;
        CHECK_EQ(setHardwareMode(hybrid.host, mode), 4);
        const LibraryContext &context = hybrid.host.context();
        CHECK_EQ(context.hardwareMode, mode);
        CHECK_EQ(context.isstLoaded, 1);
        CHECK_EQ(context.processStop, 0);
        CHECK_EQ(module().calls, joined({{"Initialize", "SetIOFormat(2, 2)"}, kCreated}));
        CHECK_EQ(module().hardware, type == 2 ? 0 : mode);
        CHECK_EQ(module().platformName, type == 2 ? "HiFI2" : "iSST");
        CHECK_EQ(module().commandLine, "/some words");
        CHECK_EQ(module().context, &context);
        CHECK_EQ(module().hostType, type);
        REQUIRE(context.isstHandle != nullptr);
        CHECK_EQ(*static_cast<LibraryContext **>(context.isstHandle), context.isstModule);
        CHECK_EQ(std::string(context.isstModule->engineFileName), "Tarnlight.Orlo.DSP.HiFi2.dll");
        CHECK_EQ(context.isstModule->trace, context.trace);
        CHECK_EQ(hybrid.host.engine().calls, Calls{});
    }
}

TEST_CASE("at other host types -25 only stores the mode") {
    for (const int32_t type : {0, 1, 5, -3}) {
        Hybrid hybrid(type);
        CHECK_EQ(setHardwareMode(hybrid.host, 3), 4);
        CHECK_EQ(hybrid.host.context().hardwareMode, 3);
        CHECK_EQ(hybrid.host.context().isstModule, nullptr);
        CHECK_EQ(module().calls, Calls{});
    }
}

TEST_CASE("-25 with the same value twice: the second call does not touch the module") {
    Hybrid hybrid(3);
    hybrid.load(1);
    CHECK_EQ(setHardwareMode(hybrid.host, 1), 4);
    CHECK_EQ(module().calls, Calls{});
    CHECK_EQ(hybrid.host.context().isstLoaded, 1);
}

TEST_CASE("-25 with another value loads the module anew") {
    Hybrid hybrid(3);
    hybrid.load(1);
    CHECK_EQ(setHardwareMode(hybrid.host, 5), 4);
    CHECK_EQ(module().calls, joined({kDisposed, {"Free", "Initialize", "SetIOFormat(2, 2)"}, kCreated}));
    CHECK_EQ(module().hardware, 5);
}

TEST_CASE("-25 with bit 0 clear while a module runs unloads it, and the result is the four bytes read") {
    Hybrid hybrid(3);
    hybrid.load(1);
    CHECK_EQ(setHardwareMode(hybrid.host, 2), 4);
    CHECK_EQ(module().calls, joined({kDisposed, {"Free"}}));
    const LibraryContext &context = hybrid.host.context();
    CHECK_EQ(context.isstLoaded, 0);
    CHECK_EQ(context.isstModule, nullptr);
    CHECK_EQ(context.isstHandle, nullptr);
    CHECK_EQ(context.hardwareMode, 2);
}

TEST_CASE("the process function is held up while the module loads and unloads, the capture side is not") {
    Hybrid hybrid(3);
    const LibraryContext &context = hybrid.host.context();
    int held = 0;
    int notHeld = 0;
    module().onControl = [&] { ++(context.processStop == 1 && context.recordStop == 0 ? held : notHeld); };
    setHardwareMode(hybrid.host, 1);
    setHardwareMode(hybrid.host, 0);
    CHECK_EQ(held, 1 + 6 + 6 + 1);
    CHECK_EQ(notHeld, 0);
}

TEST_CASE("an event (-1, -1) during the start at host type 3 ends in the unloading of the module; at host type 4 it stays") {
    for (const int32_t type : {3, 4}) {
        const HostLog log;
        Hybrid hybrid(type);
        module().onInitialize = [](LibraryContext *context, EngineEventCallback callback) { callback(context, -1, -1, nullptr); };
        const size_t before = log.texts().size();
        setHardwareMode(hybrid.host, 1);
        const LibraryContext &context = hybrid.host.context();
        if (type == 4) {
            CHECK_EQ(context.isstLoaded, 1);
            continue;
        }
        CHECK_EQ(context.isstLoaded, 0);
        CHECK_EQ(context.isstModule, nullptr);
        CHECK_EQ(context.isstHandle, nullptr);
        CHECK_EQ(module().calls, Calls{"Initialize", "Free"});
        CHECK_EQ(log.texts(before + 2), std::vector<std::string>{
                                            "{ LoadISSTModule()",
                                            "Loading Tarnlight.Orlo.DSP.HiFi2.dll module.",
                                            "Tarnlight.Orlo.DSP.HiFi2.dll module is loaded.",
                                            "Initializing library...",
                                            "ISSTModuleLoaded = 0! Unloading iSST module.",
                                            "{ UnloadISSTModule()",
                                            "} UnloadISSTModule()",
                                            "Done.",
                                            "} LoadISSTModule()",
                                            "} VXDSPAPI_SetParameter()",
                                        });
    }
}

TEST_CASE("other events than (-1, -1) leave the module in use; code 0 writes a debug line") {
    const HostLog log;
    Hybrid hybrid(3);
    hybrid.load(1);
    LibraryContext &context = hybrid.host.context();
    module().callback(&context, -1, 0, "no");
    module().callback(&context, -2, -1, "no");
    module().callback(&context, 1, -1, "no");
    CHECK_EQ(context.isstLoaded, 1);
    const size_t before = log.lines().size();
    module().callback(&context, 0, 17, "text of the module\n");
    module().callback(&context, 0, 0, nullptr);
    module().callback(nullptr, 0, 0, "nobody\n");
    const std::vector<std::string> lines = log.lines();
    REQUIRE_EQ(lines.size(), before + 1);
    CHECK_EQ(lines.back(), std::to_string(currentThreadId()) + ": VXCOMNUtext of the module");
}

TEST_CASE("at host type 2 the module's events come to nothing") {
    const HostLog log;
    Hybrid hybrid(2);
    hybrid.load(1);
    const size_t before = log.lines().size();
    module().callback(&hybrid.host.context(), -1, -1, nullptr);
    module().callback(&hybrid.host.context(), 0, 0, "text\n");
    CHECK_EQ(hybrid.host.context().isstLoaded, 1);
    CHECK_EQ(log.lines().size(), before);
}

TEST_CASE("a module that declines later is left where it is, and freed when -25 changes") {
    Hybrid hybrid(3);
    hybrid.load(1);
    module().callback(&hybrid.host.context(), -1, -1, nullptr);
    CHECK_EQ(hybrid.host.context().isstLoaded, 0);
    CHECK(hybrid.host.context().isstHandle != nullptr);
    setByte(hybrid.host, 1, 40, 1);
    CHECK_EQ(module().calls, Calls{});
    setHardwareMode(hybrid.host, 3);
    CHECK_EQ(hybrid.host.context().isstLoaded, 1);
    CHECK_EQ(module().calls, joined({{"Free", "Initialize", "SetIOFormat(2, 2)"}, kCreated}));
}

TEST_CASE("a module that gives no instance leaves its context, and the next load starts from nothing") {
    const HostLog log;
    Hybrid hybrid(3);
    module().decline = true;
    const size_t before = log.texts().size();
    CHECK_EQ(setHardwareMode(hybrid.host, 1), 4);
    const LibraryContext &context = hybrid.host.context();
    CHECK_EQ(context.isstLoaded, 0);
    CHECK_EQ(context.isstHandle, nullptr);
    CHECK(context.isstModule != nullptr);
    CHECK_EQ(log.texts(before + 5),
             std::vector<std::string>{"Initializing library...", "Failed!", "} LoadISSTModule()", "} VXDSPAPI_SetParameter()"});
    module().decline = false;
    setHardwareMode(hybrid.host, 3);
    CHECK_EQ(context.isstLoaded, 1);
}

TEST_CASE("a main engine without SetParameter keeps the module from starting, whatever the message says") {
    const HostLog log;
    Hybrid hybrid(3);
    hybrid.host.context().engineSetParameter = nullptr;
    const size_t before = log.texts().size();
    setHardwareMode(hybrid.host, 1);
    CHECK_EQ(hybrid.host.context().isstLoaded, 0);
    CHECK(hybrid.host.context().isstModule != nullptr);
    CHECK_EQ(module().calls, Calls{});
    CHECK_EQ(log.texts(before + 5), std::vector<std::string>{"iSST module doesn't expose VXDSPAPI_SetParameter()!",
                                                             "} LoadISSTModule()", "} VXDSPAPI_SetParameter()"});
}

TEST_CASE("a format change unloads the module, also if the rate is the only change; it comes back when -25 changes") {
    Hybrid hybrid(3);
    hybrid.load(1);
    hybrid.host.setFormat(formatOf(0x3, 480, 44100));
    CHECK_EQ(module().calls, joined({kDisposed, {"Free"}}));
    CHECK_EQ(hybrid.host.context().isstLoaded, 0);
    setHardwareMode(hybrid.host, 1);
    CHECK_EQ(hybrid.host.context().isstLoaded, 0);
    setHardwareMode(hybrid.host, 3);
    CHECK_EQ(hybrid.host.context().isstLoaded, 1);
}

TEST_CASE("a module that was loaded ahead of the first format receives it, and its result replaces the engine's") {
    Hybrid hybrid(3, false);
    hybrid.load(1);
    hybrid.host.engine().setFormatResult = 5;
    module().setFormatResult = 9;
    IOFormat input = kStereo;
    IOFormat output = kStereo;
    CHECK_EQ(VXDSPAPI_SetIOFormat(hybrid.host.handle, &input, &output), 9);
    CHECK_EQ(module().calls, Calls{"SetIOFormat(2, 2)"});
    CHECK_EQ(hybrid.host.context().isstLoaded, 1);
}

TEST_CASE("freeing the library unloads the module, with or without a format") {
    for (const bool withFormat : {true, false}) {
        Hybrid hybrid(3, withFormat);
        hybrid.load(1);
        hybrid.host.free();
        CHECK_EQ(module().calls, joined({kDisposed, {"Free"}}));
    }
}

TEST_CASE("a component is enabled in one of the two engines") {
    struct Case {
        uint8_t enable;
        uint8_t onISST;
        const char *main;
        const char *module;
    };
    for (const Case &c : {Case{0, 0, "00", "00"}, Case{0, 1, "00", "00"}, Case{1, 0, "01", "00"}, Case{1, 1, "00", "01"}}) {
        Hybrid hybrid(3);
        hybrid.load(1);
        CHECK_EQ(setByte(hybrid.host, 2, -26, c.onISST), 1);
        hybrid.host.engine().calls.clear();
        module().calls.clear();
        CHECK_EQ(setByte(hybrid.host, 2, -6, c.enable), 1);
        CHECK_EQ(hybrid.host.engine().calls[0], std::string("SetParameter(2, -6, 0, [") + c.main + "])");
        CHECK_EQ(module().calls[0], std::string("SetParameter(2, -6, 0, [") + c.module + "])");
    }
}

TEST_CASE("with some enabled component in the main engine, it keeps the input gain and the module the output gain") {
    const HostLog log;
    Hybrid hybrid(3);
    VXDSPAPI_CreateComponent(hybrid.host.handle, 1, 4, 48000, 48000);
    hybrid.load(1);
    const size_t before = log.texts().size();
    setByte(hybrid.host, 4, -6, 1);
    CHECK_EQ(hybrid.host.engine().calls,
             Calls{"SetParameter(4, -6, 0, [01])", "SetParameter(-1, -29, 0, [00])", "SetParameter(-1, -30, 0, [01])"});
    CHECK_EQ(module().calls, Calls{"SetParameter(4, -6, 0, [00])", "SetParameter(-1, -29, 0, [01])"});
    CHECK_EQ(log.texts(before), std::vector<std::string>{
                                    "{ VXDSPAPI_SetParameter()",
                                    "ComponentId = 4, ParamId = -6, Channel = 0, Data[0] = 0x01, DataSize = 1",
                                    "ISSTModuleLoaded = 1, enable = 1.",
                                    "ISSTModuleLoaded = 1.",
                                    "hybridProcMode = 1.",
                                    "} VXDSPAPI_SetParameter()",
                                });
    CHECK_EQ(command(hybrid.host, VXDSP_DATA_ISST_STATE).bytes[0], 1);
}

TEST_CASE("with every enabled component on the module, hybridProcMode is 0 and only the module applies the gains") {
    Hybrid hybrid(3);
    VXDSPAPI_CreateComponent(hybrid.host.handle, 1, 4, 48000, 48000);
    hybrid.load(1);
    setByte(hybrid.host, 4, -6, 1);
    hybrid.host.engine().calls.clear();
    module().calls.clear();
    setByte(hybrid.host, 4, -26, 1);
    CHECK_EQ(hybrid.host.engine().calls,
             Calls{"SetParameter(4, -6, 0, [00])", "SetParameter(-1, -29, 0, [01])", "SetParameter(-1, -30, 0, [01])"});
    CHECK_EQ(module().calls, Calls{"SetParameter(4, -6, 0, [01])", "SetParameter(-1, -29, 0, [00])"});
    CHECK_EQ(command(hybrid.host, VXDSP_DATA_ISST_STATE).bytes[0], 2);
}

TEST_CASE("a component above maxComponentId does not count for hybridProcMode, nor for the state") {
    Hybrid hybrid(3);
    VXDSPAPI_CreateComponent(hybrid.host.handle, 1, 4, 48000, 48000);
    hybrid.load(1);
    setByte(hybrid.host, 5, -6, 1);
    CHECK_EQ(module().calls, Calls{"SetParameter(5, -6, 0, [00])", "SetParameter(-1, -29, 0, [00])"});
    CHECK_EQ(command(hybrid.host, VXDSP_DATA_ISST_STATE).bytes[0], 2);
    setByte(hybrid.host, 0, -6, 1);
    CHECK_EQ(command(hybrid.host, VXDSP_DATA_ISST_STATE).bytes[0], 1);
}

TEST_CASE("an engine or a module without SetParameter is skipped by the routing") {
    Hybrid hybrid(3);
    hybrid.load(1);
    hybrid.host.context().engineSetParameter = nullptr;
    CHECK_EQ(setByte(hybrid.host, 2, -6, 1), 1);
    CHECK_EQ(hybrid.host.engine().calls, Calls{});
    CHECK_EQ(module().calls.size(), 2);
    hybrid.host.context().isstModule->engineSetParameter = nullptr;
    CHECK_EQ(setByte(hybrid.host, 2, -6, 0), 1);
    CHECK_EQ(module().calls.size(), 2);
}

TEST_CASE("parameters, diagnostic data and the input gain go to both, and the module's result replaces the engine's") {
    Hybrid hybrid(3);
    hybrid.load(1);
    hybrid.host.engine().parameterResult = hybrid.host.engine().dataResult = 3;
    module().parameterResult = module().dataResult = 8;
    CHECK_EQ(setByte(hybrid.host, 2, 40, 1), 8);
    CHECK_EQ(setByte(hybrid.host, -1, -30, 1), 8);
    CHECK_EQ(command(hybrid.host, 12, {1, 2}).size, 8);
    CHECK_EQ(command(hybrid.host, -16).size, 8);
    VXDSPAPI_SetInputGain(hybrid.host.handle, 0.5F);
    const Calls expected = {"SetParameter(2, 40, 0, [01])", "SetParameter(-1, -30, 0, [01])", "ReadWriteData(0, 12, 2)",
                            "ReadWriteData(0, -16, 0)", "SetInputGain(0.5)"};
    CHECK_EQ(hybrid.host.engine().calls, expected);
    CHECK_EQ(module().calls, expected);
    hybrid.host.context().isstModule->engineReadWriteData = nullptr;
    CHECK_EQ(command(hybrid.host, 12).size, 3);
    CHECK_EQ(command(hybrid.host, VXDSP_DATA_ISST_LOADED).bytes[0], 1);
}

TEST_CASE("the host's own commands and parameters do not reach the module") {
    Hybrid hybrid(3);
    hybrid.load(1);
    for (const int32_t id : {-1, -10, -13, -17, -26, -29}) command(hybrid.host, id, std::vector<uint8_t>(20, 0));
    setByte(hybrid.host, 0, -15, 1);
    setByte(hybrid.host, 0, -13, 1);
    setByte(hybrid.host, 0, -17, 0);
    CHECK_EQ(module().calls, Calls{});
}

TEST_CASE("with bit 1 the module runs in the block behind the main engine, on 24-bit words") {
    Hybrid hybrid(3);
    hybrid.load(3);
    int32_t seen = 0;
    hybrid.host.engine().onProcess = [](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *output) {
        for (int i = 0; i < output->frames; ++i) buffers->channels[0][i] = 0.5F;
    };
    module().onProcess = [&seen](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *output) {
        auto *const words = reinterpret_cast<int32_t *>(buffers->channels[0]);
        seen = words[7];
        for (int i = 0; i < output->frames; ++i) words[i] /= 2;
    };
    Block block(512);
    hybrid.host.process(block, kStereo, kStereo);
    CHECK_EQ(seen, 0x40000000);
    CHECK_EQ(block.slot(0)[7], 0.25F);
}

TEST_CASE("without bit 1 a loaded module receives parameters only, and a preset instance runs neither engine") {
    Hybrid hybrid(3);
    hybrid.load(1);
    bool ran = false;
    module().onProcess = [&ran](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ran = true; };
    module().onRecord = [&ran](VXEngineHandle, ProcessBuffers *, IOFormat *) { ran = true; };
    Block block(512, 0.1F);
    hybrid.host.process(block, kStereo, kStereo);
    IOFormat format = kStereo;
    VXDSPAPI_Record(hybrid.host.handle, &block.buffers, &format);
    CHECK_FALSE(ran);
}

TEST_CASE("-26 at host type 3 returns 1 once a module is loaded") {
    Hybrid hybrid(3);
    CHECK_EQ(setByte(hybrid.host, 2, -26, 1), 0);
    hybrid.load(1);
    CHECK_EQ(setByte(hybrid.host, 2, -26, 1), 1);
}
