// SPDX-License-Identifier: MIT
//
// Descriptor: owns a file descriptor of the system.
#pragma once

#include <cerrno>

#include <unistd.h>

#include "platform/unique.h"

namespace vxcomn {

struct DescriptorTraits {
    using Raw = int;
    static constexpr Raw none = -1;
    // Closing keeps the reason of the failure that led to it.
    static void close(Raw descriptor) noexcept {
        const int savedError = errno;
        ::close(descriptor);
        errno = savedError;
    }
};
using Descriptor = Unique<DescriptorTraits>;

}  // namespace vxcomn
