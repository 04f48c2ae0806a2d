// SPDX-License-Identifier: MIT
//
// The walk's look at the clients of a slot. Each client's mark is a value named by its instance id, and its life is a mutex of that
// name; a mark without a life is disposed of here, by whoever walks first.
#include <set>

#include "platform/guid.h"
#include "platform/named_mutex.h"
#include "preset/parameter_walk.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxMarkUnits = 2048;

bool isMark(const WideString &name) {
    return !name.empty() && name.front() == VXWCHAR{'{'} && name.size() <= kMaxMarkUnits;
}

Status disposeOfMark(const WideString &path, const WideString &name) {
    RegistryKey key;
    const Status opened = RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::write, key);
    return opened == status::ok ? key.deleteValue(name) : opened;
}

}  // namespace

void ParameterWalk::lookAtClients(const WideString &configurationKey) {
    clientsKey_ = configurationKey + VX_TEXT("\\") + store_name::clients;
    const WideString &path = clientsKey_;
    RegistryKey key;
    std::vector<RegistryEntry> marks;
    if (RegistryKey::openWithEntries(RegistryRoot::localMachine, path, RegistryAccess::read, key, 0, marks) != status::ok) {
        trace_.log(VX_TEXT("Failed to open registry key HKLM\\%s to check for endpoint's clients\n"), path);
        return;
    }
    std::set<GUID, GuidLess> running;
    bool passOver = false;  // a value behind a deleted one is disposed of in the next walk only
    for (const RegistryEntry &mark : marks) {
        const bool isPassedOver = std::exchange(passOver, false);
        if (!isMark(mark.name)) continue;
        if (NamedMutex::exists(VX_TEXT("Global\\") + mark.name)) {
            if (GUID client; parseGuidText(mark.name, client)) running.insert(client);
        } else if (!isPassedOver) {
            trace_.log(VX_TEXT("Client with id %s is not running, disposing registry entry HKLM\\%s ...\n"), mark.name, path);
            passOver = disposeOfMark(path, mark.name) == status::ok;
        }
    }
    for (auto client = memory_.clients.begin(); client != memory_.clients.end();) {
        if (running.contains(client->first)) {
            ++client;
        } else {
            forgetClient(client);
        }
    }
    for (const GUID &client : running) memory_.clients.try_emplace(client);
}

// A client marks itself before it writes, so one that writes behind the look at the marks has its mark by now.
bool ParameterWalk::hasJoined(const GUID &client) {
    const WideString id = guidText(client);
    RegistryValue mark;
    if (clientsKey_.empty() || !NamedMutex::exists(VX_TEXT("Global\\") + id) ||
        RegistryKey::queryAt(RegistryRoot::localMachine, clientsKey_, id, mark, 0) == status::fileNotFound) {
        return false;
    }
    memory_.clients.try_emplace(client);
    return true;
}

// What the client said for itself lapses, so all components are looked into anew.
void ParameterWalk::forgetClient(KnownClients::iterator &client) {
    client = memory_.clients.erase(client);
    if (memory_.parametersStamp != 0) {
        memory_.parametersStamp = 0;
        memory_.componentStamps.fill(0);
    }
    trace_.log(VX_TEXT("Done."));
}

}  // namespace vxcomn
