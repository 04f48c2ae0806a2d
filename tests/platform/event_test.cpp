// SPDX-License-Identifier: MIT
#include "platform/event.h"

#include <doctest/doctest.h>

#include <atomic>
#include <thread>
#include <vector>

using namespace vxcomn;

TEST_CASE("a manual event stays set until it is reset and an automatic one lets one wait through") {
    Event manual(EventReset::manual), automatic(EventReset::automatic);
    CHECK(waitForOne(manual, 0) == WaitOutcome::timedOut);
    manual.set();
    CHECK(waitForOne(manual, 0) == WaitOutcome::signalled);
    CHECK(waitForOne(manual, kForever) == WaitOutcome::signalled);
    manual.reset();
    CHECK(waitForOne(manual, 1) == WaitOutcome::timedOut);

    automatic.set();
    automatic.set();
    CHECK(waitForOne(automatic, kForever) == WaitOutcome::signalled);
    CHECK(waitForOne(automatic, 1) == WaitOutcome::timedOut);
    automatic.set();
    automatic.reset();
    CHECK(waitForOne(automatic, 0) == WaitOutcome::timedOut);
}

TEST_CASE("an event may begin as set") {
    const Event manual(EventReset::manual, true), automatic(EventReset::automatic, true);
    CHECK(manual.handle() != nullptr);
    CHECK(waitForOne(manual, 0) == WaitOutcome::signalled);
    CHECK(waitForOne(automatic, 0) == WaitOutcome::signalled);
    CHECK(waitForOne(automatic, 0) == WaitOutcome::timedOut);
}

TEST_CASE("a wait for several tells the first one that is set and uses up that one alone") {
    Event a(EventReset::automatic), b(EventReset::automatic), c(EventReset::automatic);
    CHECK(waitForAny({&a, &b, &c}, 0).outcome == WaitOutcome::timedOut);
    c.set();
    b.set();
    WaitAnswer answer = waitForAny({&a, &b, &c}, 0);
    CHECK(answer.outcome == WaitOutcome::signalled);
    CHECK(answer.index == 1);
    answer = waitForAny({&a, &b, &c}, 0);
    CHECK(answer.index == 2);
    CHECK(waitForAny({&a, &b, &c}, 2).outcome == WaitOutcome::timedOut);
}

TEST_CASE("a wait for nothing, for too much, and for an event that is no more fails") {
    Event event(EventReset::manual, true);
    CHECK(waitForAny(std::span<const Waitable *const>(), 0).outcome == WaitOutcome::failed);
    const std::vector<const Waitable *> many(kMaxWaitObjects + 1, &event);
    CHECK(waitForAny(many, 0).outcome == WaitOutcome::failed);
    const Event moved = std::move(event);
    CHECK(waitForOne(event, 0) == WaitOutcome::failed);
    CHECK(waitForOne(moved, 0) == WaitOutcome::signalled);
}

TEST_CASE("sixty-four events can be waited for at once") {
    std::vector<Event> events;
    std::vector<const Waitable *> all;
    for (size_t i = 0; i < kMaxWaitObjects; ++i) events.emplace_back(EventReset::automatic);
    for (const Event &event : events) all.push_back(&event);
    for (const size_t which : {size_t{0}, size_t{31}, size_t{63}}) {
        std::thread setter([&] { events[which].set(); });
        const WaitAnswer answer = waitForAny(all, kForever);
        setter.join();
        CHECK(answer.outcome == WaitOutcome::signalled);
        CHECK(answer.index == which);
    }
}

TEST_CASE("a thread asleep is woken by each of its events, and two threads pass a ball without losing it") {
    Event there(EventReset::automatic), back(EventReset::automatic), quit(EventReset::manual);
    std::atomic<int> caught{0};
    std::thread other([&] {
        for (;;) {
            const WaitAnswer answer = waitForAny({&quit, &there}, kForever);
            if (answer.outcome != WaitOutcome::signalled || answer.index == 0) return;
            ++caught;
            back.set();
        }
    });
    int returned = 0;
    for (int i = 0; i < 2000; ++i) {
        there.set();
        returned += waitForOne(back, 10000) == WaitOutcome::signalled ? 1 : 0;
    }
    quit.set();
    other.join();
    CHECK(caught == 2000);
    CHECK(returned == 2000);
}

TEST_CASE("a manual event lets all threads through and an automatic one wakes one for each time it is set") {
    Event gate(EventReset::manual), ticket(EventReset::automatic), used(EventReset::automatic);
    std::atomic<int> passed{0};
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            if (waitForOne(gate, kForever) != WaitOutcome::signalled) return;
            if (waitForOne(ticket, kForever) != WaitOutcome::signalled) return;
            ++passed;
            used.set();
        });
    }
    gate.set();
    for (int i = 1; i <= 4; ++i) {
        ticket.set();
        CHECK(waitForOne(used, 10000) == WaitOutcome::signalled);
        CHECK(passed == i);
    }
    for (std::thread &thread : threads) thread.join();
}
