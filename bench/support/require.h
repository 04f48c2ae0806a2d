// SPDX-License-Identifier: MIT
#pragma once

#include <stdexcept>

namespace vxcomn::bench {

// A figure is worth something only if what it times worked.
inline void require(bool done, const char *what) {
    if (!done) throw std::runtime_error(what);
}

}  // namespace vxcomn::bench
