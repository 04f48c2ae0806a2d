// SPDX-License-Identifier: MIT
//
// What scenes ask of an instance through VXDSPAPI_ReadWriteData: switching the host's tools, and taking what they have measured.
#pragma once

#include <bit>
#include <cstring>
#include <stdexcept>

#include "steps.h"

namespace golden {

inline Step command(int32_t id, Bytes bytes) {
    return [=](VXHandle handle) mutable {
        uint8_t output[64];
        VXDSPAPI_ReadWriteData(handle, 0, id, bytes.data().data(), static_cast<int32_t>(bytes.data().size()), output);
    };
}

inline Step whiteNoise(bool on) {
    return command(VXDSP_DATA_WHITE_NOISE, Bytes().u8(on ? 1 : 0));
}
inline Step pinkNoise(bool on) {
    return command(VXDSP_DATA_PINK_NOISE, Bytes().u8(on ? 1 : 0));
}
inline Step sine(bool on, uint32_t frequency) {
    return command(VXDSP_DATA_SINE, Bytes().u8(on ? 1 : 0).u16(frequency));
}

// Hz and ms.
struct Sweep {
    uint32_t channel = 0;
    uint32_t start = 100;
    uint32_t stop = 10000;
    uint32_t time = 200;
    uint32_t preDelay = 40;
    uint32_t postDelay = 20;
    uint32_t bandsPerOctave = 12;
};
inline Step sweep(bool on, const Sweep &values) {
    return command(VXDSP_DATA_SWEEP_START, Bytes()
                                               .u8(on ? 1 : 0)
                                               .u8(values.channel)
                                               .u16(values.start)
                                               .u16(values.stop)
                                               .u16(values.time)
                                               .u16(values.preDelay)
                                               .u16(values.postDelay)
                                               .u16(values.bandsPerOctave));
}
inline Step polarity(uint32_t channel, uint32_t halfLength) {
    return command(VXDSP_DATA_POLARITY_START, Bytes().u8(1).u8(channel).u8(0).u16(halfLength));
}
inline Step analyser(uint32_t index, bool on) {
    return command(VXDSP_DATA_RTA_ENABLE, Bytes().u8(index).u8(on ? 1 : 0));
}
inline Step analyserChoice(uint32_t choice) {
    return command(VXDSP_DATA_RTA_CHANNEL, Bytes().u8(choice));
}

// The bytes of a command's answer, which must not be empty.
class Answer {
  public:
    Answer(VXHandle handle, int32_t id, Bytes bytes) {
        size_ = VXDSPAPI_ReadWriteData(handle, 0, id, bytes.data().data(), static_cast<int32_t>(bytes.data().size()), bytes_);
        if (size_ == 0) throw std::runtime_error("command " + std::to_string(id) + " was refused");
    }
    uint32_t size() const { return size_; }
    uint32_t byte(uint32_t offset) const { return bytes_[offset]; }
    uint32_t word(uint32_t offset) const {
        uint32_t value = 0;
        std::memcpy(&value, bytes_ + offset, sizeof value);
        return value;
    }
    const float *floats(uint32_t offset) const {
        uint64_t address = 0;
        std::memcpy(&address, bytes_ + offset, sizeof address);
        return reinterpret_cast<const float *>(static_cast<uintptr_t>(address));
    }

  private:
    uint8_t bytes_[64] = {};
    uint32_t size_ = 0;
};

inline Reading readAll(std::initializer_list<Reading> list) {
    return [readings = std::vector<Reading>(list)](VXHandle handle, Digest &digest) {
        for (const Reading &reading : readings) reading(handle, digest);
    };
}
// One of the meters, which is empty afterwards.
inline Reading meter(int32_t id) {
    return [=](VXHandle handle, Digest &digest) {
        const Answer answer(handle, id, Bytes());
        for (uint32_t offset = 0; offset < answer.size(); offset += 4) digest.add(answer.word(offset));
    };
}
inline Reading sweepResult(uint32_t channel) {
    return [=](VXHandle handle, Digest &digest) {
        const Answer answer(handle, VXDSP_DATA_SWEEP_RESULT, Bytes().u8(channel));
        const uint32_t points = answer.word(0);
        digest.add(points);
        digest.add(answer.word(4));
        const float *ratios = answer.floats(8);
        for (uint32_t i = 0; i < points; ++i) digest.add(ratios[i]);
    };
}
inline Reading polarityResult(uint32_t channel) {
    return [=](VXHandle handle, Digest &digest) {
        digest.add(Answer(handle, VXDSP_DATA_POLARITY_RESULT, Bytes().u8(channel)).word(0));
    };
}
// Which engine does the work.
inline Reading moduleState() {
    return [](VXHandle handle, Digest &digest) {
        digest.add(Answer(handle, VXDSP_DATA_ISST_LOADED, Bytes()).byte(0));
        digest.add(Answer(handle, VXDSP_DATA_ISST_STATE, Bytes()).byte(0));
    };
}

}  // namespace golden
