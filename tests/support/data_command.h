// SPDX-License-Identifier: MIT
//
// Diagnostic commands for tests: a byte stream is written by listing its values with their types, and an answer is read in order.
#pragma once

#include <cstring>
#include <stdexcept>
#include <vector>

#include "tests/support/host_instance.h"

namespace vxcomn::testing {

// The packed little-endian stream of the values, in order.
template <class... Values>
std::vector<uint8_t> packed(Values... values) {
    std::vector<uint8_t> bytes;
    const auto append = [&bytes](const auto &value) {
        const auto *first = reinterpret_cast<const uint8_t *>(&value);
        bytes.insert(bytes.end(), first, first + sizeof value);
    };
    (append(values), ...);
    return bytes;
}

// What a command returned and wrote. Room beyond the result is filled with a pattern, to show what was left alone.
struct Answer {
    static constexpr uint8_t kUntouched = 0xA5;

    uint32_t size = 0;
    std::vector<uint8_t> bytes = std::vector<uint8_t>(64, kUntouched);

    template <class T>
    T at(size_t offset) const {
        if (offset + sizeof(T) > bytes.size()) throw std::out_of_range("an answer has 64 bytes");
        T value;
        std::memcpy(&value, bytes.data() + offset, sizeof value);
        return value;
    }
    template <class T>
    const T *pointerAt(size_t offset) const {
        return reinterpret_cast<const T *>(static_cast<uintptr_t>(at<uint64_t>(offset)));
    }
    bool nothingWritten() const {
        for (const uint8_t byte : bytes) {
            if (byte != kUntouched) return false;
        }
        return true;
    }
};

inline Answer command(const HostInstance &host, int32_t id, const std::vector<uint8_t> &input = {}) {
    Answer answer;
    // An allocation of exactly the input's size lets the address sanitizer see a read beyond it.
    const std::vector<uint8_t> exact(input.begin(), input.end());
    answer.size = VXDSPAPI_ReadWriteData(host.handle, 0, id, exact.data(), static_cast<int32_t>(exact.size()), answer.bytes.data());
    return answer;
}

// A sweep command in its usual dress.
struct SweepCommand {
    uint8_t on = 1;
    uint8_t channel = 0;
    uint16_t start = 100;
    uint16_t stop = 10000;
    uint16_t sweepTime = 1000;
    uint16_t preDelay = 100;
    uint16_t postDelay = 0;
    uint16_t bandsPerOctave = 3;

    std::vector<uint8_t> bytes() const { return packed(on, channel, start, stop, sweepTime, preDelay, postDelay, bandsPerOctave); }
};

inline std::vector<uint8_t> polarityCommand(uint8_t on, uint8_t channel, uint16_t halfLength) {
    return packed(on, channel, uint8_t{0}, halfLength);
}

}  // namespace vxcomn::testing
