// SPDX-License-Identifier: MIT
//
// What the block may not do, and that control threads may do anything meanwhile. The engine's objects are linked in here, so that
// an allocation counter of this program sees what they allocate.
#include <doctest/doctest.h>

#include <atomic>
#include <cstdlib>
#include <new>
#include <thread>

#include "engine_rig.h"
#include "engines/sample/engine.h"

namespace {

thread_local bool counting = false;
std::atomic<int> allocations = 0;

void count() {
    if (counting) ++allocations;
}

}  // namespace

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
// The sanitizers' own allocator stays in place and tells. g++ brings the function but not its header.
extern "C" int __sanitizer_install_malloc_and_free_hooks(void (*onMalloc)(const volatile void *, std::size_t),
                                                         void (*onFree)(const volatile void *));
namespace {
[[maybe_unused]] const int installed =
    __sanitizer_install_malloc_and_free_hooks([](const volatile void *, std::size_t) { count(); }, [](const volatile void *) {});
}
#else
namespace {
void *allocate(std::size_t size) noexcept {
    count();
    return std::malloc(size == 0 ? 1 : size);
}
void *allocateOrThrow(std::size_t size) {
    if (void *memory = allocate(size)) return memory;
    throw std::bad_alloc();
}
}  // namespace

// GCC takes a call of free() for a mismatch with a new that it knows by name only.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmismatched-new-delete"
void *operator new(std::size_t size) {
    return allocateOrThrow(size);
}
void *operator new[](std::size_t size) {
    return allocateOrThrow(size);
}
void *operator new(std::size_t size, const std::nothrow_t &) noexcept {
    return allocate(size);
}
void *operator new[](std::size_t size, const std::nothrow_t &) noexcept {
    return allocate(size);
}
void operator delete(void *memory) noexcept {
    std::free(memory);
}
void operator delete[](void *memory) noexcept {
    std::free(memory);
}
void operator delete(void *memory, std::size_t) noexcept {
    std::free(memory);
}
void operator delete[](void *memory, std::size_t) noexcept {
    std::free(memory);
}
void operator delete(void *memory, const std::nothrow_t &) noexcept {
    std::free(memory);
}
void operator delete[](void *memory, const std::nothrow_t &) noexcept {
    std::free(memory);
}
#pragma GCC diagnostic pop
#endif

TEST_CASE("a block allocates nothing, also while it takes over changes") {
    counting = true;
    ::operator delete(::operator new(64));
    counting = false;
    REQUIRE(allocations.exchange(0) == 1);

    auto engine = std::make_unique<sample_engine::Engine>();
    const IOFormat format = makeFormat(kSevenOne, 48000);
    engine->setFormat(format, format);
    Stream stream = testSignal(512, 2.0F);
    std::array<float *, 8> channels = {};
    for (int slot = 0; slot < 8; ++slot) channels[slot] = stream[slot].data();
    for (int round = 0; round < 50; ++round) {
        engine->change([&](sample_engine::Settings &settings) {
            for (int id = 0; id < 4; ++id) settings.components[id].level = (round + id) % 5;
            settings.bands[round % 10].gainDecibels = round % 25 - 12;
            settings.bypass = round % 10 == 9;
            return true;
        });
        if (round % 20 == 10) engine->clear();
        counting = true;
        for (int block = 0; block < 3; ++block) engine->process(channels.data(), 512);
        counting = false;
    }
    CHECK(allocations == 0);
}

TEST_CASE("control threads may set parameters, clear and read while blocks run") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    std::atomic<bool> done = false;
    const auto control = [&](uint32_t seed) {
        std::mt19937 random(seed);
        while (!done) {
            rig.setBass(static_cast<float>(random() % 5));
            rig.setBand(static_cast<int>(random() % 10) + 1, 1, static_cast<float>(random() % 9000 + 50), 1.0F,
                        static_cast<float>(random() % 25) - 12.0F);
            rig.setInputGain(static_cast<float>(random() % 4));
            rig.setBypass(random() % 4 == 0);
            if (random() % 16 == 0) rig.module().clear(rig.handle(), 0);
            std::array<uint8_t, 64> bytes = {};
            rig.module().readWriteData(rig.handle(), 4, 0, nullptr, 0, bytes.data());
            rig.module().onIdle(rig.handle());
        }
    };
    std::thread first(control, 1);
    std::thread second(control, 2);
    const Stream out = rig.run(testSignal(48000 * 4, 0.9F), evenCuts(64));
    done = true;
    first.join();
    second.join();
    for (int slot = 0; slot < 2; ++slot)
        for (const float sample : out[slot]) REQUIRE(std::fabs(sample) <= 1.0F);
}
