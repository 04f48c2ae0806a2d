// SPDX-License-Identifier: MIT
//
// Switches the host's logging on through the registry, as a user does, and catches what instances that are made meanwhile say.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include "platform/registry.h"
#include "tests/support/debug_capture.h"

namespace vxcomn::testing {

class HostLog {
  public:
    HostLog() {
        const WideString path = VX_TEXT("Software\\Ondrevale\\Logging\\APO");
        if (RegistryKey::create(RegistryRoot::localMachine, path, RegistryAccess::readWrite, key_) == status::ok) {
            key_.setU32(VX_TEXT("VXCOMN"), 1);
        }
    }
    ~HostLog() { key_.deleteValue(VX_TEXT("VXCOMN")); }
    HostLog(const HostLog &) = delete;
    HostLog &operator=(const HostLog &) = delete;

    // The texts behind the first `skipped` ones, without tag, numbers and indentation.
    std::vector<std::string> texts(size_t skipped = 0) const {
        std::vector<std::string> texts;
        for (const std::string &line : capture_.lines()) {
            if (line.rfind("VXCOMNU[", 0) != 0) continue;
            const size_t end = line.find("]: ");
            const size_t text = end == std::string::npos ? end : line.find_first_not_of(' ', end + 3);
            texts.push_back(text == std::string::npos ? "" : line.substr(text));
        }
        texts.erase(texts.begin(), texts.begin() + static_cast<ptrdiff_t>(std::min(skipped, texts.size())));
        return texts;
    }

    // All lines, as they came.
    std::vector<std::string> lines() const { return capture_.lines(); }

  private:
    RegistryKey key_;
    DebugCapture capture_;
};

}  // namespace vxcomn::testing
