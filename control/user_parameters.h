// SPDX-License-Identifier: MIT
//
// Writing the engine's parameters as every control call does, and the check that turns a call inside another away. Control threads.
#pragma once

#include <atomic>
#include <cstdint>

#include "control/endpoint_context.h"

namespace vxcomn {

// A parameter on its way into the store.
struct ParameterWrite {
    int32_t component = 0;
    int32_t param = 0;
    int32_t channel = kAllChannels;
    const void *data = nullptr;
    uint32_t size = 0;
    bool isGlobal = false;     // into the key of every configuration and content type of the slot
    bool isTransient = false;  // lapses with the client
    GUID *instanceId = nullptr;
    uint64_t *time = nullptr;
};

// Takes no lock. False sets the thread's last error.
bool writeParameter(VXAPOCOMAPI_EndpointContext &endpoint, const ParameterWrite &write);

// VXAPOCOMAPI_SetUserParameter on an endpoint that is known to live; `id` may bear VXAPOCOMAPI_IS_GLOBAL.
int32_t setUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, uint32_t id, float value);
// VXAPOCOMAPI_GetUserParameter.
float getUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, int32_t id);
// The same without the check for a call inside another: for who must not take another thread's call for an answer of 0.
float readUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, int32_t id);

// Marks that a call is inside, for a scope.
class InsideCall {
  public:
    explicit InsideCall(std::atomic<uint8_t> &flag) noexcept : flag_(flag) { flag_ = 1; }
    ~InsideCall() { flag_ = 0; }
    InsideCall(const InsideCall &) = delete;
    InsideCall &operator=(const InsideCall &) = delete;

  private:
    std::atomic<uint8_t> &flag_;
};

}  // namespace vxcomn
