// SPDX-License-Identifier: MIT
//
// One endpoint and one of its effect slots, opened through the control API as any control panel does it, and closed again on every
// way out. Turns the API's codes into sentences that say what to do.
#pragma once

#include <VXAPOCOMAPI.h>

#include <cstdint>
#include <string>

#include "tools/vx_client/device_list.h"

namespace vx::client {

inline constexpr const char *kApoTypes[] = {"EFX", "MFX", "SFX", "LFX", "GFX"};

// Which slot of which endpoint a verb was asked for.
struct SlotChoice {
    std::string endpoint;
    std::string apo = "EFX";
};

// Whether the session drives the slot or only looks on: who looks on does not bind the effect module of the machine.
enum class SessionKind : uint8_t { control, observer };

class Session {
  public:
    // Opens the endpoint and, unless `apo` is empty, chooses the slot.
    Session(const Device &device, const std::string &apo, SessionKind kind = SessionKind::control);
    Session(const Session &) = delete;
    Session &operator=(const Session &) = delete;
    ~Session();

    VXAPOHandle handle() const { return endpoint_; }
    const Device &device() const { return device_; }
    const std::string &apo() const { return apo_; }
    // The identity that marks this session's changes.
    const GUID &instance() const { return instance_; }

    // Ends with what the last call came to.
    [[noreturn]] void fail(const std::string &what) const;
    // The sentence for the last error; empty for none.
    std::string lastError() const;

    // What is selected, after a look at the store.
    std::string engine() const { return selection(VXAPOCOMAPI_GetEngine, 1024); }
    std::string ioConfig() const { return selection(VXAPOCOMAPI_GetIOConfig, 1024); }
    std::string profile() const { return selection(VXAPOCOMAPI_GetUserProfile, 512); }
    std::string content() const { return selection(VXAPOCOMAPI_GetContentType, 512); }

  private:
    std::string selection(int32_t (*getter)(VXAPOHandle, char *), size_t room) const;

    Device device_;
    std::string apo_;
    GUID instance_ = {};
    VXAPOHandle api_ = nullptr;
    VXAPOHandle endpoint_ = nullptr;
};

// The sentence for a code of the API and the Windows error that goes with it.
std::string errorSentence(int32_t code, uint32_t windowsError);

}  // namespace vx::client
