// SPDX-License-Identifier: MIT
//
// A sample engine on the bench: a loaded module, an instance, eight buffers, and words of the domain for what tests do with them.
// Blocks run in the floating-point mode that the host sets.
#pragma once

#include <emmintrin.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <functional>
#include <memory>
#include <numbers>
#include <random>
#include <string>
#include <vector>

#include "tests/support/engine_module.h"

using Stream = std::vector<std::vector<float>>;  // a plane for each of the eight slots

inline constexpr uint32_t kStereo = 0x3;
inline constexpr uint32_t kSevenOne = 0x63F;

inline IOFormat makeFormat(uint32_t mask, int rate) {
    constexpr uint8_t slots[11] = {0, 1, 2, 3, 4, 5, 0, 0, 0, 6, 7};
    IOFormat format = {};
    format.channelMask = mask;
    format.frames = 512;
    format.sampleRate = rate;
    for (uint8_t bit = 0; bit < 11; ++bit)
        if ((mask >> bit & 1) != 0) {
            format.channelSlot[format.channels++] = slots[bit];
            format.slotSpeaker[slots[bit]] = static_cast<uint8_t>(bit + 1);
        }
    return format;
}

inline Stream silence(int frames) {
    return Stream(8, std::vector<float>(frames, 0.0F));
}

// Noise and a square wave, different in every slot, made without the C library so that it is the same everywhere.
inline Stream testSignal(int frames, float level, uint32_t seed = 1) {
    Stream stream = silence(frames);
    uint32_t state = seed;
    for (int slot = 0; slot < 8; ++slot)
        for (int frame = 0; frame < frames; ++frame) {
            state = state * 1664525u + 1013904223u;
            const float noise = static_cast<float>(static_cast<int32_t>(state) >> 8) * (1.0F / 8388608.0F);
            const float square = (frame / (40 + 17 * slot)) % 2 == 0 ? 0.5F : -0.5F;
            stream[slot][frame] = level * (0.5F * noise + square);
        }
    return stream;
}

inline Stream sine(int frames, double frequencyHz, double rate, double amplitude) {
    Stream stream = silence(frames);
    for (int frame = 0; frame < frames; ++frame) {
        const double value = amplitude * std::sin(2.0 * std::numbers::pi * frequencyHz * frame / rate);
        for (auto &plane : stream) plane[frame] = static_cast<float>(value);
    }
    return stream;
}

// The amplitude of one frequency in the second half of a plane.
inline double amplitudeAt(const std::vector<float> &plane, double frequencyHz, double rate) {
    const std::size_t begin = plane.size() / 2;
    const double period = rate / frequencyHz;
    const auto length = static_cast<std::size_t>(std::floor(static_cast<double>(plane.size() - begin) / period) * period);
    double real = 0.0;
    double imaginary = 0.0;
    for (std::size_t i = 0; i < length; ++i) {
        const double phase = 2.0 * std::numbers::pi * frequencyHz * static_cast<double>(i) / rate;
        real += plane[begin + i] * std::cos(phase);
        imaginary += plane[begin + i] * std::sin(phase);
    }
    return 2.0 * std::hypot(real, imaginary) / static_cast<double>(length);
}

inline double decibels(double ratio) {
    return 20.0 * std::log10(ratio);
}

// Cuts of a stream: always the same length, or random ones from 1 to 512.
using Cuts = std::function<int()>;
inline Cuts evenCuts(int frames) {
    return [frames] { return frames; };
}
inline Cuts randomCuts(uint32_t seed) {
    return [random = std::mt19937(seed)]() mutable { return static_cast<int>(random() % 512 + 1); };
}

class EngineRig {
  public:
    explicit EngineRig(const std::string &module = "SampleEngine", const char *commandLine = nullptr) : module_(module) {
        handle_ = module_.initialize(0, "Float", commandLine, nullptr, nullptr, 1);
        for (int slot = 0; slot < 8; ++slot) pointers_[slot] = buffers_[slot].data();
    }
    EngineRig(const EngineRig &) = delete;
    EngineRig &operator=(const EngineRig &) = delete;
    ~EngineRig() {
        if (handle_ != nullptr) module_.free(handle_);
    }

    EngineModule &module() { return module_; }
    VXEngineHandle handle() { return handle_; }

    uint32_t setFormat(uint32_t mask, int rate) { return setFormats(mask, mask, rate); }
    uint32_t setFormats(uint32_t inputMask, uint32_t outputMask, int rate) {
        input_ = makeFormat(inputMask, rate);
        output_ = makeFormat(outputMask, rate);
        return module_.setIOFormat(handle_, &input_, &output_);
    }

    uint32_t setBytes(int component, int parameter, std::vector<uint8_t> data) {
        return module_.setParameter(handle_, component, parameter, 0, data.data(), static_cast<uint32_t>(data.size()));
    }
    uint32_t setSwitch(int component, int parameter, bool on) { return setBytes(component, parameter, {static_cast<uint8_t>(on)}); }
    uint32_t setFloat(int component, int parameter, float value) {
        std::vector<uint8_t> data(4);
        std::memcpy(data.data(), &value, 4);
        return setBytes(component, parameter, data);
    }
    // `band` from 1 to 10.
    uint32_t setBand(int band, uint8_t type, float frequencyHz, float quality, float gainDecibels) {
        std::vector<uint8_t> data(13);
        data[0] = type;
        std::memcpy(&data[1], &frequencyHz, 4);
        std::memcpy(&data[5], &quality, 4);
        std::memcpy(&data[9], &gainDecibels, 4);
        return setBytes(5, 116 + band, data);
    }
    void setPower(bool on) { setSwitch(-1, -2, on); }
    void setBypass(bool on) { setSwitch(-1, -18, on); }
    void setVoice(float gain) { setFloat(0, -12, gain); }
    void setSurround(float gain) { setFloat(1, -12, gain); }
    void setDetail(float gain) { setFloat(2, -12, gain); }
    void setBass(float gain) { setFloat(3, -12, gain); }
    void setOutputGain(float gain) { setFloat(-1, -12, gain); }
    void setInputGain(float gain) { module_.setInputGain(handle_, gain); }

    // Runs a stream through the engine and returns what comes out. `before` is called with the position ahead of each block.
    Stream run(const Stream &stream, const Cuts &cuts = evenCuts(512), const std::function<void(int)> &before = {}) {
        Stream result = stream;
        const int frames = static_cast<int>(stream[0].size());
        for (int done = 0; done < frames;) {
            if (before) before(done);
            const int count = std::min(cuts(), frames - done);
            for (int slot = 0; slot < 8; ++slot) std::copy_n(stream[slot].begin() + done, count, buffers_[slot].begin());
            block(count);
            for (int slot = 0; slot < 8; ++slot) std::copy_n(buffers_[slot].begin(), count, result[slot].begin() + done);
            done += count;
        }
        return result;
    }

    // One block on the rig's own buffers.
    void block(int frames) {
        ProcessBuffers buffers = {};
        buffers.channels = pointers_.data();
        input_.frames = output_.frames = frames;
        const unsigned mode = _mm_getcsr();
        _mm_setcsr(mode | 0x8840);
        module_.process(handle_, &buffers, &input_, &output_);
        _mm_setcsr(mode);
    }
    std::vector<float> &buffer(int slot) { return buffers_[slot]; }

  private:
    EngineModule module_;
    VXEngineHandle handle_ = nullptr;
    IOFormat input_ = {};
    IOFormat output_ = {};
    std::vector<std::vector<float>> buffers_ = std::vector<std::vector<float>>(8, std::vector<float>(512, 0.0F));
    std::array<float *, 8> pointers_ = {};
};

inline bool sameBits(const std::vector<float> &a, const std::vector<float> &b) {
    return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(float)) == 0;
}
inline bool sameBits(const Stream &a, const Stream &b) {
    for (std::size_t slot = 0; slot < a.size(); ++slot)
        if (!sameBits(a[slot], b[slot])) return false;
    return a.size() == b.size();
}

// Every effect at work, nothing extreme.
inline void setEverything(EngineRig &rig) {
    rig.setInputGain(0.8F);
    rig.setVoice(1.5F);
    rig.setSurround(2.0F);
    rig.setDetail(1.0F);
    rig.setBass(2.0F);
    for (int band = 1; band <= 10; ++band)
        rig.setBand(band, 1, 31.0F * static_cast<float>(1 << (band - 1)), 1.44F, band % 2 == 0 ? 6.0F : -4.0F);
    rig.setOutputGain(0.7F);
}
