// SPDX-License-Identifier: MIT
//
// A scope whose allocations the leak check leaves out: for the cases in which the library keeps memory that nobody can reach any
// more, because its contract says so.
#pragma once

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

namespace vxcomn::testing {

class LeakAllowed {
  public:
#if defined(__SANITIZE_ADDRESS__)
    LeakAllowed() {
        __lsan_disable();
    }
    ~LeakAllowed() {
        __lsan_enable();
    }
#else
    LeakAllowed() {}
    ~LeakAllowed() {}
#endif
    LeakAllowed(const LeakAllowed &) = delete;
    LeakAllowed &operator=(const LeakAllowed &) = delete;
};

}  // namespace vxcomn::testing
