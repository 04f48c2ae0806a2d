// SPDX-License-Identifier: MIT
//
// Suspend and resume from a login manager of the test's own, on a bus of its own.
#include <doctest/doctest.h>

#include <dlfcn.h>
#include <unistd.h>

#include "platform/power_events.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;

namespace {

struct Speaker final : PowerListener {
    void powerChanged(PowerEvent event) override { test::sayLine(event == PowerEvent::suspend ? "suspend" : "resume"); }
};

// Says what it is told; runs until it is killed.
const test::Helper listener("listen-to-power", [](const std::vector<std::string> &) {
    Speaker speaker;
    PowerEvents power(speaker);
    power.open(VX_TEXT(""));
    test::sayLine("ready");
    power.run();
    return 0;
});

// Owns the login manager's name, and announces what it is given, line by line.
const test::Helper manager("announce-sleep", [](const std::vector<std::string> &) {
    void *library = dlopen("libsystemd.so.0", RTLD_NOW);
    if (library == nullptr) return 1;
    const auto openSystem = reinterpret_cast<int (*)(void **)>(dlsym(library, "sd_bus_open_system"));
    const auto requestName = reinterpret_cast<int (*)(void *, const char *, uint64_t)>(dlsym(library, "sd_bus_request_name"));
    const auto emitSignal = reinterpret_cast<int (*)(void *, const char *, const char *, const char *, const char *, ...)>(
        dlsym(library, "sd_bus_emit_signal"));
    const auto flush = reinterpret_cast<int (*)(void *)>(dlsym(library, "sd_bus_flush"));
    void *bus = nullptr;
    if (openSystem(&bus) < 0 || requestName(bus, "org.freedesktop.login1", 0) < 0) return 2;
    test::sayLine("ready");
    for (int c = std::getchar(); c != EOF; c = std::getchar()) {
        if (c != '0' && c != '1') continue;
        if (emitSignal(bus, "/org/freedesktop/login1", "org.freedesktop.login1.Manager", "PrepareForSleep", "b", c - '0') < 0)
            return 3;
        flush(bus);
    }
    return 0;
});

}  // namespace

TEST_CASE("the login manager's announcement of sleep arrives as suspend and its end as resume") {
    if (access("/usr/bin/dbus-daemon", X_OK) != 0 || dlopen("libsystemd.so.0", RTLD_NOW) == nullptr) {
        MESSAGE("skipped: this machine has no dbus-daemon, or no libsystemd");
        return;
    }
    test::Process daemon("/usr/bin/dbus-daemon", {"--session", "--nofork", "--nopidfile", "--print-address=1"});
    const auto address = daemon.readLine();
    REQUIRE(address);
    const test::Environment bus = {{"DBUS_SYSTEM_BUS_ADDRESS", *address}};
    test::Process listening = test::startHelper("listen-to-power", {}, bus);
    REQUIRE(listening.readLine().value_or("") == "ready");
    test::Process announcing = test::startHelper("announce-sleep", {}, bus);
    REQUIRE(announcing.readLine().value_or("") == "ready");
    announcing.write("1\n0\n1\n");
    CHECK(listening.readLine().value_or("") == "suspend");
    CHECK(listening.readLine().value_or("") == "resume");
    CHECK(listening.readLine().value_or("") == "suspend");
}
