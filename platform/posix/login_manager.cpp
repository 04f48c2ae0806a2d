// SPDX-License-Identifier: MIT
#include "platform/posix/login_manager.h"

#include <algorithm>
#include <climits>
#include <cstdint>

#include <dlfcn.h>

#include "platform/clock.h"

namespace vxcomn {
namespace {

using Handler = int (*)(sd_bus_message *, void *, void *);

// What is used of libsystemd. Never unloaded.
struct BusLibrary {
    int (*openSystem)(sd_bus **) = nullptr;
    int (*matchSignal)(sd_bus *, void **, const char *, const char *, const char *, const char *, Handler, void *) = nullptr;
    int (*readBasic)(sd_bus_message *, char, void *) = nullptr;
    int (*process)(sd_bus *, sd_bus_message **) = nullptr;
    int (*descriptor)(sd_bus *) = nullptr;
    int (*events)(sd_bus *) = nullptr;
    int (*timeout)(sd_bus *, uint64_t *) = nullptr;
    sd_bus *(*close)(sd_bus *) = nullptr;
    bool whole = false;

    BusLibrary() {
        void *library = dlopen("libsystemd.so.0", RTLD_NOW | RTLD_LOCAL);
        if (library == nullptr) return;
        whole = find(library, "sd_bus_open_system", openSystem) && find(library, "sd_bus_match_signal", matchSignal) &&
                find(library, "sd_bus_message_read_basic", readBasic) && find(library, "sd_bus_process", process) &&
                find(library, "sd_bus_get_fd", descriptor) && find(library, "sd_bus_get_events", events) &&
                find(library, "sd_bus_get_timeout", timeout) && find(library, "sd_bus_flush_close_unref", close);
    }

    template <class Function>
    static bool find(void *library, const char *name, Function &function) {
        function = reinterpret_cast<Function>(dlsym(library, name));
        return function != nullptr;
    }
};

const BusLibrary &busLibrary() {
    static const BusLibrary library;
    return library;
}

}  // namespace

bool LoginManager::connect() {
    const BusLibrary &library = busLibrary();
    if (bus_ != nullptr) return true;
    if (!library.whole || library.openSystem(&bus_) < 0) {
        bus_ = nullptr;
        return false;
    }
    const bool listening = library.matchSignal(bus_, nullptr, "org.freedesktop.login1", "/org/freedesktop/login1",
                                               "org.freedesktop.login1.Manager", "PrepareForSleep", onPrepareForSleep, this) >= 0;
    if (!listening) disconnect();
    return listening;
}

void LoginManager::disconnect() {
    if (bus_ != nullptr) busLibrary().close(bus_);
    bus_ = nullptr;
}

bool LoginManager::process() {
    int more = 1;
    while (bus_ != nullptr && more > 0) more = busLibrary().process(bus_, nullptr);
    if (more < 0) disconnect();
    return bus_ != nullptr;
}

pollfd LoginManager::waitFor(int &milliseconds) const {
    const BusLibrary &library = busLibrary();
    uint64_t deadline = UINT64_MAX;  // microseconds of the monotonic clock
    milliseconds = -1;
    if (library.timeout(bus_, &deadline) >= 0 && deadline != UINT64_MAX) {
        const int64_t left = static_cast<int64_t>(deadline / 1000) - performanceNanoseconds() / 1000000 + 1;
        milliseconds = static_cast<int>(std::clamp<int64_t>(left, 0, INT_MAX));
    }
    return {library.descriptor(bus_), static_cast<short>(std::max(library.events(bus_), 0)), 0};
}

int LoginManager::onPrepareForSleep(sd_bus_message *message, void *self, void *) {
    int goingToSleep = 0;
    if (busLibrary().readBasic(message, 'b', &goingToSleep) <= 0) return 0;
    static_cast<LoginManager *>(self)->listener_.powerChanged(goingToSleep != 0 ? PowerEvent::suspend : PowerEvent::resume);
    return 0;
}

}  // namespace vxcomn
