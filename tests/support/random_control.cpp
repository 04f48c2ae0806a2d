// SPDX-License-Identifier: MIT
#include "tests/support/random_control.h"

#include "tests/support/data_command.h"

namespace vxcomn::testing {

namespace {

uint64_t address(const void *p) {
    return static_cast<uint64_t>(reinterpret_cast<uintptr_t>(p));
}

}  // namespace

void RandomControl::step() {
    if (static_cast<int>(below(1000)) < reloads) {
        parameter(0, -25, packed(below(4)));
        return;
    }
    switch (below(16)) {
        case 0:
            return loadFilter(-16, 0);
        case 1:
            return loadFilter(-14, below(5));
        case 2:
            return parameter(0, below(2) == 0 ? -15 : -17, {onOrOff()});
        case 3:
            return parameter(0, -13, packed(onOrOff(), static_cast<uint16_t>(below(5))));
        case 4:
            return parameter(static_cast<int32_t>(below(7)), below(2) == 0 ? -6 : -26, {onOrOff()});
        case 5:
            return component();
        default:
            return runCommand(-1 - static_cast<int32_t>(below(30)));
    }
}

void RandomControl::parameter(int32_t id, int32_t paramId, std::vector<uint8_t> data) {
    VXDSPAPI_SetParameter(handle_, id, paramId, 0, data.data(), static_cast<uint32_t>(data.size()));
}

// Short responses, so that what goes round stays small; two lengths, so that reloads of equal length are frequent.
void RandomControl::loadFilter(int32_t id, uint32_t channel) {
    const auto count = static_cast<uint16_t>(below(10) == 0 ? below(5000) : below(2) == 0 ? 32 : 300);
    std::vector<uint8_t> data = packed(count);
    const auto append = [&data](const std::vector<uint8_t> &more) { data.insert(data.end(), more.begin(), more.end()); };
    if (id == -14) append(packed(static_cast<uint16_t>(channel)));
    for (int i = 0; i < count; ++i) append(packed(i < 8 ? 0.1F : 0.0F));
    parameter(0, id, data);
}

void RandomControl::component() {
    switch (below(5)) {
        case 0:
            return VXDSPAPI_CreateComponent(handle_, 0, -1, below(2) == 0 ? 48000 : 44100, 48000);
        case 1:
            return VXDSPAPI_CreateComponent(handle_, below(6), static_cast<int32_t>(below(6)), 48000, 48000);
        case 2:
            return VXDSPAPI_DisposeComponent(handle_, below(6), below(6));
        case 3:
            return VXDSPAPI_SetInputGain(handle_, 0.5F);
        default:
            return VXDSPAPI_OnIdle(handle_);
    }
}

void RandomControl::command(int32_t id, const std::vector<uint8_t> &input) {
    uint8_t output[64];
    VXDSPAPI_ReadWriteData(handle_, 0, id, input.data(), static_cast<int32_t>(input.size()), output);
}

void RandomControl::armCaptures() {
    std::vector<uint8_t> input = {4};
    for (uint8_t slot = 0; slot < 4; ++slot) {
        const auto append = [&input](const std::vector<uint8_t> &more) { input.insert(input.end(), more.begin(), more.end()); };
        const auto count = static_cast<uint8_t>(1 + below(7));
        append(packed(slot, count));
        for (uint8_t i = 0; i < count; ++i) append(packed(address(&samples_[slot][i])));
        append(packed(address(ready_[slot].data()), onOrOff()));
    }
    command(VXDSP_DATA_CAPTURE_ARM, input);
    // The command leaves the rings idle; this is what lets them run.
    (*static_cast<LibraryContext **>(handle_))->captureRequested.exchange(1);  // keeps the order that the command's store began
}

void RandomControl::runCommand(int32_t id) {
    switch (id) {
        case VXDSP_DATA_RTA_ENABLE:
            return command(id, {static_cast<uint8_t>(below(4)), onOrOff()});
        case VXDSP_DATA_RTA_READ:
            return command(id, packed(static_cast<uint8_t>(below(4)), uint8_t{0}, onOrOff(), 1u << below(18), int32_t{3}));
        case VXDSP_DATA_SINE:
            return command(id, packed(onOrOff(), static_cast<uint16_t>(below(20000))));
        case VXDSP_DATA_SWEEP_START: {
            SweepCommand sweep;
            sweep.on = onOrOff();
            sweep.channel = static_cast<uint8_t>(below(9));
            sweep.start = static_cast<uint16_t>(below(200));
            sweep.stop = static_cast<uint16_t>(below(20000));
            sweep.sweepTime = static_cast<uint16_t>(below(3000));
            sweep.preDelay = static_cast<uint16_t>(below(200));
            sweep.bandsPerOctave = static_cast<uint16_t>(below(50));
            return command(id, sweep.bytes());
        }
        case VXDSP_DATA_CAPTURE_ARM:
            return armCaptures();
        case VXDSP_DATA_POLARITY_START:
            return command(id, polarityCommand(onOrOff(), static_cast<uint8_t>(below(9)), static_cast<uint16_t>(below(100))));
        default:
            return command(id, packed(static_cast<uint8_t>(below(9)), below(100), below(100)));
    }
}

}  // namespace vxcomn::testing
