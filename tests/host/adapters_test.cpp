// SPDX-License-Identifier: MIT
#include "host/adapters.h"

#include <doctest/doctest.h>

#include <bit>
#include <cmath>
#include <limits>
#include <random>

#include "host/kernels.h"
#include "tests/support/host_instance.h"
#include "tests/support/instruction_sets.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

// The conversions written out plainly: the judges.
int32_t plainSample(float x) {
    volatile float scaled = x * 8388608.0F;
    const float value = scaled;
    // What no 32-bit integer holds, or no number, becomes the lowest.
    const bool fits = value >= -2147483648.0F && value < 2147483648.0F;
    const int32_t v = fits ? static_cast<int32_t>(value) : std::numeric_limits<int32_t>::min();
    return v < -8388608 ? -8388608 : v > 8388607 ? 8388607 : v;
}
int32_t plainWord(float x, int shift) {
    return static_cast<int32_t>(static_cast<uint32_t>(plainSample(x)) << shift);
}
float plainBack(int32_t word) {
    return static_cast<float>(word >> 8) * 1.1920929e-7F;
}

HostInstance::Options fixedPoint(const char *platform = "HiFi2") {
    HostInstance::Options options;
    options.platform = platform;
    return options;
}

// One sample through the fixed-point path of an engine that leaves its words alone.
float throughEngine(float sample, int32_t *word = nullptr) {
    HostInstance host(fixedPoint());
    host.setFormat(formatOf(0x3, 4));
    if (word != nullptr) {
        host.engine().onProcess = [word](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *) {
            *word = reinterpret_cast<int32_t **>(buffers->channels)[0][0];
        };
    }
    Block block(16);
    block.slot(0)[0] = sample;
    host.process(block, formatOf(0x3, 4), formatOf(0x3, 4));
    return block.slot(0)[0];
}

}  // namespace

TEST_CASE("conversions to words and back have the bits of the plain formulas, on every instruction set and at every length") {
    std::mt19937 random(11);
    std::vector<float> samples(600);
    for (size_t i = 0; i < samples.size(); ++i) {
        samples[i] = i % 3 == 0 ? std::bit_cast<float>(static_cast<uint32_t>(random()))
                                : static_cast<float>(static_cast<int32_t>(random())) * 0x1p-30F;
    }
    const float special[] = {0.0F,
                             -0.0F,
                             1.0F,
                             -1.0F,
                             0.99999994F,
                             -0.99999994F,
                             255.99998F,
                             256.0F,
                             -256.0F,
                             300.0F,
                             1e30F,
                             std::numeric_limits<float>::infinity(),
                             -std::numeric_limits<float>::infinity(),
                             std::numeric_limits<float>::quiet_NaN(),
                             1e-40F};
    std::copy(std::begin(special), std::end(special), samples.begin() + 3);
    forEachInstructionSet([&](InstructionSet set) {
        CAPTURE(instructionSetName(set));
        const HostKernels &kernels = hostKernelsOf(set);
        int different = 0;
        for (int count = 0; count <= 512; ++count) {
            for (const int offset : {0, 1, 3}) {
                const float *from = samples.data() + offset;
                std::vector<int32_t> words(516, 77);
                std::vector<int32_t> recordWords(516, 77);
                std::vector<float> back(516, 7.0F);
                kernels.toProcessWords(from, words.data() + offset, count);
                kernels.toRecordWords(from, recordWords.data(), count);
                kernels.fromProcessWords(words.data() + offset, back.data(), count);
                for (int i = 0; i < count; ++i) {
                    if (words[static_cast<size_t>(i + offset)] != plainWord(from[i], 8)) ++different;
                    if (recordWords[static_cast<size_t>(i)] != plainWord(from[i], 6)) ++different;
                    if (std::bit_cast<uint32_t>(back[static_cast<size_t>(i)]) !=
                        std::bit_cast<uint32_t>(plainBack(plainWord(from[i], 8)))) {
                        ++different;
                    }
                }
                if (words[static_cast<size_t>(count + offset)] != 77 || back[static_cast<size_t>(count)] != 7.0F) ++different;
                kernels.zero(back.data(), count);
                for (int i = 0; i < count; ++i) different += back[static_cast<size_t>(i)] != 0.0F;
                different += back[static_cast<size_t>(count)] != 7.0F;
            }
        }
        CHECK_EQ(different, 0);
    });
}

TEST_CASE("a sample of exactly 1.0 clips to 8388607 on the way in") {
    int32_t word = 0;
    CHECK_EQ(throughEngine(1.0F, &word), 0.99999988F);
    CHECK_EQ(word, 0x7FFFFF00);
}

TEST_CASE("a sample of -1.0 keeps its full scale") {
    int32_t word = 0;
    CHECK_EQ(throughEngine(-1.0F, &word), -1.0F);
    CHECK_EQ(static_cast<uint32_t>(word), 0x80000000U);
}

TEST_CASE("a sample of 0.5 is the word 0x40000000") {
    int32_t word = 0;
    CHECK_EQ(throughEngine(0.5F, &word), 0.5F);
    CHECK_EQ(word, 0x40000000);
}

TEST_CASE("a sample beyond the range of a 32-bit conversion becomes -8388608 whatever its sign") {
    for (const float sample :
         {256.0F, -256.0F, 1e9F, std::numeric_limits<float>::infinity(), std::numeric_limits<float>::quiet_NaN()}) {
        int32_t word = 0;
        CHECK_EQ(throughEngine(sample, &word), -1.0F);
        CHECK_EQ(static_cast<uint32_t>(word), 0x80000000U);
    }
    int32_t word = 0;
    CHECK_EQ(throughEngine(255.9F, &word), 0.99999988F);
}

TEST_CASE("without an engine function a fixed-point platform quantises to 24 bits: 1e-8 becomes 0") {
    HostInstance host(fixedPoint());
    host.setFormat(formatOf(0x3, 4));
    host.context().engineProcess = nullptr;
    Block block(16, 1e-8F);
    block.slot(1)[0] = 0.3F;
    host.process(block, formatOf(0x3, 4), formatOf(0x3, 4));
    CHECK_EQ(block.slot(0)[0], 0.0F);
    CHECK_EQ(block.slot(1)[0], plainBack(plainWord(0.3F, 8)));
}

TEST_CASE("a zero-channel format calls the engine and converts nothing") {
    HostInstance host(fixedPoint());
    int called = 0;
    host.engine().onProcess = [&called](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ++called; };
    Block block(16, 1e-8F);
    IOFormat none = formatOf(0, 4);
    fixedPointProcess(host.handle, &block.buffers, &none, &none);
    CHECK_EQ(called, 1);
    CHECK_EQ(block.slot(0)[0], 1e-8F);
}

TEST_CASE("pass-through with a null engine entry does nothing and leaves the samples as they are") {
    HostInstance host;
    host.context().engineProcess = nullptr;
    host.context().engineRecord = nullptr;
    Block block;
    block.fillNoise(2);
    const Block before = block;
    IOFormat format = formatOf(0x3, 480);
    passThroughProcess(host.handle, &block.buffers, &format, &format);
    passThroughRecord(host.handle, &block.buffers, &format);
    CHECK(block == before);
}

TEST_CASE("the fixed-point engine sees the caller's record with the process bank for its buffers") {
    for (const char *platform : {"HiFi2", "iSST", "AIC326x"}) {
        HostInstance host(fixedPoint(platform));
        host.setFormat(formatOf(0x3, 4));
        ProcessBuffers seen{};
        host.engine().onProcess = [&seen](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *) {
            seen = *buffers;
            buffers->silent = 5;
            reinterpret_cast<int32_t **>(buffers->channels)[1][2] = 0x20000000;
        };
        Block block(16);
        block.buffers.reserved = 0x1122334455667788U;
        block.buffers.reserved2 = 0xAABBCCDDU;
        block.buffers.silent = 3;
        host.process(block, formatOf(0x3, 4), formatOf(0x3, 4));
        CHECK_EQ(static_cast<void *>(seen.channels), static_cast<void *>(host.context().processFixedPointers));
        CHECK_EQ(seen.reserved, 0x1122334455667788U);
        CHECK_EQ(seen.reserved2, 0xAABBCCDDU);
        CHECK_EQ(seen.silent, 3);
        CHECK_EQ(block.slot(1)[2], 0.25F);
        CHECK_EQ(block.buffers.silent, 0);
    }
}

TEST_CASE("the record side converts into its own bank, hands the engine the process bank and converts nothing back") {
    HostInstance host(fixedPoint());
    void *seen = nullptr;
    host.engine().onRecord = [&seen](VXEngineHandle, ProcessBuffers *buffers, IOFormat *) { seen = buffers->channels; };
    Block block(16, 0.3F);
    IOFormat format = formatOf(0x3, 4);
    fixedPointRecord(host.handle, &block.buffers, &format);
    CHECK_EQ(seen, static_cast<void *>(host.context().processFixedPointers));
    CHECK_EQ(host.context().recordFixedBuffers[1][3], plainWord(0.3F, 6));
    CHECK_EQ(host.context().recordFixedBuffers[2][0], 0);
    CHECK_EQ(block.slot(0)[0], 0.3F);
}

TEST_CASE("more than eight channels or more than 512 frames stay inside the banks") {
    HostInstance host(fixedPoint());
    Block block(1024, 0.5F);
    IOFormat format = formatOf(0x63F, 1000);
    format.channels = 1000;
    fixedPointProcess(host.handle, &block.buffers, &format, &format);
    fixedPointRecord(host.handle, &block.buffers, &format);
    for (int i = 0; i < VX_SLOT_COUNT; ++i) CHECK_EQ(host.context().processFixedPointers[i], host.context().processFixedBuffers[i]);
}
