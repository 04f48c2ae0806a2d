// SPDX-License-Identifier: MIT
#include "platform/power_events.h"

#include <doctest/doctest.h>

#include <thread>
#include <vector>

#include "platform/event.h"

using namespace vxcomn;

namespace {

constexpr auto kClass = VX_TEXT("VxcomnTestWindow");

struct Recorder final : PowerListener {
    std::vector<PowerEvent> events;
    std::vector<std::thread::id> threads;
    void powerChanged(PowerEvent event) override {
        events.push_back(event);
        threads.push_back(std::this_thread::get_id());
    }
};

}  // namespace

TEST_CASE("suspend and resume come to the listener in order, on the thread that runs, and closing ends the run") {
    for (int round = 0; round < 20; ++round) {  // the window class stays registered
        Recorder recorder;
        PowerEvents power(recorder);
        Event ready(EventReset::manual);
        PowerEvents::Opened opened{1, 1};
        std::thread runner([&] {
            opened = power.open(kClass);
            ready.set();
            power.run();
        });
        const std::thread::id id = runner.get_id();
        REQUIRE(waitForOne(ready, 20000) == WaitOutcome::signalled);
        CHECK(opened.registered == status::ok);
        CHECK(opened.found == status::ok);
        power.inject(PowerEvent::suspend);
        power.inject(PowerEvent::resume);
        power.inject(PowerEvent::suspend);
        power.close();
        runner.join();
        CHECK(recorder.events == std::vector{PowerEvent::suspend, PowerEvent::resume, PowerEvent::suspend});
        CHECK(recorder.threads == std::vector(3, id));
    }
}

TEST_CASE("one that was closed before it runs does not run") {
    Recorder recorder;
    PowerEvents power(recorder);
    power.open(kClass);
    power.close();
    power.run();
    CHECK(recorder.events.empty());
}
