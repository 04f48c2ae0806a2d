// SPDX-License-Identifier: MIT
//
// What tests of the control functions stand on beside the sample machine: a client, an open endpoint, and the log of both.
#pragma once

#include <doctest/doctest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "VXAPOCOMAPI.h"
#include "control/api_context.h"
#include "control/endpoint_context.h"
#include "tests/support/host_log.h"
#include "tests/support/sample_machine.h"

namespace test {

inline VXAPOCOMAPI_APIContext &apiOf(VXAPOHandle handle) {
    return *static_cast<VXAPOCOMAPI_APIContext *>(handle);
}
inline VXAPOCOMAPI_EndpointContext &endpointOf(VXAPOHandle handle) {
    return *static_cast<VXAPOCOMAPI_EndpointContext *>(handle);
}

// One client of the library.
struct Client {
    VXAPOHandle api = VXAPOCOMAPI_InitializeAPI();

    Client() { REQUIRE(api != nullptr); }
    ~Client() { VXAPOCOMAPI_FreeAPI(api); }
    Client(const Client &) = delete;
    Client &operator=(const Client &) = delete;

    VXAPOCOMAPI_APIContext &context() const { return apiOf(api); }
};

// A machine whose endpoint a client has opened; no slot is chosen yet.
struct OpenEndpoint {
    vxcomn::testing::SampleMachine machine;
    Client client;
    VXAPOHandle endpoint = nullptr;

    OpenEndpoint() {
        if (!machine.hasEndpoint()) return;
        endpoint = VXAPOCOMAPI_GetEndpoint(client.api, machine.endpointId().c_str(), 0);
        REQUIRE(endpoint != nullptr);
    }
    bool none() const {
        if (endpoint == nullptr) MESSAGE("skipped: this machine has no active endpoint for rendering");
        return endpoint == nullptr;
    }
    VXAPOCOMAPI_EndpointContext &context() const { return endpointOf(endpoint); }
};

// The control functions' log from a place on that the test sets.
class CallLog : public vxcomn::testing::ControlLines {
  public:
    void restart() { from_ = SwitchedLog::texts().size(); }

    std::vector<std::string> texts() const { return SwitchedLog::texts(from_); }
    bool has(const std::string &text) const { return count(text) != 0; }
    size_t count(const std::string &text) const {
        const std::vector<std::string> all = texts();
        return static_cast<size_t>(std::count(all.begin(), all.end(), text));
    }
    // Whether these stand in the log one behind the other, with others in between or not. Says which doesn't.
    bool hasInOrder(const std::vector<std::string> &wanted) const {
        size_t at = 0;
        for (const std::string &text : texts()) {
            if (at < wanted.size() && text == wanted[at]) ++at;
        }
        if (at < wanted.size()) MESSAGE("not in its place: " << wanted[at]);
        return at == wanted.size();
    }

  private:
    size_t from_ = 0;
};

inline std::string hexadecimal(const void *address, bool upperCase = false) {
    char text[32];
    std::snprintf(text, sizeof text, upperCase ? "%llX" : "%llx",
                  static_cast<unsigned long long>(reinterpret_cast<uintptr_t>(address)));
    return text;
}

}  // namespace test
