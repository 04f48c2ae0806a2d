// SPDX-License-Identifier: MIT
#include "control/api_context.h"

#include <algorithm>

#include "control/notification_client.h"
#include "platform/endpoints.h"
#include "platform/guid.h"
#include "platform/registry.h"
#include "preset/module_version.h"

using namespace vxcomn;

void vxcomn::beginControlTrace(DBG_TRACE &trace) {
    trace.Enabled = readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("VXCOMAPI")) ? 1 : 0;
    setTraceTag(trace, VX_TEXT("VXCOMAPIU"));
}

VXAPOCOMAPI_APIContext::VXAPOCOMAPI_APIContext() : Listener_(std::make_shared<NotificationListener>()) {
    TypeID = static_cast<int32_t>(HandleType::api);
    initializeCom();
    beginControlTrace(*this);
    const TraceScope scope(TraceTarget, VX_TEXT("VXAPOCOMAPI_APIContext::VXAPOCOMAPI_APIContext"));
    proveLife();
    Listener_->trace = this;
    NotificationClient.reset(new CMMNotificationClient(Listener_));
}

VXAPOCOMAPI_APIContext::~VXAPOCOMAPI_APIContext() {
    log(VX_TEXT("~VXAPOCOMAPI_APIContext\n"));
    takeBackSetterValues();
    Free();
    NotificationClient.reset();
    const std::lock_guard guard(Listener_->lock);
    Listener_->trace = nullptr;
}

// Without the mutex what this client sets counts as stale from the start, and nothing else is wrong.
void VXAPOCOMAPI_APIContext::proveLife() {
    if (!newGuid(ClientGuid)) return;
    SetterMutexName = VX_TEXT("Global\\") + guidText(ClientGuid);
    NamedMutex::create(SetterMutexName, SetterMutex, MutexOwner::caller);
}

bool VXAPOCOMAPI_APIContext::Initialize() {
    const TraceScope scope(TraceTarget, VX_TEXT("VXAPOCOMAPI_APIContext::Initialize"));
    if (Initialized) {
        log(VX_TEXT("Already initialized.\n"));
        return true;
    }
    log(VX_TEXT("Retrieving module version ...\n"));
    ModuleVersion = GetAPOModuleVersion(*this, systemFacts(), nullptr);
    for (int part = 0; part < 4; ++part) ModuleVersionBytes[part] = static_cast<uint8_t>(versionPart(ModuleVersion, part));
    log(VX_TEXT("APO module version = { %i, %i, %i, %i }.\n"), ModuleVersionBytes[0], ModuleVersionBytes[1], ModuleVersionBytes[2],
        ModuleVersionBytes[3]);
    log(VX_TEXT("Done.\n"));

    log(VX_TEXT("Registering endpoint notification callback ...\n"));
    HRESULT result = createDeviceEnumerator(DeviceEnumerator);
    if (SUCCEEDED(result)) {
        log(VX_TEXT("Received device enumerator. Installing notification client ...\n"));
        result = DeviceEnumerator->RegisterEndpointNotificationCallback(NotificationClient.get());
    }
    if (FAILED(result)) {
        log(VX_TEXT("Failed to register endpoint notification callback with error code %i.\n"), result);
        DeviceEnumerator.reset();
        return false;
    }
    log(VX_TEXT("Done.\n"));
    Initialized = true;
    return true;
}

void VXAPOCOMAPI_APIContext::Free() {
    const TraceScope scope(TraceTarget, VX_TEXT("VXAPOCOMAPI_APIContext::Free"));
    if (!Initialized) {
        log(VX_TEXT("Already freed.\n"));
        return;
    }
    if (!DeviceEnumerator) return;
    log(VX_TEXT("Unregistering endpoint notification callback ...\n"));
    const HRESULT result = DeviceEnumerator->UnregisterEndpointNotificationCallback(NotificationClient.get());
    DeviceEnumerator.reset();
    if (FAILED(result)) {
        log(VX_TEXT("Failed to unregister endpoint notification callback with error code %i.\n"), result);
        return;
    }
    log(VX_TEXT("Done.\n"));
    Initialized = false;
}

uint64_t VXAPOCOMAPI_APIContext::deviceChangeTag() const noexcept {
    return NotificationClient->deviceChangeTag();
}

void VXAPOCOMAPI_APIContext::noteSetterValue(const WideString &keyPath, const WideString &valueName) {
    const std::lock_guard guard(SetterValuesLock_);
    std::vector<WideString> &names = SetterValues[keyPath];
    if (std::find(names.begin(), names.end(), valueName) == names.end()) names.push_back(valueName);
}

void VXAPOCOMAPI_APIContext::takeBackSetterValues() {
    for (const auto &[path, names] : SetterValues) {
        RegistryKey key;
        if (const Status status = RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::all, key);
            status != status::ok) {
            log(VX_TEXT("Failed to open 'HKLM\\%s' registry key with error code %i.\n"), path, status);
            continue;
        }
        for (const WideString &name : names) {
            if (const Status status = key.deleteValue(name); status != status::ok) {
                log(VX_TEXT("Failed to delete 'HKLM\\%s\\%s' registry value with error code %i.\n"), path, name, status);
            }
        }
    }
}
