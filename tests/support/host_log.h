// SPDX-License-Identifier: MIT
//
// Switches the logging of a part of the library on through the registry, as a user does, and catches what its objects that are made
// meanwhile say.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include "platform/registry.h"
#include "tests/support/debug_capture.h"

namespace vxcomn::testing {

class SwitchedLog {
  public:
    // `tag` stands in front of the lines that count.
    SwitchedLog(const VXWCHAR *switchName, std::string tag) : switch_(switchName), tag_(std::move(tag)) {
        const WideString path = VX_TEXT("Software\\Ondrevale\\Logging\\APO");
        if (RegistryKey::create(RegistryRoot::localMachine, path, RegistryAccess::readWrite, key_) == status::ok) {
            key_.setU32(switch_, 1);
        }
    }
    ~SwitchedLog() { key_.deleteValue(switch_); }
    SwitchedLog(const SwitchedLog &) = delete;
    SwitchedLog &operator=(const SwitchedLog &) = delete;

    // The texts behind the first `skipped` ones, without tag, numbers and indentation.
    std::vector<std::string> texts(size_t skipped = 0) const {
        std::vector<std::string> texts;
        for (const std::string &line : capture_.lines()) {
            if (line.rfind(tag_ + "[", 0) != 0) continue;
            const size_t end = line.find("]: ");
            const size_t text = end == std::string::npos ? end : line.find_first_not_of(' ', end + 3);
            texts.push_back(text == std::string::npos ? "" : line.substr(text));
        }
        texts.erase(texts.begin(), texts.begin() + static_cast<ptrdiff_t>(std::min(skipped, texts.size())));
        return texts;
    }

    // All lines, as they came.
    std::vector<std::string> lines() const { return capture_.lines(); }

    bool has(const std::string &text) const { return count(text) != 0; }
    size_t count(const std::string &text) const {
        const std::vector<std::string> all = texts();
        return static_cast<size_t>(std::count(all.begin(), all.end(), text));
    }
    // Whether these stand in the log one behind the other, with others in between or not.
    bool inOrder(const std::vector<std::string> &wanted, size_t skipped = 0) const {
        auto next = wanted.begin();
        for (const std::string &text : texts(skipped)) {
            if (next != wanted.end() && text == *next) ++next;
        }
        return next == wanted.end();
    }

  private:
    const VXWCHAR *const switch_;
    const std::string tag_;
    RegistryKey key_;
    DebugCapture capture_;
};

struct HostLog : SwitchedLog {
    HostLog() : SwitchedLog(VX_TEXT("VXCOMN"), "VXCOMNU") {}
};

// Of the control functions.
struct ControlLines : SwitchedLog {
    ControlLines() : SwitchedLog(VX_TEXT("VXCOMAPI"), "VXCOMAPIU") {}
};

}  // namespace vxcomn::testing
