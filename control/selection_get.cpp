// SPDX-License-Identifier: MIT
//
// The four getters of what a slot runs. Each takes over what the store says first. One that has nothing new to report neither logs
// nor looks at the slot, and its result is that of whatever call came before: a fresh endpoint answers with empty names.
#include <cstring>
#include <mutex>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "control/slot_call.h"

namespace vxcomn {
namespace {

using Endpoint = VXAPOCOMAPI_EndpointContext;

struct SelectionReport {
    const VXWCHAR *traceName;
    void (*pull)(Endpoint &endpoint);
    CAPOPresetFile::Text CAPOPresetFile::*property;
    WideString Endpoint::*reported;
    size_t limit;  // bytes of the caller's buffer
    const VXWCHAR *logFormat;
    bool needsSlot;
};

// Kept: the engine's line speaks of the I/O configuration.
constexpr SelectionReport kEngine = {VX_TEXT("VXAPOCOMAPI_GetEngine"),
                                     [](Endpoint &endpoint) { endpoint.UpdateEngine(); },
                                     &CAPOPresetFile::EngineShortName,
                                     &Endpoint::LastEngineName,
                                     1024,
                                     VX_TEXT("I/O Config = %s\n"),
                                     true};
constexpr SelectionReport kIOConfig = {VX_TEXT("VXAPOCOMAPI_GetIOConfig"),
                                       [](Endpoint &endpoint) { endpoint.UpdateIOConfig(false); },
                                       &CAPOPresetFile::IOConfigName,
                                       &Endpoint::LastIOConfig,
                                       1024,
                                       VX_TEXT("I/O Config = %s\n"),
                                       false};
constexpr SelectionReport kUserProfile = {VX_TEXT("VXAPOCOMAPI_GetUserProfile"),
                                          [](Endpoint &endpoint) { endpoint.UpdateUserProfile(); },
                                          &CAPOPresetFile::UserProfileName,
                                          &Endpoint::LastUserProfile,
                                          512,
                                          VX_TEXT("User profile = %s\n"),
                                          true};
constexpr SelectionReport kContentType = {VX_TEXT("VXAPOCOMAPI_GetContentType"),
                                          [](Endpoint &endpoint) { endpoint.UpdateContentType(); },
                                          &CAPOPresetFile::ContentTypeName,
                                          &Endpoint::LastContentType,
                                          512,
                                          VX_TEXT("Content Type = %s\n"),
                                          true};

// Whether the text is another than was reported last; it counts as reported then.
bool isNews(Endpoint &endpoint, WideString &reported, const WideString &text) {
    const std::lock_guard lock(endpoint.ReportLock);
    if (reported == text) return false;
    reported = text;
    return true;
}

// A text that doesn't fit with its end isn't delivered.
void deliver(const WideString &text, char *buffer, size_t limit) {
    const std::string narrow = toUtf8(text);
    if (narrow.size() < limit) std::memcpy(buffer, narrow.c_str(), narrow.size() + 1);
}

int32_t report(void *handle, char *buffer, const SelectionReport &selection) {
    Endpoint *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    VXAPOCOMAPI_APIContext &api = *endpoint->ApiContext;
    selection.pull(*endpoint);
    const WideString text = (endpoint->*selection.property).get();
    if (isNews(*endpoint, endpoint->*selection.reported, text)) {
        const TraceScope scope(endpoint->TraceTarget, selection.traceName, handleArgument(handle));
        if (selection.needsSlot && !hasSlot(*endpoint)) {
            endpoint->log(VX_TEXT("APO type is not set\n"));
            return failWith(api, *endpoint, VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
        }
        storeLastError(api, VXAPOCOMAPI_ERROR_NONE);
        endpoint->log(selection.logFormat, text);
    }
    if (buffer != nullptr) deliver(text, buffer, selection.limit);
    return api.LastError == VXAPOCOMAPI_ERROR_NONE ? 1 : 0;
}

}  // namespace
}  // namespace vxcomn

int32_t VXAPOCOMAPI_GetEngine(VXAPOHandle apoComHandle, char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::report(apoComHandle, name, vxcomn::kEngine); });
}

int32_t VXAPOCOMAPI_GetIOConfig(VXAPOHandle apoComHandle, char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::report(apoComHandle, name, vxcomn::kIOConfig); });
}

int32_t VXAPOCOMAPI_GetUserProfile(VXAPOHandle apoComHandle, char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::report(apoComHandle, name, vxcomn::kUserProfile); });
}

int32_t VXAPOCOMAPI_GetContentType(VXAPOHandle apoComHandle, char *name) {
    return vxcomn::guarded(0, [&] { return vxcomn::report(apoComHandle, name, vxcomn::kContentType); });
}
