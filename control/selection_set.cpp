// SPDX-License-Identifier: MIT
//
// The four setters of what a slot runs. Each moves the endpoint's own property, which recomputes what depends on it, and writes the
// choice under the slot's key, where every other process that serves the slot finds it. What a client wrote as setter goes with it.
// Locks: the state lock, then the slot's mutex.
#include <algorithm>
#include <mutex>

#include "VXAPOCOMAPI.h"
#include "control/content_property.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "control/slot_call.h"
#include "preset/parameter_store.h"

namespace vxcomn {
namespace {

using Endpoint = VXAPOCOMAPI_EndpointContext;

struct TextSelection {
    const VXWCHAR *traceName;
    CAPOPresetFile::Text CAPOPresetFile::*property;
    const VXWCHAR *valueName;
    const VXWCHAR *setterName;  // null for what outlives its writer
    const VXWCHAR *logFormat;
    // What is left to do behind the write, whatever it came to.
    void (*afterwards)(Endpoint &endpoint, const WideString &text);
};

constexpr TextSelection kIOConfig = {VX_TEXT("VXAPOCOMAPI_SetIOConfig"), &CAPOPresetFile::IOConfigName, store_name::ioConfig,
                                     store_name::ioConfigSetter,         VX_TEXT("I/O Config = %s\n"),  nullptr};
constexpr TextSelection kUserProfile = {VX_TEXT("VXAPOCOMAPI_SetUserProfile"),
                                        &CAPOPresetFile::UserProfileName,
                                        store_name::userProfile,
                                        nullptr,
                                        VX_TEXT("User profile = %s\n"),
                                        nullptr};
constexpr TextSelection kContentType = {VX_TEXT("VXAPOCOMAPI_SetContentType"),
                                        &CAPOPresetFile::ContentTypeName,
                                        store_name::contentType,
                                        nullptr,
                                        VX_TEXT("Content Type = %s\n"),
                                        syncContentProperty};

// A failed write stays with the client as its last error.
bool wasWritten(Endpoint &endpoint, const VXWCHAR *valueName, Status status) {
    if (status == status::ok) return true;
    endpoint.log(VX_TEXT("Failed to write '%s' value to the registry at '%s' with error = 0x%X\n"), valueName,
                 endpoint.APOTypeRegKeyName.get(), status);
    failWithWindowsError(*endpoint.ApiContext, status);
    return false;
}

bool writeText(Endpoint &endpoint, const VXWCHAR *valueName, const WideString &text) {
    return wasWritten(endpoint, valueName, SetRegString(endpoint.APOTypeRegKeyName.get(), valueName, &text));
}

// Writes what goes with the client, and notes that it does.
bool writeOwnText(Endpoint &endpoint, const VXWCHAR *valueName, const WideString &text) {
    if (!writeText(endpoint, valueName, text)) return false;
    endpoint.ApiContext->noteSetterValue(endpoint.APOTypeRegKeyName.get(), valueName);
    return true;
}

int32_t setText(void *handle, const char *narrow, const TextSelection &selection) {
    return callSlot(handle, selection.traceName, [&](Endpoint &endpoint) {
        const WideString text = textArgument(narrow);
        (endpoint.*selection.property).set(text);
        endpoint.log(selection.logFormat, text);
        if (selection.setterName != nullptr &&
            !writeOwnText(endpoint, selection.setterName, endpoint.ApiContext->SetterMutexName)) {
            return;
        }
        writeText(endpoint, selection.valueName, text);
        if (selection.afterwards != nullptr) selection.afterwards(endpoint, text);
    });
}

int32_t setEngine(void *handle, const char *narrow, const EngineConfig *given) {
    return callSlot(handle, VX_TEXT("VXAPOCOMAPI_SetEngine"), [&](Endpoint &endpoint) {
        const WideString name = textArgument(narrow);
        const EngineConfig config = given != nullptr ? *given : EngineConfig{};
        // Blank first, so that an engine that is set again runs its subscribers, too.
        endpoint.EngineShortName.set({});
        endpoint.EngineConfig.set({});
        endpoint.EngineShortName.set(name);
        endpoint.EngineConfig.set(config);
        endpoint.log(VX_TEXT("Engine Name = %s\n"), name);
        if (!writeOwnText(endpoint, store_name::engineSetter, endpoint.ApiContext->SetterMutexName)) return;
        if (!writeOwnText(endpoint, store_name::engineName, name)) return;
        const WideString key = endpoint.APOTypeRegKeyName.get();
        const size_t size = std::min<size_t>(config.Size, sizeof config);
        const auto *bytes = reinterpret_cast<const uint8_t *>(&config);
        if (!wasWritten(endpoint, store_name::engineConfig, SetRegBinary(key, store_name::engineConfig, bytes, size))) return;
        endpoint.ApiContext->noteSetterValue(key, store_name::engineConfig);
    });
}

}  // namespace
}  // namespace vxcomn

int32_t VXAPOCOMAPI_SetEngine(VXAPOHandle apoComHandle, const char *name, const EngineConfig *config) {
    return vxcomn::guarded(0, [&] { return vxcomn::setEngine(apoComHandle, name, config); });
}

int32_t VXAPOCOMAPI_SetIOConfig(VXAPOHandle apoComHandle, const char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::setText(apoComHandle, name, vxcomn::kIOConfig); });
}

int32_t VXAPOCOMAPI_SetUserProfile(VXAPOHandle apoComHandle, const char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::setText(apoComHandle, name, vxcomn::kUserProfile); });
}

int32_t VXAPOCOMAPI_SetContentType(VXAPOHandle apoComHandle, const char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::setText(apoComHandle, name, vxcomn::kContentType); });
}
