// SPDX-License-Identifier: MIT
#include "preset/global_mutex.h"

namespace vxcomn {

Status GlobalMutex::create(WideView name) {
    WideString kept(name);  // `name` may be this object's own
    close();
    name_ = std::move(kept);
    return NamedMutex::create(VX_TEXT("Global\\") + name_, mutex_);
}

void GlobalMutex::close() noexcept {
    mutex_.close();
    name_.clear();
}

GlobalMutexLock::GlobalMutexLock(GlobalMutex &mutex) noexcept : mutex_(mutex) {
    if (!mutex) {
        mutex.trace_.log(VX_TEXT("Mutex handle = NULL!!!\n"));
        return;
    }
    const MutexWait outcome = mutex.mutex_.acquire(kGlobalMutexWait);
    acquired_ = outcome == MutexWait::acquired || outcome == MutexWait::abandoned;
    if (!acquired_) mutex.trace_.log(VX_TEXT("Failed to acquire mutex!!!\n"));
}

GlobalMutexLock::~GlobalMutexLock() {
    // Who does not own it is told so by the system, and nothing comes of it.
    mutex_.mutex_.release();
}

}  // namespace vxcomn
