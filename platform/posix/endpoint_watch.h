// SPDX-License-Identifier: MIT
//
// Tells notification clients what happens to endpoints: a thread that waits for changes of their keys and compares what is there
// with what was. It starts with the first client and ends with the watch. Control threads.
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "platform/change_signal.h"
#include "platform/posix/com_object.h"
#include "platform/posix/endpoint_keys.h"

namespace vxcomn {

class EndpointWatch {
  public:
    EndpointWatch() = default;
    ~EndpointWatch();
    EndpointWatch(const EndpointWatch &) = delete;
    EndpointWatch &operator=(const EndpointWatch &) = delete;

    // What changes after it has returned is told. A client may be added more than once, and then is told as often.
    HRESULT add(IMMNotificationClient *client) noexcept;
    // Once it has returned the client is told nothing more.
    HRESULT remove(IMMNotificationClient *client) noexcept;

  private:
    struct State;
    std::shared_ptr<State> state_;
    std::thread thread_;
};

}  // namespace vxcomn
