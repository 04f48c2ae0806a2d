// SPDX-License-Identifier: MIT
//
// Engine, I/O configuration, profile and content type: set, told, and given up.
#include "tests/control/open_slot.h"

#include <cstdio>
#include <cstring>
#include <thread>

#include "platform/endpoints.h"
#include "platform/variant.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const EngineConfig kNovara = {20, 0, 1, {{0, 0}}};

struct Setting {
    const char *line;
    int32_t (*set)(VXAPOHandle, const char *);
    int32_t (*get)(VXAPOHandle, char *);
    CAPOPresetFile::Text CAPOPresetFile::*property;
    const VXWCHAR *value;
    size_t limit;
};

int32_t setNovara(VXAPOHandle handle, const char *name) {
    return VXAPOCOMAPI_SetEngine(handle, name, &kNovara);
}

const Setting kEngine = {"Engine Name = ",       setNovara, VXAPOCOMAPI_GetEngine, &CAPOPresetFile::EngineShortName,
                         store_name::engineName, 1024};
const Setting kIOConfig = {
    "I/O Config = ", VXAPOCOMAPI_SetIOConfig, VXAPOCOMAPI_GetIOConfig, &CAPOPresetFile::IOConfigName, store_name::ioConfig, 1024};
const Setting kProfile = {"User profile = ",          VXAPOCOMAPI_SetUserProfile,
                          VXAPOCOMAPI_GetUserProfile, &CAPOPresetFile::UserProfileName,
                          store_name::userProfile,    512};
const Setting kContent = {"Content Type = ",          VXAPOCOMAPI_SetContentType,
                          VXAPOCOMAPI_GetContentType, &CAPOPresetFile::ContentTypeName,
                          store_name::contentType,    512};
const Setting kAll[] = {kEngine, kIOConfig, kProfile, kContent};

struct Buffer {
    char bytes[1100];
    Buffer() { std::memset(bytes, '~', sizeof bytes); }
    bool untouched() const {
        return std::all_of(bytes, bytes + sizeof bytes, [](char byte) { return byte == '~'; });
    }
    std::string text() const { return std::memchr(bytes, 0, sizeof bytes) != nullptr ? bytes : "(no end)"; }
};

std::string told(const Setting &setting, VXAPOHandle handle) {
    Buffer buffer;
    CHECK(setting.get(handle, buffer.bytes) == 1);
    return buffer.text();
}

uint64_t writeTime() {
    uint64_t time = 0;
    SampleMachine::configurationKey().readU64(store_name::writeTime, time);
    return time;
}

// Sets an engine and an I/O configuration, says so, and ends cleanly once its input ends.
const test::Helper forceSelection("force-selection", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(api, toWide(arguments.at(0)).c_str(), 0);
    if (VXAPOCOMAPI_SetAPOType(endpoint, "EFX") != 1) return 1;
    if (VXAPOCOMAPI_SetEngine(endpoint, "KZNOVA", &kNovara) != 1) return 2;
    if (VXAPOCOMAPI_SetIOConfig(endpoint, "Forced") != 1) return 3;
    if (VXAPOCOMAPI_SetUserProfile(endpoint, "Theirs") != 1) return 4;
    test::sayLine("set");
    while (std::getchar() != EOF) {
    }
    return VXAPOCOMAPI_FreeAPI(api) == 1 ? 0 : 5;
});

test::Process startForcing(const SampleMachine &machine) {
    test::Process process = test::startHelper("force-selection", {toUtf8(machine.endpointId())});
    REQUIRE(process.readLine() == "set");
    return process;
}

}  // namespace

TEST_CASE_FIXTURE(NoSlot, "a selection before a slot is chosen fails with -9 and leaves the property as it was") {
    for (const Setting &setting : kAll) {
        INFO(setting.line);
        const WideString before = (context().*setting.property).get();
        int32_t result = 1;
        const auto lines = linesOf([&] { result = setting.set(handle(), "Some"); });
        CHECK(result == 0);
        CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
        CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
        CHECK((context().*setting.property).get() == before);
        CHECK(contains(lines, "APO type is not set"));
        CHECK(contains(lines, "Error: -9"));
        VXAPOCOMAPI_SetLastError(handle(), 0);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a selection moves the property, stands under the slot's key with a new stamp, and is logged") {
    for (const Setting &setting : kAll) {
        INFO(setting.line);
        const uint64_t before = writeTime();
        int32_t result = 0;
        const auto lines = linesOf([&] { result = setting.set(handle(), "KZNOVA"); });
        CHECK(result == 1);
        CHECK(error() == 0);
        CHECK((context().*setting.property).get() == VX_TEXT("KZNOVA"));
        CHECK(SampleMachine::textAt(SampleMachine::configurationKey(), setting.value) == "KZNOVA");
        CHECK(writeTime() != before);
        CHECK(contains(lines, setting.line + std::string("KZNOVA")));
        CHECK(told(setting, handle()) == "KZNOVA");
    }
}

TEST_CASE_FIXTURE(OpenSlot, "an engine and an I/O configuration are written with their setter, the two others without one") {
    for (const Setting &setting : kAll) CHECK(setting.set(handle(), "KZNOVA") == 1);
    const RegistryKey key = SampleMachine::configurationKey();
    const std::string setter = toUtf8(context().ApiContext->SetterMutexName);
    CHECK(setter.rfind("Global\\{", 0) == 0);
    CHECK(SampleMachine::textAt(key, store_name::engineSetter) == setter);
    CHECK(SampleMachine::textAt(key, store_name::ioConfigSetter) == setter);
    Bytes record;
    CHECK(key.readBytes(store_name::engineConfig, record, sizeof(EngineConfig)) == RegistryRead::value);
    CHECK(record.size() == kNovara.Size);
    CHECK(std::memcmp(record.data(), &kNovara, record.size()) == 0);
    const auto &values = context().ApiContext->SetterValues;
    REQUIRE(values.size() == 1);
    CHECK(values.begin()->first == SampleMachine::configurationPath());
    CHECK(values.begin()->second == std::vector<WideString>{store_name::engineSetter, store_name::engineName,
                                                            store_name::engineConfig, store_name::ioConfigSetter});
}

TEST_CASE_FIXTURE(OpenSlot, "an engine record that says it is larger than a record is kept to its 524 bytes") {
    EngineConfig huge = kNovara;
    huge.Size = 0xFFFFFFFF;
    CHECK(VXAPOCOMAPI_SetEngine(handle(), "KZNOVA", &huge) == 1);
    Bytes record;
    CHECK(SampleMachine::configurationKey().readBytes(store_name::engineConfig, record, 1000) == RegistryRead::value);
    CHECK(record.size() == sizeof(EngineConfig));
}

TEST_CASE_FIXTURE(OpenSlot, "an engine set by a client that was killed reads back as the preset's engine") {
    test::Process other = startForcing(machine);
    CHECK(told(kEngine, handle()) == "KZNOVA");
    CHECK(told(kIOConfig, handle()) == "Forced");
    other.kill();
    other.wait();
    CHECK(told(kIOConfig, handle()) == "AnyOutput");
    CHECK(told(kEngine, handle()) == "VXORLO");
    // What it wrote and nobody took back counts no longer.
    CHECK(SampleMachine::textAt(SampleMachine::configurationKey(), store_name::engineName) == "KZNOVA");
}

TEST_CASE_FIXTURE(OpenSlot, "when a client ends normally its setter's values vanish, and the other three stay") {
    test::Process other = startForcing(machine);
    other.closeInput();
    CHECK(other.wait() == 0);
    const RegistryKey key = SampleMachine::configurationKey();
    for (const VXWCHAR *gone :
         {store_name::engineSetter, store_name::engineName, store_name::engineConfig, store_name::ioConfigSetter}) {
        CHECK(SampleMachine::textAt(key, gone) == "(none)");
    }
    CHECK(SampleMachine::textAt(key, store_name::ioConfig) == "Forced");
    CHECK(SampleMachine::textAt(key, store_name::userProfile) == "Theirs");
}

TEST_CASE_FIXTURE(OpenSlot, "the same engine set twice runs the property's subscribers both times") {
    CHECK(VXAPOCOMAPI_SetEngine(handle(), "KZNOVA", &kNovara) == 1);
    ChangeCount names(context().EngineShortName);
    ChangeCount records(context().EngineConfig);
    CHECK(VXAPOCOMAPI_SetEngine(handle(), "KZNOVA", &kNovara) == 1);
    CHECK(names.count == 2);
    CHECK(records.count == 2);
}

TEST_CASE_FIXTURE(OpenSlot, "the same I/O configuration set twice runs the property's subscribers once") {
    ChangeCount changes(context().IOConfigName);
    CHECK(VXAPOCOMAPI_SetIOConfig(handle(), "Other") == 1);
    CHECK(changes.count == 1);
    CHECK(VXAPOCOMAPI_SetIOConfig(handle(), "Other") == 1);
    CHECK(changes.count == 1);
}

TEST_CASE("the default record of an unknown engine is that of VXORLO, and KZ.Novara has one component") {
    const EngineConfig *const orlo = VXAPOCOMAPI_GetEngineDefaultConfig("VXORLO");
    CHECK(orlo->ComponentCount == 6);
    CHECK(orlo->Size == 8);
    CHECK(VXAPOCOMAPI_GetEngineDefaultConfig("unknown") == orlo);
    CHECK(VXAPOCOMAPI_GetEngineDefaultConfig("") == orlo);
    CHECK(VXAPOCOMAPI_GetEngineDefaultConfig(nullptr) == orlo);
    CHECK(VXAPOCOMAPI_GetEngineDefaultConfig("KZ.Novara")->ComponentCount == 1);
}

TEST_CASE_FIXTURE(OpenSlot, "a getter with a null buffer returns its status") {
    for (const Setting &setting : kAll) {
        CHECK(setting.get(handle(), nullptr) == 1);
        VXAPOCOMAPI_SetLastError(handle(), -4);
        CHECK(setting.get(handle(), nullptr) == 0);
        VXAPOCOMAPI_SetLastError(handle(), 0);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a name longer than the getter's limit isn't delivered, one that just fits is") {
    for (const Setting &setting : kAll) {
        INFO(setting.line);
        const std::string fits(setting.limit - 1, 'x'), tooLong(setting.limit, 'y');
        (context().*setting.property).setSilently(toWide(fits));
        Buffer buffer;
        // The pull may take the property back to what the store says.
        CHECK(setting.set(handle(), fits.c_str()) == 1);
        CHECK(setting.get(handle(), buffer.bytes) == 1);
        CHECK(buffer.text() == fits);
        Buffer other;
        CHECK(setting.set(handle(), tooLong.c_str()) == 1);
        CHECK(setting.get(handle(), other.bytes) == 1);
        CHECK(other.untouched());
    }
}

TEST_CASE_FIXTURE(OpenSlot, "the limit counts the bytes of UTF-8") {
    std::string text;
    for (int i = 0; i < 256; ++i) text += "\xC3\xA4";  // 512 bytes of 256 characters, and no room for the end
    CHECK(VXAPOCOMAPI_SetUserProfile(handle(), text.c_str()) == 1);
    Buffer buffer;
    CHECK(VXAPOCOMAPI_GetUserProfile(handle(), buffer.bytes) == 1);
    CHECK(buffer.untouched());
    text.resize(510);
    CHECK(VXAPOCOMAPI_SetUserProfile(handle(), text.c_str()) == 1);
    CHECK(VXAPOCOMAPI_GetUserProfile(handle(), buffer.bytes) == 1);
    CHECK(buffer.text() == text);
}

TEST_CASE_FIXTURE(NoSlot, "on a fresh endpoint the engine's getter yields an empty name without -9") {
    Buffer buffer;
    CHECK(VXAPOCOMAPI_GetEngine(handle(), buffer.bytes) == 1);
    CHECK(buffer.text().empty());
    CHECK(error() == 0);
}

TEST_CASE_FIXTURE(NoSlot, "what a fresh endpoint has never reported fails with -9 once, but for the I/O configuration") {
    Buffer buffer;
    CHECK(VXAPOCOMAPI_GetIOConfig(handle(), buffer.bytes) == 1);
    CHECK(buffer.text() == "AnyOutput");
    for (const Setting &setting : {kProfile, kContent}) {
        VXAPOCOMAPI_SetLastError(handle(), 0);
        Buffer none;
        const auto lines = linesOf([&] { CHECK(setting.get(handle(), none.bytes) == 0); });
        CHECK(none.untouched());
        CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
        CHECK(contains(lines, "APO type is not set"));
        CHECK(contains(lines, "Error: -9"));
        // The second time there is nothing new; the old error still speaks.
        Buffer again;
        CHECK(setting.get(handle(), again.bytes) == 0);
        CHECK(again.text() == toUtf8((context().*setting.property).get()));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a getter logs what is new, once, and the engine's line speaks of the I/O configuration") {
    const struct {
        const Setting &setting;
        const char *name, *line;
    } expected[] = {{kEngine, "VXAPOCOMAPI_GetEngine", "I/O Config = VXORLO"},
                    {kIOConfig, "VXAPOCOMAPI_GetIOConfig", "I/O Config = AnyOutput"},
                    {kProfile, "VXAPOCOMAPI_GetUserProfile", "User profile = GlobalProfile"},
                    {kContent, "VXAPOCOMAPI_GetContentType", "Content Type = AnyContent"}};
    for (const auto &getter : expected) {
        INFO(getter.name);
        VXAPOCOMAPI_SetLastError(handle(), -4);
        CHECK(contains(linesOf([&] { CHECK(getter.setting.get(handle(), nullptr) == 1); }), getter.line));
        CHECK(error() == 0);
        CHECK_FALSE(contains(linesOf([&] { CHECK(getter.setting.get(handle(), nullptr) == 1); }), getter.line));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a getter pulls what another client selected, and says that it was forced") {
    Client other(machine);
    CHECK(VXAPOCOMAPI_SetEngine(other.endpoint, "KZNOVA", &kNovara) == 1);
    CHECK(VXAPOCOMAPI_SetIOConfig(other.endpoint, "Their I/O") == 1);
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Their profile") == 1);
    CHECK(VXAPOCOMAPI_SetContentType(other.endpoint, "Their content") == 1);
    const auto lines = linesOf([&] {
        // From the lower end of the chain upwards: a property that moves takes those below it along.
        CHECK(told(kEngine, handle()) == "KZNOVA");
        CHECK(told(kProfile, handle()) == "Their profile");
        CHECK(told(kContent, handle()) == "Their content");
        CHECK(told(kIOConfig, handle()) == "Their I/O");
    });
    CHECK(contains(lines, "Forced IOConfigName = Their I/O"));
    CHECK(contains(lines, "Forced UserProfileName = Their profile"));
    CHECK(contains(lines, "Forced ContentTypeName = Their content"));
    CHECK(contains(lines, "Forced EngineName = KZNOVA"));
}

TEST_CASE_FIXTURE(OpenSlot, "a content type also becomes a property of the endpoint, for the slots that have one") {
    constexpr GUID kContentProperties = {0xA1784D91, 0x5E58, 0x49C4, {0xA5, 0xFC, 0xA3, 0x3D, 0xC8, 0xB6, 0x6A, 0x18}};
    const struct {
        const char *slot;
        DWORD id;
    } slots[] = {{"EFX", 3}, {"MFX", 2}, {"SFX", 1}};
    for (const auto &slot : slots) {
        INFO(slot.slot);
        CHECK(VXAPOCOMAPI_SetAPOType(handle(), slot.slot) == 1);
        const std::string content = std::string("Film of ") + slot.slot;
        const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetContentType(handle(), content.c_str()) == 1); });
        CHECK(contains(lines, "Syncing device property with received ContentType ..."));
        OwnedPropVariant value;
        const PROPERTYKEY key = {kContentProperties, slot.id};
        REQUIRE(context().DevicePropertyStore.get()->GetValue(key, value.put()) == S_OK);
        REQUIRE(value->vt == VT_LPWSTR);
        CHECK(toUtf8(value->pwszVal) == content);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "for GFX and LFX the property is refused, which is logged and changes nothing else") {
    for (const char *slot : {"GFX", "LFX"}) {
        CHECK(VXAPOCOMAPI_SetAPOType(handle(), slot) == 1);
        const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetContentType(handle(), "Film") == 1); });
        CHECK(contains(lines, "Failed to set property {{00000000-0000-0000-0000-000000000000}, 0} of endpoint " +
                                  toUtf8(machine.endpointId()) + " with error code -2147024809"));
        CHECK(SampleMachine::textAt(SampleMachine::configurationKey(slot), store_name::contentType) == "Film");
    }
}

TEST_CASE_FIXTURE(OpenSlot, "an endpoint without a property store takes a content type all the same") {
    context().DevicePropertyStore.setSilently({});
    CHECK(VXAPOCOMAPI_SetContentType(handle(), "Film") == 1);
    CHECK(SampleMachine::textAt(SampleMachine::configurationKey(), store_name::contentType) == "Film");
}

TEST_CASE_FIXTURE(OpenSlot, "a refused registry write leaves -256, the Windows error and the moved property") {
    // The registry takes no key names of this length.
    const WideString path(300, VXWCHAR{'k'});
    context().APOTypeRegKeyName.setSilently(path);
    for (const Setting &setting : kAll) {
        INFO(setting.line);
        const auto lines = linesOf([&] { CHECK(setting.set(handle(), "Moved") == 0); });
        CHECK(error() == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
        const uint32_t windows = VXAPOCOMAPI_GetWindowsLastError(handle());
        CHECK(windows != 0);
        CHECK(windows == VXAPOCOMAPI_GetWindowsLastError(nullptr));
        CHECK((context().*setting.property).get() == VX_TEXT("Moved"));
        CHECK(std::any_of(lines.begin(), lines.end(), [](const std::string &line) {
            return line.rfind("Failed to write '", 0) == 0 && line.find("' value to the registry at '") != std::string::npos &&
                   line.find("' with error = 0x") != std::string::npos;
        }));
    }
    CHECK(context().ApiContext->SetterValues.empty());
}

TEST_CASE_FIXTURE(OpenSlot, "null names count as empty and a null record as none") {
    for (const Setting &setting : {kIOConfig, kProfile, kContent}) CHECK(setting.set(handle(), nullptr) == 1);
    CHECK(VXAPOCOMAPI_SetEngine(handle(), nullptr, nullptr) == 1);
    CHECK(context().EngineShortName.get().empty());
}

TEST_CASE_FIXTURE(OpenSlot, "bad handles select nothing and leave the errors as they were") {
    VXAPOCOMAPI_SetLastError(handle(), -16);
    int something = 0;
    for (VXAPOHandle bad : {static_cast<VXAPOHandle>(nullptr), static_cast<VXAPOHandle>(&something), client->api}) {
        for (const Setting &setting : kAll) {
            CHECK(setting.set(bad, "x") == 0);
            CHECK(setting.get(bad, nullptr) == 0);
        }
    }
    CHECK(error() == -16);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -16);
}

TEST_CASE_FIXTURE(OpenSlot, "a writer goes on without the slot's mutex when it can't have it") {
    NamedMutex taken;
    REQUIRE(NamedMutex::open(VX_TEXT("Global\\") + context().Mutex.name(), taken) == status::ok);
    REQUIRE(taken.acquire(kForever) == MutexWait::acquired);
    std::vector<std::string> lines;
    std::thread writer([&] { lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetUserProfile(handle(), "GlobalProfile") == 1); }); });
    writer.join();
    taken.release();
    CHECK(contains(lines, "Failed to acquire mutex!!!"));
    CHECK(SampleMachine::textAt(SampleMachine::configurationKey(), store_name::userProfile) == "GlobalProfile");
}
