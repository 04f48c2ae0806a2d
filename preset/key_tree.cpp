// SPDX-License-Identifier: MIT
//
// Deleting a key with all below it, key by key, with the limits of the buffer that its path once stood in.
#include "platform/registry.h"
#include "preset/parameter_store.h"

namespace vxcomn {
namespace {

// Kept: what is longer is cut, and then names another key or none.
constexpr size_t kMaxPathUnits = 520;

bool deleteTree(RegistryKey &machine, const WideString &path, bool keepTop);

bool deleteBelow(RegistryKey &machine, const RegistryKey &key, const WideString &path) {
    std::vector<WideString> names, before;
    while (key.subkeys(names) == status::ok && !names.empty()) {
        if (names == before) return false;  // what is left will not go
        for (const WideString &name : names) {
            const WideString below = path + VXWCHAR{'\\'} + name;
            if (below.size() > kMaxPathUnits || !deleteTree(machine, below, false)) return false;
        }
        before = std::move(names);
    }
    return true;
}

bool deleteTree(RegistryKey &machine, const WideString &path, bool keepTop) {
    if (!keepTop && machine.deleteBelow(path) == status::ok) return true;
    {
        RegistryKey key;
        const Status status = machine.openBelow(path, RegistryAccess::read, key);
        if (status != status::ok) return status == status::fileNotFound;
        deleteBelow(machine, key, path);
    }
    return keepTop || machine.deleteBelow(path) == status::ok;
}

}  // namespace

bool DeleteRegKeyTree(WideView keyPath, bool keepTop) {
    bool deleted = false;
    const WideString path(keyPath.substr(0, kMaxPathUnits));
    const Status status = inOneWrite([&] {
        RegistryKey machine;
        const Status opened = RegistryKey::open(RegistryRoot::localMachine, {}, RegistryAccess::read, machine);
        deleted = opened == status::ok && deleteTree(machine, path, keepTop);
        return opened;
    });
    return status == status::ok && deleted;
}

}  // namespace vxcomn
