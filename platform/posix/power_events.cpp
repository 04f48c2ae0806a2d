// SPDX-License-Identifier: MIT
#include "platform/power_events.h"

#include <mutex>
#include <vector>

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include "platform/posix/descriptor.h"
#include "platform/posix/login_manager.h"

namespace vxcomn {
namespace {

constexpr int kRetryMilliseconds = 30000;  // how long after there was no bus to look for one again

}  // namespace

struct PowerEvents::Impl {
    explicit Impl(PowerListener &aListener) : listener(aListener) {}

    PowerListener &listener;
    LoginManager manager{listener};
    bool connected = false;  // by the thread that runs
    Descriptor wake{eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)};
    std::mutex mutex;  // guards the two below
    std::vector<PowerEvent> injected;
    bool closed = false;

    void alarm() const noexcept {
        const uint64_t one = 1;
        [[maybe_unused]] const ssize_t written = write(wake.get(), &one, sizeof one);
    }
    void calmDown() const noexcept {
        uint64_t count = 0;
        [[maybe_unused]] const ssize_t taken = read(wake.get(), &count, sizeof count);
    }
};

PowerEvents::PowerEvents(PowerListener &listener) : impl_(std::make_unique<Impl>(listener)) {}
PowerEvents::~PowerEvents() = default;

PowerEvents::Opened PowerEvents::open(const VXWCHAR *) {
    impl_->connected = impl_->manager.connect();
    return {};
}

void PowerEvents::run() {
    for (;;) {
        std::vector<PowerEvent> events;
        bool closed = false;
        {
            const std::lock_guard lock(impl_->mutex);
            events.swap(impl_->injected);
            closed = impl_->closed;
        }
        for (const PowerEvent event : events) impl_->listener.powerChanged(event);
        if (closed) return;
        impl_->connected = impl_->connected ? impl_->manager.process() : impl_->manager.connect();
        pollfd waits[2] = {{impl_->wake.get(), POLLIN, 0}, {-1, 0, 0}};
        int milliseconds = kRetryMilliseconds;
        if (impl_->connected) waits[1] = impl_->manager.waitFor(milliseconds);
        poll(waits, 2, milliseconds);
        impl_->calmDown();
    }
}

void PowerEvents::close() {
    const std::lock_guard lock(impl_->mutex);
    impl_->closed = true;
    impl_->alarm();
}

void PowerEvents::inject(PowerEvent event) {
    const std::lock_guard lock(impl_->mutex);
    impl_->injected.push_back(event);
    impl_->alarm();
}

}  // namespace vxcomn
