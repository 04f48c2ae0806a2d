// SPDX-License-Identifier: MIT
//
// Gives the pink noise the platform's word for each thread, while the library loads. The generators know no platform call, so the
// host stands between.
#include "measure/thread_random.h"
#include "platform/thread_random.h"

namespace vxcomn {
namespace {

struct InstallAtLoad {
    InstallAtLoad() noexcept { installThreadRandom(threadRandomWord); }
} installAtLoad;

}  // namespace
}  // namespace vxcomn
