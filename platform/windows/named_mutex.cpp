// SPDX-License-Identifier: MIT
#include "platform/named_mutex.h"

#include "platform/security.h"
#include "platform/windows/wait_object.h"

namespace vxcomn {
namespace {

bool isName(WideView name) noexcept {
    return !name.empty() && name.find(VXWCHAR{0}) == WideView::npos;
}

}  // namespace

struct NamedMutex::Impl {
    SystemHandle handle;

    static Status take(SystemHandle handle, NamedMutex &mutex) {
        if (!handle) return GetLastError();
        auto impl = std::make_unique<Impl>();
        impl->handle = std::move(handle);
        mutex.impl_ = std::move(impl);
        return status::ok;
    }
};

NamedMutex::NamedMutex() noexcept = default;
NamedMutex::NamedMutex(NamedMutex &&) noexcept = default;
NamedMutex &NamedMutex::operator=(NamedMutex &&) noexcept = default;
NamedMutex::~NamedMutex() = default;

Status NamedMutex::create(WideView name, NamedMutex &mutex, MutexOwner owner, bool *created) {
    if (!isName(name)) return status::invalidParameter;
    SetLastError(ERROR_SUCCESS);
    SystemHandle handle(CreateMutexExW(static_cast<SECURITY_ATTRIBUTES *>(mutexSecurity().attributes()), WideString(name).c_str(),
                                       owner == MutexOwner::caller ? CREATE_MUTEX_INITIAL_OWNER : 0, SYNCHRONIZE));
    if (handle && created != nullptr) *created = GetLastError() != ERROR_ALREADY_EXISTS;
    return Impl::take(std::move(handle), mutex);
}

Status NamedMutex::open(WideView name, NamedMutex &mutex) {
    if (!isName(name)) return status::invalidParameter;
    return Impl::take(SystemHandle(OpenMutexW(SYNCHRONIZE, FALSE, WideString(name).c_str())), mutex);
}

bool NamedMutex::exists(WideView name) {
    return isName(name) && SystemHandle(OpenMutexW(SYNCHRONIZE, FALSE, WideString(name).c_str()));
}

NamedMutex::operator bool() const noexcept {
    return impl_ != nullptr;
}

void NamedMutex::close() noexcept {
    impl_.reset();
}

MutexWait NamedMutex::acquire(uint32_t milliseconds) noexcept {
    if (!impl_) return MutexWait::failed;
    switch (WaitForSingleObject(impl_->handle.get(), milliseconds)) {
        case WAIT_OBJECT_0:
            return MutexWait::acquired;
        case WAIT_ABANDONED:
            return MutexWait::abandoned;
        case WAIT_TIMEOUT:
            return MutexWait::timedOut;
        default:
            return MutexWait::failed;
    }
}

Status NamedMutex::release() noexcept {
    if (!impl_) return status::invalidHandle;
    return ReleaseMutex(impl_->handle.get()) ? status::ok : static_cast<Status>(GetLastError());
}

}  // namespace vxcomn
