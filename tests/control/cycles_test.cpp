// SPDX-License-Identifier: MIT
//
// Whoever comes and goes leaves nothing behind. VXCOMN_CYCLES says how often; few by default.
#include <doctest/doctest.h>

#include <cstdlib>

#include "preset/store_names.h"
#include "tests/control/control_fixture.h"
#include "tests/support/memory_use.h"
#include "tests/support/resource_use.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

int cycles() {
    const char *wanted = std::getenv("VXCOMN_CYCLES");
    return wanted != nullptr ? std::max(1, std::atoi(wanted)) : 20;
}

// One client's life: open, choose, set, receive, close.
void live(const WideString &id, int round) {
    const test::Client client;
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(client.api, id.c_str(), 0);
    REQUIRE(endpoint != nullptr);
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_VOICE_LEVEL, static_cast<float>(round % 100) / 100.0F) == 1);
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    REQUIRE(VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 1) == 1);
    REQUIRE(count >= 17);
    const VXWCHAR *name = nullptr;
    const void *data = nullptr;
    VXAPOCOMAPI_ReceiveConfigChange(endpoint, &name, &data, &size, 0, 1);
    REQUIRE(VXAPOCOMAPI_FreeEndpoint(endpoint) == 1);
}

size_t keysBelow(const WideString &path) {
    RegistryKey key;
    std::vector<WideString> names;
    if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) != status::ok) return 0;
    key.subkeys(names);
    size_t count = names.size();
    for (const WideString &name : names) count += keysBelow(path + VX_TEXT("\\") + name);
    return count;
}

}  // namespace

TEST_CASE("opening, choosing, setting, receiving and closing leave handles, keys, threads and memory as they were") {
    const SampleMachine machine;
    if (!machine.hasEndpoint()) {
        MESSAGE("skipped: this machine has no active endpoint for rendering");
        return;
    }
    for (int round = 0; round < 5; ++round) live(machine.endpointId(), round);
    const ResourceUse before = resourcesInUse();
    const uint64_t memoryBefore = memoryInUse();
    const size_t keysBefore = keysBelow(kStoreRoot);
    for (int round = 0; round < cycles(); ++round) live(machine.endpointId(), round);
    const ResourceUse behind = resourcesInUse();
    MESSAGE(cycles() << " cycles: handles " << before.handles << " to " << behind.handles << ", threads " << before.threads
                     << " to " << behind.threads << ", memory " << memoryBefore / 1024 << " KiB to " << memoryInUse() / 1024
                     << " KiB");
    CHECK(before.handles != 0);
    CHECK(behind.handles <= before.handles + 2);  // the system's own come and go
    CHECK(behind.threads <= before.threads + 2);
    CHECK(memoryInUse() < memoryBefore + (4U << 20));
    CHECK(keysBelow(kStoreRoot) == keysBefore);
}
