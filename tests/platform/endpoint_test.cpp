// SPDX-License-Identifier: MIT
//
// The contract that the system's endpoints and the registry's share. On Windows it needs an endpoint of the machine's (under Wine
// one of a PulseAudio with a null sink); where there is none, what needs one is skipped, and says so.
#include "platform/endpoints.h"

#include <doctest/doctest.h>

#include <cstring>

#include "platform/event.h"
#include "platform/guid.h"
#include "platform/variant.h"
#include "tests/platform/notification_recorder.h"
#include "tests/platform/some_endpoint.h"

using namespace vxcomn;

namespace {

constexpr PROPERTYKEY kOwnProperty = {{0x6A6414E7, 0x39E4, 0x491F, {0x8B, 0x8C, 0xC9, 0x02, 0x8A, 0xC7, 0xD6, 0x59}}, 77};

struct Endpoints {
    test::SomeEndpoint made;  // on Linux
    ComPtr<IMMDeviceEnumerator> enumerator;
    ComPtr<IMMDevice> device;  // an active one for rendering; none if the machine has none
    WideString id;

    Endpoints() {
        initializeCom();
        REQUIRE(createDeviceEnumerator(enumerator) == S_OK);
        ComPtr<IMMDeviceCollection> devices;
        UINT count = 0;
        REQUIRE(enumerator->EnumAudioEndpoints(eRender, DEVICE_STATE_ACTIVE, devices.put()) == S_OK);
        REQUIRE(devices->GetCount(&count) == S_OK);
        CHECK(FAILED(devices->Item(count, device.put())));
        if (count == 0) {
            MESSAGE("skipped: this machine has no active endpoint for rendering");
            return;
        }
        REQUIRE(devices->Item(0, device.put()) == S_OK);
        LPWSTR text = nullptr;
        REQUIRE(device->GetId(&text) == S_OK);
        id = text;
        CoTaskMemFree(text);
    }
    bool none() const { return !device; }

    HRESULT activate(ComPtr<IAudioClient> &client) {
        return device->Activate(kIidAudioClient, CLSCTX_ALL, nullptr, reinterpret_cast<void **>(client.put()));
    }
};

struct MixFormat {
    WAVEFORMATEX *format = nullptr;
    explicit MixFormat(IAudioClient *client) { REQUIRE(client->GetMixFormat(&format) == S_OK); }
    ~MixFormat() { CoTaskMemFree(format); }
};

}  // namespace

TEST_CASE_FIXTURE(Endpoints, "interfaces answer for themselves and for IUnknown") {
    void *object = nullptr;
    CHECK(enumerator->QueryInterface(kIidUnknown, &object) == S_OK);
    enumerator->Release();
    CHECK(enumerator->QueryInterface(kIidDeviceEnumerator, &object) == S_OK);
    enumerator->Release();
    CHECK(enumerator->QueryInterface(kIidAudioClient, &object) == E_NOINTERFACE);
    CHECK(object == nullptr);
}

TEST_CASE_FIXTURE(Endpoints, "an id that is none, or nobody's, opens no device") {
    ComPtr<IMMDevice> none;
    CHECK(FAILED(enumerator->GetDevice(VX_TEXT(""), none.put())));
    CHECK(FAILED(enumerator->GetDevice(VX_TEXT("nonsense"), none.put())));
    CHECK(FAILED(enumerator->GetDevice(VX_TEXT("{0.0.0.00000000}.{00000000-1111-2222-3333-444444444444}"), none.put())));
    CHECK_FALSE(none);
}

TEST_CASE_FIXTURE(Endpoints, "a device is found by the id that it gives, in its state") {
    if (none()) return;
    CHECK(id.starts_with(VX_TEXT("{0.0.0.00000000}.{")));
    ComPtr<IMMDevice> same;
    REQUIRE(enumerator->GetDevice(id.c_str(), same.put()) == S_OK);
    DWORD state = 0;
    CHECK(same->GetState(&state) == S_OK);
    CHECK(state == DEVICE_STATE_ACTIVE);
    LPWSTR text = nullptr;
    CHECK(same->GetId(&text) == S_OK);
    CHECK(toUtf8(text) == toUtf8(id));
    CoTaskMemFree(text);
}

TEST_CASE_FIXTURE(Endpoints, "the endpoint's GUID is the id's second half") {
    if (none()) return;
    ComPtr<IPropertyStore> store;
    OwnedPropVariant value;
    REQUIRE(device->OpenPropertyStore(STGM_READ, store.put()) == S_OK);
    REQUIRE(store->GetValue(kEndpointGuidKey, value.put()) == S_OK);
    REQUIRE(value->vt == VT_LPWSTR);
    CHECK(equalIgnoringCase(value->pwszVal, WideView(id).substr(id.find('.', 10) + 1)));
}

TEST_CASE_FIXTURE(Endpoints, "a property that is written reads back in its type, also through another store") {
    if (none()) return;
    ComPtr<IPropertyStore> writer, reader;
    REQUIRE(device->OpenPropertyStore(STGM_READWRITE, writer.put()) == S_OK);
    REQUIRE(device->OpenPropertyStore(STGM_READ, reader.put()) == S_OK);
    OwnedPropVariant read;
    PROPVARIANT value;
    PropVariantInit(&value);
    value.vt = VT_UI4;
    value.ulVal = 0xFEDCBA98;
    CHECK(writer->SetValue(kOwnProperty, value) == S_OK);
    CHECK(reader->GetValue(kOwnProperty, read.put()) == S_OK);
    CHECK(read->vt == VT_UI4);
    CHECK(read->ulVal == 0xFEDCBA98);

    WideString text = VX_TEXT("K\u00f6nig");
    value.vt = VT_LPWSTR;
    value.pwszVal = text.data();
    CHECK(writer->SetValue(kOwnProperty, value) == S_OK);
    CHECK(reader->GetValue(kOwnProperty, read.put()) == S_OK);
    REQUIRE(read->vt == VT_LPWSTR);
    CHECK(toUtf8(read->pwszVal) == toUtf8(text));

    BYTE bytes[] = {1, 2, 3, 0, 255};
    value.vt = VT_BLOB;
    value.blob = {sizeof bytes, bytes};
    CHECK(writer->SetValue(kOwnProperty, value) == S_OK);
    CHECK(reader->GetValue(kOwnProperty, read.put()) == S_OK);
    REQUIRE(read->vt == VT_BLOB);
    REQUIRE(read->blob.cbSize == sizeof bytes);
    CHECK(std::memcmp(read->blob.pBlobData, bytes, sizeof bytes) == 0);

    CHECK(FAILED(reader->SetValue(kOwnProperty, value)));
    DWORD count = 0;
    CHECK(reader->GetCount(&count) == S_OK);
    CHECK(count > 0);
}

TEST_CASE_FIXTURE(Endpoints, "a property that is not there is a failure or an empty value") {
    if (none()) return;
    ComPtr<IPropertyStore> store;
    OwnedPropVariant value;
    PROPERTYKEY absent = kOwnProperty;
    absent.pid = 78;
    REQUIRE(device->OpenPropertyStore(STGM_READ, store.put()) == S_OK);
    CHECK((FAILED(store->GetValue(absent, value.put())) || value->vt == VT_EMPTY));
}

TEST_CASE_FIXTURE(Endpoints, "an audio client starts only when it is initialised and has its event") {
    if (none()) return;
    ComPtr<IAudioClient> client;
    Event event(EventReset::automatic);
    REQUIRE(activate(client) == S_OK);
    const MixFormat mix(client.get());
    CHECK(mix.format->nChannels > 0);
    CHECK(client->Start() == AUDCLNT_E_NOT_INITIALIZED);
    CHECK(client->Stop() == AUDCLNT_E_NOT_INITIALIZED);
    CHECK(client->SetEventHandle(event.handle()) == AUDCLNT_E_NOT_INITIALIZED);
    CHECK(client->Initialize(AUDCLNT_SHAREMODE_SHARED, AUDCLNT_STREAMFLAGS_EVENTCALLBACK, 10000000, 0, nullptr, nullptr) ==
          E_POINTER);
    REQUIRE(client->Initialize(AUDCLNT_SHAREMODE_SHARED, AUDCLNT_STREAMFLAGS_EVENTCALLBACK, 10000000, 0, mix.format, nullptr) ==
            S_OK);
    CHECK(client->Initialize(AUDCLNT_SHAREMODE_SHARED, AUDCLNT_STREAMFLAGS_EVENTCALLBACK, 10000000, 0, mix.format, nullptr) ==
          AUDCLNT_E_ALREADY_INITIALIZED);
    CHECK(client->Start() == AUDCLNT_E_EVENTHANDLE_NOT_SET);
    CHECK(client->SetEventHandle(nullptr) == E_INVALIDARG);
    CHECK(client->SetEventHandle(event.handle()) == S_OK);
    CHECK(client->Start() == S_OK);
    CHECK(client->Start() == AUDCLNT_E_NOT_STOPPED);
    CHECK(client->Reset() == AUDCLNT_E_NOT_STOPPED);
    CHECK(client->Stop() == S_OK);
    CHECK(client->Stop() == S_FALSE);
    CHECK(client->Reset() == S_OK);
    UINT32 frames = 0;
    CHECK(client->GetBufferSize(&frames) == S_OK);
    CHECK(frames > 0);
}

TEST_CASE_FIXTURE(Endpoints, "an audio client without the event flag takes no event") {
    if (none()) return;
    ComPtr<IAudioClient> client;
    Event event(EventReset::automatic);
    REQUIRE(activate(client) == S_OK);
    const MixFormat mix(client.get());
    REQUIRE(client->Initialize(AUDCLNT_SHAREMODE_SHARED, 0, 10000000, 0, mix.format, nullptr) == S_OK);
    CHECK(client->SetEventHandle(event.handle()) == AUDCLNT_E_EVENTHANDLE_NOT_EXPECTED);
    CHECK(client->Start() == S_OK);
    CHECK(client->Stop() == S_OK);
}

TEST_CASE_FIXTURE(Endpoints, "a notification client is taken and given back once") {
    test::NotificationRecorder recorder;
    CHECK(enumerator->RegisterEndpointNotificationCallback(nullptr) == E_POINTER);
    CHECK(enumerator->RegisterEndpointNotificationCallback(&recorder) == S_OK);
    CHECK(enumerator->UnregisterEndpointNotificationCallback(&recorder) == S_OK);
    CHECK(enumerator->UnregisterEndpointNotificationCallback(&recorder) == kNotFound);
    CHECK(recorder.references == 1);
}
