// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include <cstring>

#include "tests/support/host_instance.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Calls = std::vector<std::string>;

uint32_t set(const HostInstance &host, int32_t component, int32_t id, std::vector<uint8_t> data) {
    const auto size = static_cast<uint32_t>(data.size());
    data.push_back(0);  // one byte is always readable
    return VXDSPAPI_SetParameter(host.handle, component, id, 0, data.data(), size);
}

template <class T>
void append(std::vector<uint8_t> &data, T value) {
    const auto *bytes = reinterpret_cast<const uint8_t *>(&value);
    data.insert(data.end(), bytes, bytes + sizeof value);
}

// A FIR load: count, optional channel, coefficients.
std::vector<uint8_t> firLoad(uint16_t count, int channel = -1, float first = 1.0F) {
    std::vector<uint8_t> data;
    append(data, count);
    if (channel >= 0) append(data, static_cast<uint16_t>(channel));
    for (int i = 0; i < count; ++i) append(data, i == 0 ? first : 0.0F);
    return data;
}

}  // namespace

TEST_CASE("-6 for a component with no iSST module loaded sends one -6 to the main engine and a -29 and a -30 of 0") {
    HostInstance host;
    host.engine().calls.clear();
    CHECK_EQ(set(host, 4, -6, {7}), 1);
    CHECK_EQ(host.engine().calls,
             Calls{"SetParameter(4, -6, 0, [01])", "SetParameter(-1, -29, 0, [00])", "SetParameter(-1, -30, 0, [00])"});
    CHECK_EQ(host.context().componentEnable[4], 1);
}

TEST_CASE("-26 returns 1, but 0 at host type 3 without a module, and runs all the same") {
    {
        HostInstance host;
        CHECK_EQ(set(host, 4, -26, {1}), 1);
        CHECK_EQ(host.context().componentOnISST[4], 1);
    }
    HostInstance::Options options;
    options.hostType = 3;
    HostInstance host(options);
    host.engine().calls.clear();
    CHECK_EQ(set(host, 4, -26, {1}), 0);
    CHECK_EQ(host.context().componentOnISST[4], 1);
    CHECK_EQ(host.engine().calls.size(), 3);
}

TEST_CASE("ids that are not the host's go to the engine, and its result comes back") {
    HostInstance host;
    host.engine().parameterResult = 42;
    host.engine().calls.clear();
    CHECK_EQ(set(host, 3, -12, {0, 0, 0x80, 0x3F}), 42);
    CHECK_EQ(set(host, -1, -2, {1}), 42);
    CHECK_EQ(set(host, -1, -20, {1}), 42);
    CHECK_EQ(set(host, 5, 117, {}), 42);
    CHECK_EQ(host.engine().calls, Calls{"SetParameter(3, -12, 0, [0000803F])", "SetParameter(-1, -2, 0, [01])",
                                        "SetParameter(-1, -20, 0, [01])", "SetParameter(5, 117, 0, [])"});
}

TEST_CASE("a context that isn't initialised takes no parameter") {
    HostInstance host;
    host.engine().calls.clear();
    host.context().initialised = 0;
    CHECK_EQ(set(host, 1, -6, {1}), 0);
    CHECK_EQ(set(host, 3, -12, {1}), 0);
    CHECK_EQ(host.engine().calls, Calls{});
    host.context().initialised = 1;
}

TEST_CASE("a -16 whose count is 4097 returns 0 with nothing changed") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    CHECK_EQ(set(host, 0, -16, firLoad(4097)), 0);
    CHECK_EQ(host.context().processFirLength, 128);
    CHECK_EQ(host.context().processFir.tapCount, 32);
    CHECK_EQ(host.context().processFirBusy, 0);
}

TEST_CASE("a -16 loads the process filter and asks for a cleared overlap when its length changes") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    host.context().processFirResetPending = 0;
    CHECK_EQ(set(host, 0, -16, firLoad(64, -1, 0.5F)), 2 + 64 * 4);
    CHECK_EQ(host.context().processFirLength, 64);
    CHECK_EQ(host.context().processFirCoefficients[0], 0.5F);
    CHECK_EQ(host.context().processFir.tapCount, 64);
    CHECK_EQ(host.context().processFir.sampleRate, 48000);
    CHECK_EQ(host.context().processFirResetPending, 1);
    CHECK_EQ(host.context().processFirBusy, 0);
    host.context().processFirResetPending = 0;
    CHECK_EQ(set(host, 0, -16, firLoad(64, -1, 0.25F)), 2 + 64 * 4);
    CHECK_EQ(host.context().processFirResetPending, 0);
    CHECK_EQ(host.context().processFirCoefficients[0], 0.25F);
}

TEST_CASE("a -14 of exactly count x 4 + 2 bytes addresses channel 0; two more bytes hold a channel") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    CHECK_EQ(set(host, 0, -14, firLoad(16)), 2 + 16 * 4);
    CHECK_EQ(host.context().recordFirLength[0], 16);
    CHECK_EQ(set(host, 0, -14, firLoad(17, 3)), 4 + 17 * 4);
    CHECK_EQ(host.context().recordFirLength[3], 17);
    CHECK_EQ(host.context().recordFir[3].tapCount, 17);
    CHECK_EQ(host.context().recordFirLength[1], 128);
    CHECK_EQ(host.context().recordFirBusy[3], 0);
}

TEST_CASE("enables of filters: -15 for the process side, -13 with an optional channel") {
    HostInstance host;
    CHECK_EQ(set(host, 0, -15, {2}), 1);
    CHECK_EQ(host.context().processFirEnable, 1);
    CHECK_EQ(set(host, 0, -15, {0}), 1);
    CHECK_EQ(host.context().processFirEnable, 0);
    CHECK_EQ(set(host, 0, -13, {1}), 1);
    CHECK_EQ(host.context().recordFirEnable[0], 1);
    CHECK_EQ(set(host, 0, -13, {1, 2, 0}), 3);
    CHECK_EQ(host.context().recordFirEnable[2], 1);
}

TEST_CASE("-17 switches single-channel pink noise, asks for a cleared overlap and lowers the process stop") {
    HostInstance host;
    host.context().processFirResetPending = 0;
    host.context().processStop = 1;
    CHECK_EQ(set(host, 0, -17, {9}), 1);
    CHECK_EQ(host.context().singleChannelPinkNoise, 1);
    CHECK_EQ(host.context().processFirResetPending, 1);
    CHECK_EQ(host.context().processStop, 0);
    CHECK_EQ(set(host, 0, -17, {0}), 1);
    CHECK_EQ(host.context().singleChannelPinkNoise, 0);
}

TEST_CASE("component and channel numbers beyond the tables, and data that ends too early, change nothing") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    const LibraryContext &context = host.context();
    std::vector<uint8_t> before(sizeof context);
    std::memcpy(before.data(), static_cast<const void *>(&context), before.size());
    host.engine().calls.clear();
    for (const int32_t component : {-1, 100, 101, 5000, INT32_MIN, INT32_MAX}) {
        CHECK_EQ(set(host, component, -6, {1}), 0);
        CHECK_EQ(set(host, component, -26, {1}), 0);
    }
    CHECK_EQ(set(host, 0, -14, firLoad(8, 4)), 0);
    CHECK_EQ(set(host, 0, -14, firLoad(8, 65535)), 0);
    CHECK_EQ(set(host, 0, -13, {1, 4, 0}), 0);
    CHECK_EQ(set(host, 0, -13, {1, 4}), 0);
    for (const int32_t id : {-6, -26, -25, -17, -16, -15, -14, -13}) CHECK_EQ(set(host, 1, id, {}), 0);
    for (size_t size = 0; size < 2 + 8 * 4; ++size) {
        std::vector<uint8_t> cut = firLoad(8);
        cut.resize(size);
        CHECK_EQ(set(host, 0, -16, cut), 0);
        CHECK_EQ(set(host, 0, -14, cut), 0);
    }
    CHECK_EQ(host.engine().calls, Calls{});
    CHECK_EQ(std::memcmp(before.data(), static_cast<const void *>(&context), before.size()), 0);
    CHECK_EQ(VXDSPAPI_SetParameter(host.handle, 1, -6, 0, nullptr, 1), 0);
}

TEST_CASE("a filter loaded ahead of the first format lives until the instance is freed, and until a format comes") {
    HostInstance host;
    CHECK_EQ(set(host, 0, -16, firLoad(64)), 2 + 64 * 4);
    CHECK_EQ(host.context().processFir.tapCount, 64);
    host.setFormat(formatOf(0x3));
    CHECK_EQ(host.context().processFir.tapCount, 32);
    HostInstance other;
    CHECK_EQ(set(other, 0, -16, firLoad(64)), 2 + 64 * 4);
}
