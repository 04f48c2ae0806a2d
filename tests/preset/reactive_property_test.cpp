// SPDX-License-Identifier: MIT
//
// A property, its handlers and when they are called.
#include "preset/reactive_property.h"

#include <doctest/doctest.h>

#include <stdexcept>
#include <string>
#include <thread>

#include "platform/text.h"
#include "tests/preset/mock_property_store.h"

using namespace vxcomn;
using vxcomn::testing::MockPropertyStore;

namespace {

// Handlers that write down what they see.
template <class T>
struct Watcher {
    explicit Watcher(StateLock &lock, T value = T()) : property(lock, std::move(value)) {
        property.addChanging(handlerOf<&Watcher::changing>(this));
        property.addChanged(handlerOf<&Watcher::changed>(this));
    }
    void changing() {
        ++changings;
        before = property.get();
    }
    void changed() {
        ++changes;
        after = property.get();
    }

    ReactiveProperty<T> property;
    int changings = 0, changes = 0;
    T before = {}, after = {};
};

struct Calls {
    explicit Calls(StateLock &lock) : property(lock) {}
    void a() { order += 'a'; }
    void b() { order += 'b'; }
    void c() { order += 'c'; }
    PropertyHandler onA() { return handlerOf<&Calls::a>(this); }
    PropertyHandler onB() { return handlerOf<&Calls::b>(this); }
    PropertyHandler onC() { return handlerOf<&Calls::c>(this); }

    ReactiveProperty<int> property;
    std::string order;
};

EngineConfig config(uint32_t size, uint32_t components) {
    EngineConfig record = {};
    record.Size = size;
    record.ComponentCount = components;
    return record;
}

}  // namespace

TEST_CASE("setting a property to its present value fires nothing") {
    StateLock lock;
    Watcher<WideString> watcher(lock, VX_TEXT("Name"));
    watcher.property.set(VX_TEXT("Name"));
    CHECK(watcher.changings == 0);
    CHECK(watcher.changes == 0);
}

TEST_CASE("the changing handlers see the old value, the changed handlers the new one") {
    StateLock lock;
    Watcher<WideString> watcher(lock, VX_TEXT("Old"));
    watcher.property.set(VX_TEXT("New"));
    CHECK(watcher.before == VX_TEXT("Old"));
    CHECK(watcher.after == VX_TEXT("New"));
    CHECK(watcher.changings == 1);
    CHECK(watcher.changes == 1);
}

TEST_CASE("handlers are called in list order, all changing ones before all changed ones") {
    StateLock lock;
    Calls calls(lock);
    calls.property.addChanged(calls.onC());
    calls.property.addChanging(calls.onA());
    calls.property.addChanging(calls.onB());
    calls.property.addChanged(calls.onA());
    calls.property.set(1);
    CHECK(calls.order == "abca");
}

TEST_CASE("a handler that was added twice is called twice, and removing takes both") {
    StateLock lock;
    Calls calls(lock);
    calls.property.addChanged(calls.onA());
    calls.property.addChanged(calls.onB());
    calls.property.addChanged(calls.onA());
    calls.property.set(1);
    CHECK(calls.order == "aba");
    calls.property.removeChanged(calls.onA());
    calls.property.set(2);
    CHECK(calls.order == "abab");
}

TEST_CASE("removing looks at the object and at what is called") {
    StateLock lock;
    Calls calls(lock), other(lock);
    calls.property.addChanged(calls.onA());
    calls.property.addChanged(other.onA());
    calls.property.removeChanged(calls.onB());
    calls.property.removeChanging(calls.onA());
    calls.property.removeChanged(other.onA());
    calls.property.set(1);
    CHECK(calls.order == "a");
    CHECK(other.order.empty());
}

TEST_CASE("a value can be assigned without a word to anybody") {
    StateLock lock;
    Watcher<int> watcher(lock, 1);
    watcher.property.setSilently(2);
    CHECK(watcher.property.get() == 2);
    CHECK(watcher.changes == 0);
}

TEST_CASE("texts compare exactly, with their case") {
    StateLock lock;
    Watcher<WideString> watcher(lock, VX_TEXT("EFX"));
    watcher.property.set(VX_TEXT("efx"));
    CHECK(watcher.changes == 1);
}

TEST_CASE("engine records compare by their size and the bytes that it counts") {
    StateLock lock;
    Watcher<EngineConfig> watcher(lock, config(8, 1));
    watcher.property.set(config(8, 2));  // ComponentCount lies behind the eight bytes
    CHECK(watcher.changes == 0);
    watcher.property.set(config(12, 1));
    CHECK(watcher.changes == 1);
    watcher.property.set(config(12, 2));
    CHECK(watcher.changes == 2);
}

TEST_CASE("an engine record that counts more than it has is compared as a whole and no further") {
    StateLock lock;
    EngineConfig last = config(0xFFFFFFFF, 1);
    Watcher<EngineConfig> watcher(lock, last);
    watcher.property.set(last);
    CHECK(watcher.changes == 0);
    last.Components[63].Position = 1;
    watcher.property.set(last);
    CHECK(watcher.changes == 1);
}

TEST_CASE("GUIDs and numbers compare bit by bit") {
    StateLock lock;
    Watcher<GUID> guid(lock);
    GUID last = {};
    guid.property.set(last);
    CHECK(guid.changes == 0);
    last.Data4[7] = 1;
    guid.property.set(last);
    CHECK(guid.changes == 1);
    Watcher<uint64_t> number(lock, 0);
    number.property.set(uint64_t{1} << 63);
    CHECK(number.changes == 1);
}

TEST_CASE("an interface is compared by address, and the property holds a reference to the one that stands") {
    StateLock lock;
    MockPropertyStore first, second;
    {
        Watcher<ComRef<IPropertyStore>> watcher(lock);
        watcher.property.set(first.ref());
        watcher.before = watcher.after = {};
        CHECK(first.references == 2);
        watcher.property.set(first.ref());
        CHECK(watcher.changes == 1);
        CHECK(first.references == 2);
        watcher.property.set(second.ref());
        watcher.before = watcher.after = {};
        CHECK(watcher.changes == 2);
        CHECK(first.references == 1);
        CHECK(second.references == 2);
    }
    CHECK(second.references == 1);
}

TEST_CASE("a handler may set the same and other properties") {
    struct Chain {
        explicit Chain(StateLock &lock) : first(lock), second(lock) { first.addChanged(handlerOf<&Chain::firstChanged>(this)); }
        void firstChanged() {
            if (first.get() < 3) first.set(first.get() + 1);
            second.set(first.get() * 10);
        }
        ReactiveProperty<int> first, second;
    };
    StateLock lock;
    Chain chain(lock);
    chain.first.set(1);
    CHECK(chain.first.get() == 3);
    CHECK(chain.second.get() == 30);
}

TEST_CASE("a handler may take itself and others off the list, and add to it") {
    struct Editing {
        explicit Editing(StateLock &lock) : property(lock) {
            property.addChanged(handlerOf<&Editing::first>(this));
            property.addChanged(handlerOf<&Editing::second>(this));
        }
        void first() {
            order += '1';
            property.removeChanged(handlerOf<&Editing::second>(this));
            property.addChanged(handlerOf<&Editing::third>(this));
        }
        void second() { order += '2'; }
        void third() { order += '3'; }
        ReactiveProperty<int> property;
        std::string order;
    };
    StateLock lock;
    Editing editing(lock);
    editing.property.set(1);
    CHECK(editing.order == "13");
}

TEST_CASE("an exception from a handler leaves the lock free") {
    struct Throwing {
        explicit Throwing(StateLock &lock) : property(lock) { property.addChanging(handlerOf<&Throwing::refuse>(this)); }
        void refuse() { throw std::runtime_error("no"); }
        ReactiveProperty<int> property;
    };
    StateLock lock;
    Throwing throwing(lock);
    CHECK_THROWS_AS(throwing.property.set(1), std::runtime_error);
    bool taken = false;
    std::thread([&] {
        taken = lock.try_lock();
        if (taken) lock.unlock();
    }).join();
    CHECK(taken);
    CHECK(throwing.property.get() == 0);
}

TEST_CASE("threads that set one property take turns, handlers included") {
    struct Counting {
        explicit Counting(StateLock &lock) : property(lock) {
            property.addChanging(handlerOf<&Counting::enter>(this));
            property.addChanged(handlerOf<&Counting::leave>(this));
        }
        void enter() { overlapped = overlapped || inside++ != 0; }
        void leave() { --inside; }
        ReactiveProperty<int> property;
        int inside = 0;
        bool overlapped = false;
    };
    StateLock lock;
    Counting counting(lock);
    std::vector<std::thread> threads;
    for (int thread = 1; thread <= 4; ++thread) {
        threads.emplace_back([&counting, thread] {
            for (int round = 0; round < 500; ++round) counting.property.set(round * 10 + thread);
        });
    }
    for (std::thread &thread : threads) thread.join();
    CHECK_FALSE(counting.overlapped);
    CHECK(counting.inside == 0);
}
