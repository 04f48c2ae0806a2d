// SPDX-License-Identifier: MIT
//
// Waiting for what others change: the selections, one at a time, and the parameters, all that are new in one blob. A call looks at
// the store, waits for a change of it below the root if there is no news, and looks once more. It ends with news, at the time-out,
// at a cancel, or when the endpoint is closed. A client's own thread, one at a time for each of the two paths.
#include <atomic>
#include <memory>
#include <vector>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/slot_call.h"
#include "platform/change_signal.h"
#include "platform/security.h"

namespace vxcomn {
namespace {

using Endpoint = VXAPOCOMAPI_EndpointContext;

// One of the two paths.
struct Path {
    Event Endpoint::*idle, Endpoint::*cancel, Endpoint::*shutdown;
    std::atomic<uint8_t> Endpoint::*inside;
};
constexpr Path kConfig = {&Endpoint::ConfigIdle, &Endpoint::ConfigCancel, &Endpoint::ConfigShutdown,
                          &Endpoint::InReceiveConfigChange};
constexpr Path kParam = {&Endpoint::ParamIdle, &Endpoint::ParamCancel, &Endpoint::ParamShutdown, &Endpoint::InReceiveParamChange};

// Runs one receive call. The path is marked as busy before the handle can be withdrawn, so whoever closes the endpoint waits for
// this thread; behind the idle event's setting the endpoint may be gone.
template <Path const &path, class Receive>
int32_t callReceive(void *handle, Receive &&receive) {
    Endpoint *const endpoint = findEndpoint(handle, [](Endpoint &found) { (found.*path.idle).reset(); });
    if (endpoint == nullptr) return 0;
    struct Leaving {
        Event &idle;
        ~Leaving() { idle.set(); }
    } const leaving{endpoint->*path.idle};
    if (endpoint->*path.inside != 0) {
        endpoint->log(VX_TEXT("Triggered re-entry check, exiting...\n"));
        return 0;
    }
    if (waitForOne(endpoint->*path.shutdown, 0) == WaitOutcome::signalled) return 0;
    return receive(*endpoint) ? 1 : 0;
}

Status openRoot(RegistryKey &root) {
    return RegistryKey::create(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::read, root, nullptr, &registrySecurity());
}

// Arms a signal below the root.
bool arm(StoreWatch &watch) {
    return ChangeSignal::open(watch.root, ChangeFilter::values, watch.signal) == status::ok && watch.signal.arm() == status::ok;
}

// Whether the signal ended the wait, and not the client or the time.
bool waitForChange(const StoreWatch &watch, const Endpoint &endpoint, const Path &path, uint32_t milliseconds) noexcept {
    const WaitAnswer answer = waitForAny({&watch.signal, &(endpoint.*path.cancel), &(endpoint.*path.shutdown)}, milliseconds);
    return answer.outcome == WaitOutcome::signalled && answer.index == 0;
}

// What is handed out of a pending selection: the property as it stands.
std::vector<uint8_t> bytesOf(const WideString &text) {
    const auto *first = reinterpret_cast<const uint8_t *>(text.c_str());
    return {first, first + (text.size() + 1) * sizeof(VXWCHAR)};
}
std::vector<uint8_t> bytesOf(const EngineConfig &config) {
    const auto *first = reinterpret_cast<const uint8_t *>(&config);
    return {first, first + sizeof config};
}
template <auto property>
std::vector<uint8_t> bytesOfProperty(const Endpoint &endpoint) {
    return bytesOf((endpoint.*property).get());
}

struct Notice {
    bool PendingConfiguration::*flag;
    const VXWCHAR *name;
    std::vector<uint8_t> (*data)(const Endpoint &endpoint);
};

// In the order in which they are served.
constexpr Notice kNotices[] = {
    {&PendingConfiguration::PendingEngineName, store_name::engineName, bytesOfProperty<&Endpoint::EngineShortName>},
    {&PendingConfiguration::PendingEngineConfig, store_name::engineConfig, bytesOfProperty<&Endpoint::EngineConfig>},
    {&PendingConfiguration::PendingIOConfig, store_name::ioConfig, bytesOfProperty<&Endpoint::IOConfigName>},
    {&PendingConfiguration::PendingUserProfile, store_name::userProfile, bytesOfProperty<&Endpoint::UserProfileName>},
    {&PendingConfiguration::PendingContentType, store_name::contentType, bytesOfProperty<&Endpoint::ContentTypeName>},
};

const Notice *firstPending(const PendingConfiguration &pending) noexcept {
    for (const Notice &notice : kNotices) {
        if (pending.*notice.flag) return &notice;
    }
    return nullptr;
}

void lookForConfiguration(Endpoint &endpoint, uint32_t milliseconds, bool force) {
    RegistryKey root;
    if (const Status status = openRoot(root); status != status::ok) {
        const TraceScope scope(endpoint.TraceTarget, VX_TEXT("VXAPOCOMAPI_EndpointContext::ReceiveNotification"));
        endpoint.log(VX_TEXT("Failed to create/open 'Software\\Ondrevale\\APO' registry key with error code: %i"), status);
        return;
    }
    // Kept: key and signal stay open behind the wait; the next one's take their place.
    StoreWatch &watch = endpoint.ConfigWatch;
    watch.signal = ChangeSignal();
    watch.root = std::move(root);
    endpoint.UpdateFromRegistry(watch.root, false, force);
    if (firstPending(endpoint.Pending) != nullptr || !arm(watch)) return;
    // A change between the look and the arming signalled nobody.
    endpoint.UpdateFromRegistry(watch.root, false, false);
    if (firstPending(endpoint.Pending) != nullptr) return;
    if (waitForChange(watch, endpoint, kConfig, milliseconds)) endpoint.UpdateFromRegistry(watch.root, true, false);
}

bool receiveNotification(Endpoint &endpoint, uint32_t milliseconds, bool force) {
    if (firstPending(endpoint.Pending) == nullptr) lookForConfiguration(endpoint, milliseconds, force);
    const Notice *const notice = firstPending(endpoint.Pending);
    if (notice == nullptr) return false;
    endpoint.Pending.*notice->flag = false;
    endpoint.ConfigChangeCopy = notice->data(endpoint);
    endpoint.ConfigChangeName = notice->name;
    endpoint.ConfigChangeData = endpoint.ConfigChangeCopy.data();
    endpoint.ConfigChangeSize = static_cast<uint32_t>(endpoint.ConfigChangeCopy.size());
    return true;
}

void lookForParameters(Endpoint &endpoint, uint32_t milliseconds, bool force) {
    endpoint.UpdateParametersFromRegistry(false, force);
    if (!endpoint.ParamChanges.empty()) return;
    StoreWatch watch;
    if (openRoot(watch.root) != status::ok || !arm(watch)) return;
    endpoint.UpdateParametersFromRegistry(false, false);
    if (!endpoint.ParamChanges.empty()) return;
    if (waitForChange(watch, endpoint, kParam, milliseconds)) endpoint.UpdateParametersFromRegistry(true, false);
}

bool receiveParameters(Endpoint &endpoint, uint32_t milliseconds, bool force) {
    if (endpoint.ParamChanges.empty()) lookForParameters(endpoint, milliseconds, force);
    if (endpoint.ParamChanges.empty()) return false;
    auto blob = std::make_shared<const std::vector<uint8_t>>(changeRecords(endpoint.ParamChanges));
    endpoint.ParamChangeSize = static_cast<uint32_t>(blob->size());
    endpoint.ParamChangeCount = static_cast<uint32_t>(endpoint.ParamChanges.size());
    endpoint.ParamChangeBlob = std::move(blob);
    endpoint.ParamChanges.clear();
    return true;
}

template <class Value>
void handOut(Value *to, Value value) noexcept {
    if (to != nullptr) *to = value;
}

int32_t cancel(void *handle, const VXWCHAR *traceName, const Path &path) {
    Endpoint *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    const TraceScope scope(endpoint->TraceTarget, traceName, handleArgument(handle));
    Event &event = endpoint->*path.cancel;
    event.set();
    return event ? 1 : 0;
}

}  // namespace
}  // namespace vxcomn

int32_t VXAPOCOMAPI_ReceiveConfigChange(VXAPOHandle apoComHandle, const VXWCHAR **name, const void **data, uint32_t *size,
                                        uint32_t timeoutMs, int32_t force) {
    using namespace vxcomn;
    return guarded(0, [&] {
        return callReceive<kConfig>(apoComHandle, [&](Endpoint &endpoint) {
            if (!receiveNotification(endpoint, timeoutMs, force != 0)) return false;
            handOut(name, endpoint.ConfigChangeName);
            handOut(data, endpoint.ConfigChangeData);
            handOut(size, endpoint.ConfigChangeSize);
            return true;
        });
    });
}

int32_t VXAPOCOMAPI_ReceiveParamChange(VXAPOHandle apoComHandle, const void **blob, uint32_t *size, uint32_t *count,
                                       uint32_t timeoutMs, int32_t force) {
    using namespace vxcomn;
    return guarded(0, [&] {
        return callReceive<kParam>(apoComHandle, [&](Endpoint &endpoint) {
            if (!receiveParameters(endpoint, timeoutMs, force != 0)) return false;
            handOut(blob, static_cast<const void *>(endpoint.ParamChangeBlob->data()));
            handOut(size, endpoint.ParamChangeSize);
            handOut(count, endpoint.ParamChangeCount);
            return true;
        });
    });
}

int32_t VXAPOCOMAPI_CancelReceiveConfigChange(VXAPOHandle apoComHandle) {
    using namespace vxcomn;
    return guarded(0, [&] { return cancel(apoComHandle, VX_TEXT("VXAPOCOMAPI_CancelReceiveConfigChange"), kConfig); });
}

int32_t VXAPOCOMAPI_CancelReceiveParamChange(VXAPOHandle apoComHandle) {
    using namespace vxcomn;
    return guarded(0, [&] { return cancel(apoComHandle, VX_TEXT("VXAPOCOMAPI_CancelReceiveParamChange"), kParam); });
}
