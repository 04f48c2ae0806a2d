// SPDX-License-Identifier: MIT
#include "platform/named_mutex.h"

#include "platform/posix/token.h"

namespace vxcomn {

struct NamedMutex::Impl {
    std::shared_ptr<Token> token;
};

NamedMutex::NamedMutex() noexcept = default;
NamedMutex::NamedMutex(NamedMutex &&) noexcept = default;
NamedMutex &NamedMutex::operator=(NamedMutex &&) noexcept = default;
NamedMutex::~NamedMutex() = default;

Status NamedMutex::create(WideView name, NamedMutex &mutex, MutexOwner owner, bool *created) {
    std::shared_ptr<Token> token;
    bool isNew = false;
    const auto how = owner == MutexOwner::caller ? Token::Open::makeOwned : Token::Open::makeFree;
    if (const Status status = Token::open(name, how, token, isNew); status != status::ok) return status;
    mutex.impl_ = std::make_unique<Impl>(Impl{std::move(token)});
    if (created != nullptr) *created = isNew;
    return status::ok;
}

Status NamedMutex::open(WideView name, NamedMutex &mutex) {
    std::shared_ptr<Token> token;
    bool isNew = false;
    if (const Status status = Token::open(name, Token::Open::existing, token, isNew); status != status::ok) return status;
    mutex.impl_ = std::make_unique<Impl>(Impl{std::move(token)});
    return status::ok;
}

bool NamedMutex::exists(WideView name) {
    return Token::exists(name);
}

NamedMutex::operator bool() const noexcept {
    return impl_ != nullptr;
}

void NamedMutex::close() noexcept {
    impl_.reset();
}

MutexWait NamedMutex::acquire(uint32_t milliseconds) noexcept {
    return impl_ ? impl_->token->acquire(milliseconds) : MutexWait::failed;
}

Status NamedMutex::release() noexcept {
    return impl_ ? impl_->token->release() : status::invalidHandle;
}

}  // namespace vxcomn
