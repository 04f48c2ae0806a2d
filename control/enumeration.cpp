// SPDX-License-Identifier: MIT
//
// Listing endpoints: those that the product's USB audio package serves, and the one of a product endpoint index.
#include "control/enumeration.h"

#include <algorithm>
#include <cstdlib>

#include "VXAPOCOMAPI.h"
#include "VXDSPAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "platform/variant.h"

namespace vxcomn {

namespace {

// PKEY_AudioEndpoint_InfoLine: a text that the endpoint's driver package publishes.
constexpr PROPERTYKEY kInfoLineKey = {{0x83DA6326, 0x97A6, 0x4088, {0x94, 0x53, 0xA1, 0x92, 0x3F, 0x57, 0x3B, 0x29}}, 3};

constexpr uint32_t kFirstCapacity = 4;

// Frees a text that the system handed out.
struct TaskTextTraits {
    using Raw = LPWSTR;
    static constexpr Raw none = nullptr;
    static void close(Raw text) noexcept { CoTaskMemFree(text); }
};
using TaskText = Unique<TaskTextTraits>;

// The growing list, in the form in which it crosses the interface.
class IdList {
  public:
    IdList() { grow(kFirstCapacity); }
    ~IdList() { freeIds(count_, ids_); }
    IdList(const IdList &) = delete;
    IdList &operator=(const IdList &) = delete;

    static void freeIds(uint32_t count, VXWCHAR **ids) noexcept {
        for (uint32_t i = 0; ids != nullptr && i < count; ++i) CoTaskMemFree(ids[i]);
        std::free(ids);
    }

    HRESULT add(IMMDevice &device) {
        if (count_ == capacity_) grow(2 * capacity_ - capacity_ / 2);
        const HRESULT result = device.GetId(&ids_[count_]);
        if (SUCCEEDED(result)) ++count_;
        return result;
    }

    void release(uint32_t &count, VXWCHAR **&ids) noexcept {
        count = std::exchange(count_, 0);
        ids = std::exchange(ids_, nullptr);
    }

  private:
    void grow(uint32_t capacity) {
        void *const larger = std::realloc(ids_, capacity * sizeof *ids_);
        if (larger == nullptr) throw std::bad_alloc();
        ids_ = static_cast<VXWCHAR **>(larger);
        capacity_ = capacity;
    }

    VXWCHAR **ids_ = nullptr;
    uint32_t count_ = 0, capacity_ = 0;
};

VXWCHAR lowerCase(VXWCHAR unit) noexcept {
    return unit >= 'A' && unit <= 'Z' ? static_cast<VXWCHAR>(unit + ('a' - 'A')) : unit;
}

// In lower case, letter by letter; empty if there is none. Logs what is wrong with it.
HRESULT readInfoLine(const CTraceFuncCallTarget &trace, IPropertyStore &properties, UINT index, WideString &line) {
    OwnedPropVariant value;
    const HRESULT result = properties.GetValue(kInfoLineKey, value.put());
    if (FAILED(result)) {
        trace.log(VX_TEXT("Failed to retrieve PKEY_AudioEndpoint_InfoLine for endpoint #%i with error code %i.\n"), index, result);
        return result;
    }
    if (value->vt != VT_LPWSTR || value->pwszVal == nullptr) {
        trace.log(VX_TEXT("Invalid format of PKEY_AudioEndpoint_InfoLine data. Must be single-line string.\n"));
        return result;
    }
    line = value->pwszVal;
    std::transform(line.begin(), line.end(), line.begin(), lowerCase);
    return result;
}

// Kept: one package decides. The other one's name is looked for and logged, and nothing comes of it.
bool isServed(const CTraceFuncCallTarget &trace, const WideString &line) {
    const bool isKVUSBAudio = line.find(VX_TEXT("kvusbaudio.sysfx")) != WideString::npos;
    const bool isKVUSB2Audio = line.find(VX_TEXT("kvusb2audio.sysfx")) != WideString::npos;
    trace.log(VX_TEXT("PKEY_AudioEndpoint_InfoLine = %s (isKVUSBAudio = %s, isKVUSB2Audio = %s).\n"), line,
              isKVUSBAudio ? "true" : "false", isKVUSB2Audio ? "true" : "false");
    return isKVUSBAudio;
}

HRESULT addIfServed(const CTraceFuncCallTarget &trace, IMMDeviceCollection &devices, UINT index, IdList &list) {
    ComPtr<IMMDevice> device;
    ComPtr<IPropertyStore> properties;
    HRESULT result = devices.Item(index, device.put());
    if (FAILED(result)) return result;
    result = device->OpenPropertyStore(STGM_READ, properties.put());
    if (FAILED(result)) return result;
    WideString line;
    result = readInfoLine(trace, *properties.get(), index, line);
    return isServed(trace, line) ? list.add(*device.get()) : result;
}

// Kept: the last endpoint decides how the whole ends; earlier ones that can't be read are left out.
HRESULT listEndpoints(VXAPOCOMAPI_APIContext &api, EDataFlow flow, uint32_t stateMask, IdList &list) {
    ComPtr<IMMDeviceCollection> devices;
    HRESULT result = api.DeviceEnumerator->EnumAudioEndpoints(flow, stateMask, devices.put());
    if (FAILED(result)) return result;
    UINT count = 0;
    result = devices->GetCount(&count);
    if (FAILED(result)) return result;
    for (UINT index = 0; index < count; ++index) result = addIfServed(api, *devices.get(), index, list);
    return result;
}

int32_t getEndpointIds(VXAPOCOMAPI_APIContext &api, uint32_t &count, VXWCHAR **&ids, int32_t captureFlag, uint32_t stateMask,
                       uint64_t *tag) {
    const uint64_t present = api.deviceChangeTag();
    if (tag != nullptr && *tag == present) {
        ids = nullptr;
        count = 0;
        return 1;
    }
    const TraceScope scope(api.TraceTarget, VX_TEXT("VXAPOCOMAPI_GetEndpointIDs"),
                           CallArguments().address(VX_TEXT("apiHandle = 0x"), &api));
    if (tag != nullptr)
        api.log(VX_TEXT("Received tag %i doesn't match the current one %i. Return new endpoint IDs list.\n"), *tag, present);
    if (!api.DeviceEnumerator) {
        api.log(VX_TEXT("DeviceEnumerator == NULL.\n"));
        return failWith(api, api, VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
    }
    IdList list;
    const HRESULT result = listEndpoints(api, captureFlag == 0 ? eRender : eCapture, stateMask, list);
    if (FAILED(result)) {
        ids = nullptr;
        count = 0;
        return 0;
    }
    list.release(count, ids);
    // The tag from before the listing: a change that came during it gives the client one list more, and never one too few.
    if (tag != nullptr) *tag = present;
    storeLastError(api, VXAPOCOMAPI_ERROR_NONE);
    return 1;
}

}  // namespace

HRESULT EndpointIndexToEndpointID(VXAPOCOMAPI_APIContext &api, int32_t index, WideString &id) {
    const TraceScope scope(api.TraceTarget, VX_TEXT("EndpointIndexToEndpointID"),
                           CallArguments().number(VX_TEXT("EndpointIndex = "), index));
    if (!api.DeviceEnumerator) {
        api.log(VX_TEXT("DeviceEnumerator = NULL.\n"));
        return E_FAIL;
    }
    ComPtr<IMMDeviceCollection> devices;
    UINT count = 0;
    HRESULT result = api.DeviceEnumerator->EnumAudioEndpoints(eRender, DEVICE_STATE_ACTIVE | DEVICE_STATE_UNPLUGGED, devices.put());
    if (SUCCEEDED(result)) result = devices->GetCount(&count);
    if (FAILED(result)) count = 0;
    for (UINT at = 0; at < count; ++at) {
        ComPtr<IMMDevice> device;
        ComPtr<IPropertyStore> properties;
        if (result = devices->Item(at, device.put()); FAILED(result)) continue;
        if (result = device->OpenPropertyStore(STGM_READ, properties.put()); FAILED(result)) continue;
        uint32_t found = UINT32_MAX;
        VXDSPAPI_DevicePropsToEndpointIndex(&api, properties.get(), &found);
        if (static_cast<int32_t>(found) != index) continue;
        TaskText text;
        if (result = device->GetId(text.put()); FAILED(result)) {
            api.log(VX_TEXT("IMMDevice::GetId() failed with error = 0x%X.\n"), static_cast<uint32_t>(result));
            continue;
        }
        api.log(VX_TEXT("Found matching endpoint ID = %s.\n"), text.get());
        id = text.get();
        break;
    }
    // Kept: said on success, too.
    api.log(VX_TEXT("Failed to find matching endpoint ID.\n"));
    return result;
}

}  // namespace vxcomn

using namespace vxcomn;

int32_t VXAPOCOMAPI_GetEndpointIDs(VXAPOHandle apiHandle, uint32_t *count, VXWCHAR ***ids, int32_t captureFlag, uint32_t stateMask,
                                   uint64_t *tag) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_APIContext *const api = findApi(apiHandle);
        if (api == nullptr || count == nullptr || ids == nullptr) return 0;
        return getEndpointIds(*api, *count, *ids, captureFlag, stateMask, tag);
    });
}

int32_t VXAPOCOMAPI_FreeEndpointIDs(VXAPOHandle apiHandle, uint32_t count, VXWCHAR **ids) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_APIContext *const api = findApi(apiHandle);
        if (api == nullptr) return 0;
        const TraceScope scope(api->TraceTarget, VX_TEXT("VXAPOCOMAPI_FreeEndpointIDs"),
                               CallArguments().address(VX_TEXT("apiHandle = 0x"), apiHandle));
        IdList::freeIds(count, ids);
        storeLastError(*api, VXAPOCOMAPI_ERROR_NONE);
        return 1;
    });
}
