// SPDX-License-Identifier: MIT
//
// dconf, on a message bus of the bench's own: the other store of small values that tells readers of changes.
#pragma once

#include <filesystem>
#include <string>

#include <sys/types.h>

#include "bench/support/shared_page.h"

namespace vxcomn::bench {

// A bus, until it is ended.
class MessageBus {
  public:
    explicit MessageBus(const std::filesystem::path &folder);
    explicit operator bool() const noexcept { return process_ > 0; }
    void end() const noexcept;

  private:
    pid_t process_ = -1;
};

// Whether a value can be written and read back at all.
bool dconfWorks();
void writeDconf(uint64_t value);
// In the reader: watches for ever and notes when each value is in hand.
[[noreturn]] void watchDconf(SharedPage &page);

}  // namespace vxcomn::bench
