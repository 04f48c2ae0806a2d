// SPDX-License-Identifier: MIT
//
// How endpoints lie in the registry, and what writing there does to those who have them open.
#include <doctest/doctest.h>

#include <cstring>

#include "platform/endpoints.h"
#include "platform/variant.h"
#include "tests/platform/notification_recorder.h"
#include "tests/platform/posix/endpoint_keys.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;

namespace {

constexpr const char *kFirst = "{11111111-2222-3333-4444-55555555aaaa}";
constexpr const char *kSecond = "{11111111-2222-3333-4444-55555555BBBB}";

using Texts = std::vector<std::string>;

const std::string kFirstId = std::string("{0.0.0.00000000}.") + kFirst;
const std::string kSecondId = std::string("{0.0.1.00000000}.") + kSecond;

struct Machine : test::EndpointKeys {
    ComPtr<IMMDeviceEnumerator> enumerator;

    Machine() { REQUIRE(createDeviceEnumerator(enumerator) == S_OK); }

    Texts ids(EDataFlow flow, DWORD states) {
        ComPtr<IMMDeviceCollection> devices;
        REQUIRE(enumerator->EnumAudioEndpoints(flow, states, devices.put()) == S_OK);
        UINT count = 0;
        devices->GetCount(&count);
        Texts found;
        for (UINT i = 0; i < count; ++i) {
            ComPtr<IMMDevice> device;
            LPWSTR id = nullptr;
            REQUIRE(devices->Item(i, device.put()) == S_OK);
            REQUIRE(device->GetId(&id) == S_OK);
            found.push_back(toUtf8(id));
            CoTaskMemFree(id);
        }
        return found;
    }
    ComPtr<IMMDevice> device(const std::string &id) {
        ComPtr<IMMDevice> found;
        enumerator->GetDevice(toWide(id).c_str(), found.put());
        return found;
    }
    static DWORD stateOf(const ComPtr<IMMDevice> &device) {
        DWORD state = 0;
        device->GetState(&state);
        return state;
    }
};

// Sets the state of the first endpoint, from another process.
const test::Helper setState("set-device-state", [](const std::vector<std::string> &arguments) {
    RegistryKey key;
    const Endpoint first{eRender, toWide(kFirst)};
    if (RegistryKey::open(RegistryRoot::localMachine, first.path(), RegistryAccess::write, key) != status::ok) return 1;
    return key.setU32(VX_TEXT("DeviceState"), static_cast<uint32_t>(std::stoul(arguments.at(0)))) == status::ok ? 0 : 2;
});

}  // namespace

TEST_CASE_FIXTURE(Machine, "endpoints are listed by flow and state, by ids that spell the GUID as the key does") {
    make("Render", kFirst, DEVICE_STATE_ACTIVE);
    make("Capture", kSecond, DEVICE_STATE_UNPLUGGED);
    CHECK(ids(eRender, DEVICE_STATEMASK_ALL) == Texts{kFirstId});
    CHECK(ids(eCapture, DEVICE_STATEMASK_ALL) == Texts{kSecondId});
    CHECK(ids(eAll, DEVICE_STATEMASK_ALL) == Texts{kFirstId, kSecondId});
    CHECK(ids(eAll, DEVICE_STATE_ACTIVE | DEVICE_STATE_UNPLUGGED).size() == 2);
    CHECK(ids(eAll, DEVICE_STATE_UNPLUGGED) == Texts{kSecondId});
    CHECK(ids(eAll, DEVICE_STATE_DISABLED).empty());
    ComPtr<IMMDeviceCollection> none;
    CHECK(enumerator->EnumAudioEndpoints(eAll, 0x10, none.put()) == E_INVALIDARG);
    CHECK(enumerator->EnumAudioEndpoints(static_cast<EDataFlow>(3), 1, none.put()) == E_INVALIDARG);
    CHECK(stateOf(device("{0.0.0.00000000}.{11111111-2222-3333-4444-55555555AAAA}")) == DEVICE_STATE_ACTIVE);
    CHECK_FALSE(device("{0.0.1.00000000}." + std::string(kFirst)));
}

TEST_CASE_FIXTURE(Machine, "keys that are no endpoints, and states of the wrong type or size, do no harm") {
    make("Render", "not a guid", DEVICE_STATE_ACTIVE);
    make("Render", kFirst).setText(VX_TEXT("DeviceState"), VX_TEXT("1"));
    make("Capture", kSecond).setBytes(VX_TEXT("DeviceState"), std::vector<uint8_t>{1, 0, 0});
    CHECK(ids(eAll, DEVICE_STATE_NOTPRESENT) == Texts{kFirstId, kSecondId});
    CHECK(stateOf(device(kFirstId)) == DEVICE_STATE_NOTPRESENT);
    make("Render", kFirst, 0x10000001);
    CHECK(stateOf(device(kFirstId)) == DEVICE_STATE_ACTIVE);
    make("Render", kFirst, 0);
    CHECK(stateOf(device(kFirstId)) == DEVICE_STATE_NOTPRESENT);
}

TEST_CASE_FIXTURE(Machine,
                  "values of the registry read as properties by their type, and names that are no properties are passed over") {
    RegistryKey key = make("Render", kFirst, DEVICE_STATE_ACTIVE), properties;
    const auto open = [&](DWORD access) {
        ComPtr<IPropertyStore> store;
        REQUIRE(device(kFirstId)->OpenPropertyStore(access, store.put()) == S_OK);
        return store;
    };
    DWORD count = 99;
    CHECK(open(STGM_READ)->GetCount(&count) == S_OK);
    CHECK(count == 0);
    OwnedPropVariant value;
    CHECK(open(STGM_READ)->GetValue(kEndpointGuidKey, value.put()) == S_OK);
    REQUIRE(value->vt == VT_LPWSTR);
    CHECK(toUtf8(value->pwszVal) == kFirst);

    REQUIRE(key.createBelow(VX_TEXT("Properties"), RegistryAccess::readWrite, properties) == status::ok);
    const PROPERTYKEY name = {kDeviceFormatKey.fmtid, 4000000000};
    const WideString spelled = VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c},4000000000");
    properties.setU32(spelled, 7);
    for (const auto *other :
         {VX_TEXT("x"), VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c}"), VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c},"),
          VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c},4294967296"), VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c},-1"),
          VX_TEXT("{f19f064d-082c-4e27-bc73-6882a1bb8e4c},00000000001")}) {
        properties.setU32(other, 1);
    }
    const auto store = open(STGM_READ);
    CHECK(store->GetCount(&count) == S_OK);
    CHECK(count == 1);
    PROPERTYKEY found;
    CHECK(store->GetAt(0, &found) == S_OK);
    CHECK(found.pid == name.pid);
    CHECK(found.fmtid == name.fmtid);
    CHECK(store->GetAt(1, &found) == E_INVALIDARG);
    CHECK(store->GetValue(name, value.put()) == S_OK);
    CHECK(value->ulVal == 7);
    const auto typeOf = [&] {
        CHECK(store->GetValue(name, value.put()) == S_OK);
        return value->vt;
    };
    CHECK(typeOf() == VT_UI4);
    properties.setText(spelled, VX_TEXT("text"));
    CHECK(typeOf() == VT_LPWSTR);
    properties.set(spelled, RegistryType::sz, std::vector<uint8_t>{65, 0, 66});  // no end, and an odd byte
    CHECK(typeOf() == VT_LPWSTR);
    CHECK(toUtf8(value->pwszVal) == "A");
    properties.setBytes(spelled, {});
    CHECK(typeOf() == VT_BLOB);
    CHECK(value->blob.cbSize == 0);
    properties.set(spelled, RegistryType::dword, std::vector<uint8_t>{1, 2, 3});
    CHECK(typeOf() == VT_EMPTY);
    properties.setU64(spelled, 1);
    CHECK(typeOf() == VT_EMPTY);
    properties.close();
    key.deleteTreeBelow({});
    CHECK(FAILED(store->GetValue(name, value.put())));
    ComPtr<IPropertyStore> none;
    CHECK(device(kFirstId)->OpenPropertyStore(3, none.put()) == E_INVALIDARG);
}

TEST_CASE_FIXTURE(Machine, "the mix format is the one that the properties hold, else 48 kHz stereo float") {
    RegistryKey key = make("Render", kFirst, DEVICE_STATE_ACTIVE), properties;
    REQUIRE(key.createBelow(VX_TEXT("Properties"), RegistryAccess::readWrite, properties) == status::ok);
    const auto name = propertyName(kDeviceFormatKey);
    const auto mixOf = [&] {
        ComPtr<IAudioClient> client;
        WAVEFORMATEX *format = nullptr;
        REQUIRE(device(kFirstId)->Activate(kIidAudioClient, CLSCTX_ALL, nullptr, reinterpret_cast<void **>(client.put())) == S_OK);
        REQUIRE(client->GetMixFormat(&format) == S_OK);
        const WAVEFORMATEX copy = *format;
        CoTaskMemFree(format);
        return copy;
    };
    const auto isStandard = [&] {
        const WAVEFORMATEX format = mixOf();
        return format.nSamplesPerSec == 48000 && format.nChannels == 2 && format.wBitsPerSample == 32;
    };
    CHECK(isStandard());
    const WAVEFORMATEX own = {WAVE_FORMAT_PCM, 6, 96000, 96000 * 12, 12, 16, 0};
    std::vector<uint8_t> bytes(sizeof own);
    std::memcpy(bytes.data(), &own, sizeof own);
    properties.setBytes(name, bytes);
    CHECK(mixOf().nChannels == 6);
    CHECK(mixOf().nSamplesPerSec == 96000);
    for (size_t size = 0; size < bytes.size(); ++size) {
        properties.setBytes(name, std::span(bytes).first(size));
        CHECK(isStandard());
    }
    bytes[16] = 1;  // says that a byte follows
    properties.setBytes(name, bytes);
    CHECK(isStandard());
    bytes[16] = 0, bytes[2] = 0;  // no channels
    properties.setBytes(name, bytes);
    CHECK(isStandard());
}

TEST_CASE_FIXTURE(Machine, "an endpoint that is not active gives no audio client, and one that goes stops the client") {
    RegistryKey key = make("Render", kFirst, DEVICE_STATE_DISABLED);
    ComPtr<IAudioClient> client;
    const auto activate = [&] {
        return device(kFirstId)->Activate(kIidAudioClient, CLSCTX_ALL, nullptr, reinterpret_cast<void **>(client.put()));
    };
    CHECK(activate() == AUDCLNT_E_DEVICE_INVALIDATED);
    CHECK_FALSE(client);
    key.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_ACTIVE);
    REQUIRE(activate() == S_OK);
    WAVEFORMATEX *format = nullptr;
    REQUIRE(client->GetMixFormat(&format) == S_OK);
    CHECK(client->Initialize(AUDCLNT_SHAREMODE_EXCLUSIVE, 0, 0, 0, format, nullptr) == AUDCLNT_E_EXCLUSIVE_MODE_NOT_ALLOWED);
    format->nSamplesPerSec = 44100;
    CHECK(client->Initialize(AUDCLNT_SHAREMODE_SHARED, 0, 0, 0, format, nullptr) == AUDCLNT_E_UNSUPPORTED_FORMAT);
    format->nSamplesPerSec = 48000;
    CHECK(client->Initialize(AUDCLNT_SHAREMODE_SHARED, 0, 0, 0, format, nullptr) == S_OK);
    CoTaskMemFree(format);
    key.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_UNPLUGGED);
    CHECK(client->Start() == AUDCLNT_E_DEVICE_INVALIDATED);
}

TEST_CASE_FIXTURE(Machine, "a client is told of new endpoints, of states written by any process, and of endpoints that go") {
    make("Render", kFirst, DEVICE_STATE_ACTIVE);
    test::NotificationRecorder recorder;
    REQUIRE(enumerator->RegisterEndpointNotificationCallback(&recorder) == S_OK);
    Texts expected = {"state 8 " + kFirstId};
    make("Render", kFirst, DEVICE_STATE_UNPLUGGED);
    CHECK(recorder.told(1) == expected);
    CHECK(test::startHelper("set-device-state", {"2"}).wait() == 0);
    expected.push_back("state 2 " + kFirstId);
    CHECK(recorder.told(2) == expected);
    RegistryKey second = make("Capture", kSecond);
    expected.push_back("added " + kSecondId);
    CHECK(recorder.told(3) == expected);
    second.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_ACTIVE);
    expected.push_back("state 1 " + kSecondId);
    CHECK(recorder.told(4) == expected);
    RegistryKey capture;
    second.close();
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, WideString(endpointsPath()) + VX_TEXT("\\Capture"), RegistryAccess::all,
                              capture) == status::ok);
    CHECK(capture.deleteTreeBelow(toWide(kSecond)) == status::ok);
    expected.push_back("removed " + kSecondId);
    CHECK(recorder.told(5) == expected);
    CHECK(enumerator->UnregisterEndpointNotificationCallback(&recorder) == S_OK);
    make("Render", kFirst, DEVICE_STATE_ACTIVE);
    enumerator.reset();
    CHECK(recorder.told(0) == expected);
    CHECK(recorder.references == 1);
}

TEST_CASE_FIXTURE(Machine, "a client that is still registered when the enumerator goes is let go") {
    test::NotificationRecorder recorder;
    REQUIRE(enumerator->RegisterEndpointNotificationCallback(&recorder) == S_OK);
    CHECK(recorder.references == 2);
    enumerator.reset();
    CHECK(recorder.references == 1);
}

TEST_CASE_FIXTURE(Machine, "notification goes on when the whole tree of endpoints is deleted and made anew") {
    make("Render", kFirst, DEVICE_STATE_ACTIVE);
    test::NotificationRecorder recorder;
    REQUIRE(enumerator->RegisterEndpointNotificationCallback(&recorder) == S_OK);
    RegistryKey above;
    const WideView path = endpointsPath();
    const size_t cut = path.rfind('\\');
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, path.substr(0, cut), RegistryAccess::all, above) == status::ok);
    REQUIRE(above.deleteTreeBelow(path.substr(cut + 1)) == status::ok);
    CHECK(recorder.told(1) == Texts{"removed " + kFirstId});
    make("Render", kFirst, DEVICE_STATE_ACTIVE);
    const Texts told = recorder.told(3);
    REQUIRE(told.size() == 3);
    CHECK(told[1] == "added " + kFirstId);
    CHECK(told[2] == "state 1 " + kFirstId);
    CHECK(enumerator->UnregisterEndpointNotificationCallback(&recorder) == S_OK);
}
