// SPDX-License-Identifier: MIT
//
// What the engine does with parameter data, good and bad.
#include <doctest/doctest.h>

#include <limits>

#include "engine_rig.h"

TEST_CASE("a parameter returns the bytes that it read") {
    EngineRig rig;
    CHECK(rig.setBytes(-1, -2, {1}) == 1);
    CHECK(rig.setBytes(-1, -18, {0, 9, 9}) == 1);
    CHECK(rig.setBytes(-1, -29, {1}) == 1);
    CHECK(rig.setBytes(-1, -30, {1}) == 1);
    CHECK(rig.setFloat(-1, -12, 1.0F) == 4);
    for (int component = 0; component < 6; ++component) CHECK(rig.setBytes(component, -6, {1}) == 1);
    for (int component = 0; component < 4; ++component) CHECK(rig.setFloat(component, -12, 0.5F) == 4);
    CHECK(rig.setBytes(5, 115, {1}) == 1);
    for (int band = 1; band <= 10; ++band) CHECK(rig.setBand(band, 1, 100.0F, 1.0F, 3.0F) == 13);
}

TEST_CASE("unknown parameters, short data and numbers that are none are refused and change nothing") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    constexpr float nan = std::numeric_limits<float>::quiet_NaN();
    constexpr float infinity = std::numeric_limits<float>::infinity();
    for (int component = 0; component < 4; ++component) {
        for (const float value : {nan, infinity, -infinity}) CHECK(rig.setFloat(component, -12, value) == 0);
        CHECK(rig.setBytes(component, -12, {0, 0, 0}) == 0);
        CHECK(rig.setBytes(component, -12, {}) == 0);
    }
    for (const float value : {nan, infinity}) {
        CHECK(rig.setBand(6, 1, value, 1.0F, 6.0F) == 0);
        CHECK(rig.setBand(6, 1, 1000.0F, value, 6.0F) == 0);
        CHECK(rig.setBand(6, 1, 1000.0F, 1.0F, value) == 0);
        rig.setInputGain(value);
    }
    for (std::size_t size = 0; size < 13; ++size) CHECK(rig.setBytes(5, 122, std::vector<uint8_t>(size, 0x40)) == 0);
    CHECK(rig.setBytes(5, 116, std::vector<uint8_t>(13, 1)) == 0);
    CHECK(rig.setBytes(5, 127, std::vector<uint8_t>(13, 1)) == 0);
    CHECK(rig.setFloat(4, -12, 1.0F) == 0);
    CHECK(rig.setFloat(5, -12, 1.0F) == 0);
    CHECK(rig.setFloat(6, -12, 1.0F) == 0);
    CHECK(rig.setFloat(-2, -12, 1.0F) == 0);
    CHECK(rig.setBytes(3, -2, {0}) == 0);
    CHECK(rig.setBytes(-1, -6, {0}) == 0);
    CHECK(rig.setBytes(-1, -2, {}) == 0);
    CHECK(rig.module().setParameter(rig.handle(), 3, -12, 0, nullptr, 4) == 0);
    const Stream in = testSignal(4096, 0.5F);
    CHECK(sameBits(in, rig.run(in)));
}

TEST_CASE("a slider's whole range is heard: from all but nothing to a lift beyond 9 dB") {
    const auto lift = [](int component, float gain, double frequency) {
        EngineRig rig;
        rig.setFormat(kStereo, 48000);
        rig.setFloat(component, -12, gain);
        const Stream in = sine(48000, frequency, 48000.0, 0.05);
        return decibels(amplitudeAt(rig.run(in)[0], frequency, 48000.0) / 0.05);
    };
    // The sliders' ends are -48 and +12 dB, for bass -54 and +6 dB.
    CHECK(lift(0, 0.00398107F, 2000.0) < 0.05);
    CHECK(lift(0, 3.98107F, 2000.0) > 13.0);
    CHECK(lift(2, 0.00398107F, 18000.0) < 0.05);
    CHECK(lift(2, 3.98107F, 18000.0) > 13.0);
    CHECK(lift(3, 0.00199526F, 25.0) < 0.05);
    CHECK(lift(3, 1.99526F, 25.0) > 9.0);
}

TEST_CASE("gains out of range are held to 0 to 16") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    const Stream in = testSignal(2000, 0.01F);
    rig.setOutputGain(1e30F);
    const Stream loud = rig.run(in);
    rig.setOutputGain(16.0F);
    rig.module().clear(rig.handle(), 0);
    CHECK(sameBits(loud, rig.run(in)));
    rig.setOutputGain(-5.0F);
    rig.module().clear(rig.handle(), 0);
    const Stream nothing = rig.run(in);
    for (const float sample : nothing[0]) REQUIRE(sample == 0.0F);
}

TEST_CASE("any ids, sizes and bytes leave the engine running, finite and bounded") {
    std::mt19937 random(20240607);
    EngineRig rig;
    rig.setFormat(kSevenOne, 48000);
    const Stream in = testSignal(512, 1.0F);
    std::vector<uint8_t> exact;
    for (int round = 0; round < 4000; ++round) {
        const int component = static_cast<int>(random() % 10) - 3;
        const int parameter = static_cast<int>(random() % 200) - 64;
        // An allocation of just this size, so that the address sanitizer sees a read behind it.
        exact = std::vector<uint8_t>(random() % 16);
        exact.shrink_to_fit();
        for (uint8_t &byte : exact) byte = static_cast<uint8_t>(random());
        rig.module().setParameter(rig.handle(), component, parameter, random(), exact.data(), static_cast<uint32_t>(exact.size()));
        if (random() % 8 == 0)
            rig.module().setParameter(rig.handle(), static_cast<int>(random()), static_cast<int>(random()), 0, exact.data(),
                                      static_cast<uint32_t>(exact.size()));
        if (random() % 16 == 0)
            rig.module().createComponent(rig.handle(), random(), static_cast<int>(random() % 12) - 3, random(), random());
        if (random() % 16 == 0) rig.module().disposeComponent(rig.handle(), random(), random() % 12);
        if (random() % 64 == 0) rig.module().clear(rig.handle(), random());
        if (random() % 16 == 0) {
            rig.setPower(true);
            rig.setBypass(false);
        }
        for (int slot = 0; slot < 8; ++slot) std::copy(in[slot].begin(), in[slot].end(), rig.buffer(slot).begin());
        rig.block(static_cast<int>(random() % 513));
        for (int slot = 0; slot < 8; ++slot)
            for (const float sample : rig.buffer(slot)) REQUIRE(std::fabs(sample) <= 1.0F);
    }
}
