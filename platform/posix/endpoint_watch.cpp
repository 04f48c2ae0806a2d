// SPDX-License-Identifier: MIT
#include "platform/posix/endpoint_watch.h"

#include <algorithm>
#include <new>
#include <system_error>

namespace vxcomn {
namespace {

constexpr uint32_t kRetryMilliseconds = 1000;  // after the store refused, which it does for want of memory or disk

using States = std::map<WideString, std::optional<uint32_t>>;  // by id; no state as long as the key holds none

States statesNow() {
    States states;
    for (const Endpoint &endpoint : listEndpoints(eAll)) states[endpoint.id()] = endpointState(endpoint);
    return states;
}

}  // namespace

struct EndpointWatch::State {
    Event quit{EventReset::manual};
    ChangeSignal signal;
    // Held while clients are told, so that one that is removed has heard its last. Recursive, for a client may add and remove.
    std::recursive_mutex mutex;
    std::vector<ComPtr<IMMNotificationClient>> clients;
    States known;

    // Arms, on a fresh key if the one watched is gone.
    Status arm() {
        if (signal && signal.arm() == status::ok) return status::ok;
        RegistryKey key;
        const Status opened = RegistryKey::create(RegistryRoot::localMachine, endpointsPath(), RegistryAccess::read, key);
        if (opened != status::ok) return opened;
        if (const Status watched = ChangeSignal::open(key, ChangeFilter::keysAndValues, signal); watched != status::ok)
            return watched;
        return signal.arm();
    }

    template <class Call>
    void tell(Call call) {
        const auto count = clients.size();
        for (size_t i = 0; i < count && i < clients.size(); ++i) {
            const auto client = shareCom(clients[i].get());
            call(*client.get());
        }
    }

    void compare() {
        const States now = statesNow();
        const std::lock_guard lock(mutex);
        const States before = std::exchange(known, now);
        for (const auto &[id, state] : before) {
            if (!now.contains(id)) tell([&id = id](IMMNotificationClient &client) { client.OnDeviceRemoved(id.c_str()); });
        }
        for (const auto &[id, state] : now) {
            const auto old = before.find(id);
            if (old == before.end()) tell([&id = id](IMMNotificationClient &client) { client.OnDeviceAdded(id.c_str()); });
            if (!state || (old != before.end() && old->second == state)) continue;
            tell([&id = id, state = *state](IMMNotificationClient &client) { client.OnDeviceStateChanged(id.c_str(), state); });
        }
    }

    void run() {
        for (bool armed = true;;) {
            const WaitAnswer answer = armed ? waitForAny({&quit, &signal}, kForever) : waitForAny({&quit}, kRetryMilliseconds);
            if (answer.outcome != WaitOutcome::timedOut && answer.index == 0) return;
            // Arming comes before reading, so that nothing is missed in between.
            armed = arm() == status::ok;
            compare();
        }
    }
};

EndpointWatch::~EndpointWatch() {
    if (!thread_.joinable()) return;
    state_->quit.set();
    // A client may let go of the enumerator while it is told something.
    if (thread_.get_id() == std::this_thread::get_id()) {
        thread_.detach();
    } else {
        thread_.join();
    }
}

HRESULT EndpointWatch::add(IMMNotificationClient *client) noexcept {
    try {
        if (!state_) state_ = std::make_shared<State>();
        const std::lock_guard lock(state_->mutex);
        if (!thread_.joinable()) {
            if (const Status status = state_->arm(); status != status::ok) return resultOf(status);
            state_->known = statesNow();
            thread_ = std::thread([state = state_] { state->run(); });
        }
        state_->clients.push_back(shareCom(client));
        return S_OK;
    } catch (const std::bad_alloc &) {
        return E_OUTOFMEMORY;
    } catch (const std::system_error &) {
        return E_OUTOFMEMORY;
    }
}

HRESULT EndpointWatch::remove(IMMNotificationClient *client) noexcept {
    if (!state_) return kNotFound;
    const std::lock_guard lock(state_->mutex);
    const auto found =
        std::find_if(state_->clients.begin(), state_->clients.end(), [client](const auto &each) { return each.get() == client; });
    if (found == state_->clients.end()) return kNotFound;
    state_->clients.erase(found);
    return S_OK;
}

}  // namespace vxcomn
