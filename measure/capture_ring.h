// SPDX-License-Identifier: MIT
//
// Hands captured samples to the application, buffer by buffer. The buffers and their flags are the application's; a flag that shows
// 1 is the hand-over. Capture thread.
#pragma once

#include "vxcomn/measurement_records.h"

namespace vxcomn {

// Appends samples, taken as 32-bit words. A one-shot ring that is full stores nothing. Neither does one with a buffer or its flags
// missing.
void feedCaptureRing(CaptureRing &ring, const uint32_t *samples, int frames) noexcept;

}  // namespace vxcomn
