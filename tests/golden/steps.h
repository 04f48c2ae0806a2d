// SPDX-License-Identifier: MIT
//
// What scenes do to an instance: parameters of the sample engine and of the host, each by its name.
#pragma once

#include <bit>
#include <initializer_list>
#include <vector>

#include "scene.h"

namespace golden {

// Little-endian data of a parameter.
class Bytes {
  public:
    Bytes &u8(uint32_t value) { return add(value, 1); }
    Bytes &u16(uint32_t value) { return add(value, 2); }
    Bytes &u32(uint32_t value) { return add(value, 4); }
    Bytes &f32(float value) { return add(std::bit_cast<uint32_t>(value), 4); }
    std::vector<uint8_t> &data() { return data_; }

  private:
    Bytes &add(uint32_t value, int size) {
        for (int byte = 0; byte < size; ++byte) data_.push_back(static_cast<uint8_t>(value >> (8 * byte)));
        return *this;
    }
    std::vector<uint8_t> data_;
};

inline Step parameter(int32_t component, int32_t id, Bytes bytes) {
    return [=](VXHandle handle) mutable {
        VXDSPAPI_SetParameter(handle, component, id, 0, bytes.data().data(), static_cast<uint32_t>(bytes.data().size()));
    };
}

inline Step all(std::initializer_list<Step> list) {
    return [steps = std::vector<Step>(list)](VXHandle handle) {
        for (const Step &step : steps) step(handle);
    };
}

// The sample engine's.
inline Step power(bool on) {
    return parameter(-1, -2, Bytes().u8(on ? 1 : 0));
}
inline Step bypass(bool on) {
    return parameter(-1, -18, Bytes().u8(on ? 1 : 0));
}
inline Step outputGain(float gain) {
    return parameter(-1, -12, Bytes().f32(gain));
}
inline Step level(int32_t component, float gain) {
    return parameter(component, -12, Bytes().f32(gain));
}
inline Step voice(float gain) {
    return level(0, gain);
}
inline Step surround(float gain) {
    return level(1, gain);
}
inline Step detail(float gain) {
    return level(2, gain);
}
inline Step bass(float gain) {
    return level(3, gain);
}
inline Step equaliser(bool on) {
    return parameter(5, 115, Bytes().u8(on ? 1 : 0));
}
inline Step band(int index, float frequency, float quality, float decibels) {
    return parameter(5, 117 + index, Bytes().u8(1).f32(frequency).f32(quality).f32(decibels));
}
inline Step inputGain(float gain) {
    return [=](VXHandle handle) { VXDSPAPI_SetInputGain(handle, gain); };
}

// Settings that put every stage of the sample engine to work.
inline Step everything() {
    return all({bass(0.5F), detail(0.4F), voice(0.6F), surround(0.7F), band(2, 125.0F, 1.0F, 4.0F), band(7, 4000.0F, 2.0F, -5.0F),
                inputGain(1.25F), outputGain(0.9F)});
}

// The host's.
inline Step componentEnable(int32_t component, bool on) {
    return parameter(component, -6, Bytes().u8(on ? 1 : 0));
}
inline Step componentOnModule(int32_t component, bool on) {
    return parameter(component, -26, Bytes().u8(on ? 1 : 0));
}
inline Step moduleInBlock() {
    return parameter(-1, -25, Bytes().u32(3));
}
inline Step pinkOnFirstChannel(bool on) {
    return parameter(-1, -17, Bytes().u8(on ? 1 : 0));
}
inline Step firEnable(bool on) {
    return parameter(-1, -15, Bytes().u8(on ? 1 : 0));
}
// A decaying row of taps, exact in f32.
inline void appendTaps(Bytes &bytes, int count) {
    uint32_t word = 12345;
    for (int tap = 0; tap < count; ++tap) {
        word = word * 1664525U + 1013904223U;
        const float noise = static_cast<float>(static_cast<int32_t>(word) >> 8) * 0x1p-23F;
        bytes.f32(noise * static_cast<float>(count - tap) / static_cast<float>(8 * count));
    }
}
inline Step firLoad(int count) {
    Bytes bytes;
    bytes.u16(static_cast<uint32_t>(count));
    appendTaps(bytes, count);
    return parameter(-1, -16, bytes);
}
inline Step recordFirEnable(uint32_t channel, bool on) {
    return parameter(-1, -13, Bytes().u8(on ? 1 : 0).u16(channel));
}
inline Step recordFirLoad(uint32_t channel, int count) {
    Bytes bytes;
    bytes.u16(static_cast<uint32_t>(count)).u16(channel);
    appendTaps(bytes, count);
    return parameter(-1, -14, bytes);
}
inline Step disposeComponent(uint32_t component) {
    return [=](VXHandle handle) { VXDSPAPI_DisposeComponent(handle, 0, component); };
}
inline Step createComponent(int32_t component) {
    return [=](VXHandle handle) { VXDSPAPI_CreateComponent(handle, 0, component, 48000, 48000); };
}
inline Step clear() {
    return [](VXHandle handle) { VXDSPAPI_Clear(handle, 0); };
}

}  // namespace golden
