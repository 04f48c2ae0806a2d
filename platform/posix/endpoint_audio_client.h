// SPDX-License-Identifier: MIT
//
// An audio client that plays nothing. It keeps the rules of the real one about what may follow what, so that code which gets along
// with it gets along with that. Control threads.
#pragma once

#include "platform/posix/endpoint_keys.h"

namespace vxcomn {

HRESULT makeAudioClient(const Endpoint &endpoint, IAudioClient **client) noexcept;

}  // namespace vxcomn
