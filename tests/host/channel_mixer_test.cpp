// SPDX-License-Identifier: MIT
#include "host/channel_mixer.h"

#include <doctest/doctest.h>

#include <bit>
#include <cstring>
#include <random>

#include "host/kernels.h"
#include "tests/host/plain_fold.h"
#include "tests/support/host_instance.h"
#include "tests/support/instruction_sets.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

// The mask of a subset of the eight speakers.
uint32_t maskOf(uint32_t subset) {
    return (subset & 0x3F) | (subset & 0xC0) << 3;
}

void mix(Block &block, uint32_t mask, int frames) {
    IOFormat target = formatOf(mask, frames);
    mixChannels(&block.buffers, nullptr, &target);
}

Block blockOf(std::initializer_list<std::pair<int, float>> slots, int frames = 16) {
    Block block(frames);
    for (const auto &[slot, value] : slots) std::fill_n(block.slot(slot), frames, value);
    return block;
}

}  // namespace

TEST_CASE("all 256 speaker subsets at all block lengths give the bits of the plain rules, on every instruction set") {
    forEachInstructionSet([](InstructionSet set) {
        CAPTURE(instructionSetName(set));
        selectHostKernels(set);
        int different = 0;
        for (uint32_t subset = 0; subset < 256; ++subset) {
            Block start;
            start.fillNoise(subset + 1);
            Block folded = start;
            plainFold(folded.pointers.data(), maskOf(subset), VX_MAX_FRAMES);
            Block actual = start;
            for (int frames = 0; frames <= VX_MAX_FRAMES; ++frames) {
                actual.storage = start.storage;
                mix(actual, maskOf(subset), frames);
                for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) {
                    const auto bytes = static_cast<size_t>(frames) * sizeof(float);
                    const size_t rest = (VX_MAX_FRAMES - static_cast<size_t>(frames)) * sizeof(float);
                    if (std::memcmp(actual.slot(slot), folded.slot(slot), bytes) != 0) ++different;
                    if (std::memcmp(actual.slot(slot) + frames, start.slot(slot) + frames, rest) != 0) ++different;
                }
            }
        }
        CHECK_EQ(different, 0);
    });
}

TEST_CASE("samples at odd addresses, denormals, infinities and NaNs fold as the plain rules say") {
    forEachInstructionSet([](InstructionSet set) {
        selectHostKernels(set);
        std::mt19937 random(7);
        for (int offset = 0; offset < 4; ++offset) {
            Block expected(256);
            for (float &sample : expected.storage) sample = std::bit_cast<float>(static_cast<uint32_t>(random()));
            Block actual = expected;
            std::array<float *, VX_SLOT_COUNT> there{};
            for (int i = 0; i < VX_SLOT_COUNT; ++i) {
                there[static_cast<size_t>(i)] = expected.slot(i) + offset;
                actual.pointers[static_cast<size_t>(i)] = actual.slot(i) + offset;
            }
            plainFold(there.data(), 0x3, 200);
            mix(actual, 0x3, 200);
            int different = 0;
            for (size_t i = 0; i < actual.storage.size(); ++i) {
                const bool bothNan = actual.storage[i] != actual.storage[i] && expected.storage[i] != expected.storage[i];
                if (!bothNan && std::bit_cast<uint32_t>(actual.storage[i]) != std::bit_cast<uint32_t>(expected.storage[i]))
                    ++different;
            }
            CHECK_EQ(different, 0);
        }
    });
}

TEST_CASE("buffers that are shared between slots fold one rule after the other") {
    forEachInstructionSet([](InstructionSet set) {
        selectHostKernels(set);
        for (uint32_t subset = 0; subset < 256; ++subset) {
            Block expected(100);
            expected.fillNoise(subset);
            Block actual = expected;
            // A host may point all slots that it doesn't use at one buffer; here also two that lie a few samples apart.
            for (const auto &[a, b, shift] : {std::tuple(2, 3, 0), std::tuple(0, 6, 0), std::tuple(1, 7, 5), std::tuple(0, 4, 3)}) {
                std::array<float *, VX_SLOT_COUNT> there = expected.pointers;
                std::array<float *, VX_SLOT_COUNT> here = actual.pointers;
                there[static_cast<size_t>(a)] = there[static_cast<size_t>(b)] + shift;
                here[static_cast<size_t>(a)] = here[static_cast<size_t>(b)] + shift;
                plainFold(there.data(), maskOf(subset), 90);
                IOFormat target = formatOf(maskOf(subset), 90);
                ProcessBuffers buffers{here.data(), 0, 0, 0};
                mixChannels(&buffers, nullptr, &target);
            }
            REQUIRE(actual == expected);
        }
    });
}

TEST_CASE("a mask of 0 with stereo audio yields FL = FL + FR, unscaled, and FR unchanged") {
    Block block = blockOf({{0, 0.75F}, {1, 0.5F}, {2, 0.25F}});
    mix(block, 0, 16);
    CHECK_EQ(block.slot(0)[15], 1.25F);
    CHECK_EQ(block.slot(1)[15], 0.5F);
    CHECK_EQ(block.slot(2)[15], 0.25F);
}

TEST_CASE("a target mask that holds only front left of centre matches no rule and changes nothing") {
    Block block;
    block.fillNoise(3);
    const Block before = block;
    mix(block, 0x40, 512);
    CHECK(block == before);
}

TEST_CASE("a mono target in the centre gains 1.0 from FL = FR = 1.0") {
    Block block(16);
    std::fill_n(block.slot(0), 16, 1.0F);
    std::fill_n(block.slot(1), 16, 1.0F);
    mix(block, 0x4, 16);
    CHECK_EQ(block.slot(2)[0], 1.0F);
    CHECK_EQ(block.slot(2)[15], 1.0F);
}

TEST_CASE("with a stereo target and SL = 1.0, FL gains 0.7083 as f32 exactly") {
    Block block(16);
    std::fill_n(block.slot(6), 16, 1.0F);
    mix(block, 0x3, 16);
    CHECK_EQ(std::bit_cast<uint32_t>(block.slot(0)[7]), 0x3F355326U);
    CHECK_EQ(static_cast<double>(block.slot(0)[7]), doctest::Approx(0.708299994468689).epsilon(1e-15));
    CHECK_EQ(block.slot(6)[7], 1.0F);  // a folded slot keeps its samples
}

TEST_CASE("buffers of speakers in the mask that had no sound stay zero unless a rule adds to them") {
    Block block(16);
    std::fill_n(block.slot(4), 16, 1.0F);
    mix(block, 0x60F, 16);
    CHECK_EQ(block.slot(0)[0], 0.7083F);
    for (const int silent : {1, 2, 3, 6, 7}) CHECK_EQ(block.slot(silent)[0], 0.0F);
}

TEST_CASE("no frames and a negative count of frames change nothing") {
    for (const int frames : {0, -1, -512}) {
        Block block;
        block.fillNoise(9);
        const Block before = block;
        mix(block, 0x3, frames);
        CHECK(block == before);
    }
}

TEST_CASE("the worked masks fold what they are told to") {
    const auto gains = [](uint32_t mask, int from) {
        Block block(16);
        std::fill_n(block.slot(from), 16, 1.0F);
        mix(block, mask, 16);
        std::array<float, VX_SLOT_COUNT> result{};
        for (int i = 0; i < VX_SLOT_COUNT; ++i) result[static_cast<size_t>(i)] = block.slot(i)[0];
        result[static_cast<size_t>(from)] = 0;
        return result;
    };
    using Gains = std::array<float, VX_SLOT_COUNT>;
    const float side = 0.7083F;
    CHECK_EQ(gains(0x3, 2), Gains{0.5F, 0.5F});
    CHECK_EQ(gains(0x3, 3), Gains{0.5F, 0.5F});
    CHECK_EQ(gains(0x4, 3), Gains{0, 0, side});
    CHECK_EQ(gains(0x3F, 6), Gains{side});
    CHECK_EQ(gains(0x3F, 7), Gains{0, side});
    CHECK_EQ(gains(0x33, 2), Gains{0.5F, 0.5F});
    CHECK_EQ(gains(0x8, 2), Gains{0, 0, 0, side});
    CHECK_EQ(gains(0x8, 7), Gains{0, 0, 0, 0.5F});
    for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) CHECK_EQ(gains(0x63F, slot), Gains{});
}

TEST_CASE("the slot tables of mask 3") {
    const IOFormat format = formatOf(3);
    CHECK_EQ(std::to_array(format.channelSlot), std::array<uint8_t, 8>{0, 1, 0, 0, 0, 0, 0, 0});
    CHECK_EQ(std::to_array(format.slotSpeaker), std::array<uint8_t, 8>{1, 2, 0, 0, 0, 0, 0, 0});
}

TEST_CASE("the slot tables of mask 0x60F") {
    const IOFormat format = formatOf(0x60F);
    CHECK_EQ(std::to_array(format.channelSlot), std::array<uint8_t, 8>{0, 1, 2, 3, 6, 7, 0, 0});
    CHECK_EQ(std::to_array(format.slotSpeaker), std::array<uint8_t, 8>{1, 2, 3, 4, 0, 0, 10, 11});
}

TEST_CASE("two mask bits that share a slot leave the later bit's number, and bits beyond the known ones map to slot 0") {
    const IOFormat shared = formatOf(0x1 | 0x40);
    CHECK_EQ(shared.channelSlot[0], 0);
    CHECK_EQ(shared.channelSlot[1], 0);
    CHECK_EQ(shared.slotSpeaker[0], 7);
    const IOFormat high = formatOf(0x80000000U);
    CHECK_EQ(high.channelSlot[0], 0);
    CHECK_EQ(high.slotSpeaker[0], 32);
    const IOFormat all = formatOf(0xFFFFFFFFU);
    CHECK_EQ(std::to_array(all.channelSlot), std::array<uint8_t, 8>{0, 1, 2, 3, 4, 5, 0, 1});
}
