// SPDX-License-Identifier: MIT
//
// A client of the control functions on the sample machine, with the endpoint open and, mostly, a slot chosen.
#pragma once

#include <doctest/doctest.h>

#include <memory>

#include "VXAPOCOMAPI.h"
#include "control/endpoint_context.h"
#include "preset/parameter_store.h"
#include "tests/support/host_log.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::testing {

using Bytes = std::vector<uint8_t>;

// One client with one endpoint handle.
struct Client {
    explicit Client(const SampleMachine &machine, const char *apoType = "EFX") : api(VXAPOCOMAPI_InitializeAPI()) {
        REQUIRE(api != nullptr);
        endpoint = VXAPOCOMAPI_GetEndpoint(api, machine.endpointId().c_str(), 0);
        REQUIRE(endpoint != nullptr);
        if (apoType != nullptr) REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, apoType) == 1);
    }
    ~Client() {
        if (api != nullptr) VXAPOCOMAPI_FreeAPI(api);
    }
    Client(const Client &) = delete;
    Client &operator=(const Client &) = delete;

    VXAPOCOMAPI_EndpointContext &context() const { return *static_cast<VXAPOCOMAPI_EndpointContext *>(endpoint); }
    int32_t error() const { return VXAPOCOMAPI_GetLastError(endpoint); }
    void end() {
        VXAPOCOMAPI_FreeAPI(api);
        api = endpoint = nullptr;
    }

    VXAPOHandle api = nullptr, endpoint = nullptr;
};

inline Bytes storedAt(const WideString &parameterKey, int32_t component, int32_t param) {
    uint32_t size = 0x10000;
    Bytes bytes(size);
    if (ReadParameterValue(parameterKey, component, param, bytes.data(), size, nullptr, nullptr) != status::ok) size = 0;
    bytes.resize(size);
    return bytes;
}

inline void storeAt(const WideString &parameterKey, int32_t component, int32_t param, const Bytes &bytes) {
    REQUIRE(WriteParameter(nullptr, parameterKey, component, param, -1, bytes, {}, false, nullptr));
}

// The machine, its log, and a client.
struct OpenSlot {
    explicit OpenSlot(const char *apoType = "EFX") : client(std::make_unique<Client>(machine, apoType)) {}

    VXAPOHandle handle() const { return client->endpoint; }
    VXAPOCOMAPI_EndpointContext &context() const { return client->context(); }
    int32_t error() const { return client->error(); }
    Bytes stored(int32_t component, int32_t param) const { return storedAt(context().ParamRegKeyName.get(), component, param); }
    void store(int32_t component, int32_t param, const Bytes &bytes) const {
        storeAt(context().ParamRegKeyName.get(), component, param, bytes);
    }
    // The lines that `call` adds to the log.
    template <class Call>
    std::vector<std::string> linesOf(Call &&call) const {
        const size_t before = log.texts().size();
        call();
        return log.texts(before);
    }

    SampleMachine machine;
    ControlLines log;
    std::unique_ptr<Client> client;
};

struct NoSlot : OpenSlot {
    NoSlot() : OpenSlot(nullptr) {}
};

inline bool contains(const std::vector<std::string> &lines, const std::string &line) {
    return std::find(lines.begin(), lines.end(), line) != lines.end();
}

// Counts how often a property changes.
template <class Property>
struct ChangeCount {
    explicit ChangeCount(Property &watched) : property(watched) { property.addChanged({this, note}); }
    ~ChangeCount() { property.removeChanged({this, note}); }
    ChangeCount(const ChangeCount &) = delete;
    ChangeCount &operator=(const ChangeCount &) = delete;
    static void note(void *self) { ++static_cast<ChangeCount *>(self)->count; }

    Property &property;
    int count = 0;
};

}  // namespace vxcomn::testing
