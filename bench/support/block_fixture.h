// SPDX-License-Identifier: MIT
//
// What the programs that time whole blocks share: planes of samples, formats, and a context without an engine module.
#pragma once

#include <cstdint>
#include <random>
#include <string>
#include <utility>

#include "VXDSPAPI.h"
#include "bench/support/timing.h"
#include "host/adapters.h"
#include "host/channel_mixer.h"
#include "measure/instruction_set.h"

namespace vxcomn::bench {

inline constexpr int kFrames = 512;
inline constexpr uint32_t k71 = 0x63F;
inline constexpr uint32_t kStereo = 0x3;

// Eight planes at addresses that share no cache set pattern: a whole number of pages apart they would.
struct Planes {
    Planes() {
        for (int c = 0; c < 8; ++c) plane[c] = storage + c * (kFrames + 48);
        fill(0x1p-33F);
    }
    Planes(const Planes &) = delete;
    Planes &operator=(const Planes &) = delete;
    void fill(float scale) {
        std::mt19937 random(1);
        for (float &sample : storage) sample = static_cast<float>(static_cast<int32_t>(random())) * scale;
    }
    alignas(64) float storage[8 * (kFrames + 48)];
    float *plane[8];
};

inline IOFormat formatOf(uint32_t mask) {
    IOFormat format{};
    format.channels = __builtin_popcount(mask);
    format.frames = kFrames;
    format.sampleRate = 48000;
    setChannelMask(&format, mask);
    return format;
}

template <class F>
Work repeat(std::string name, F once) {
    return {std::move(name), [once](int repeats) mutable {
                for (int i = 0; i < repeats; ++i) once();
            }};
}

inline std::string named(const char *what, InstructionSet set) {
    return std::string(what) + ", " + instructionSetName(set);
}

// A context around an engine that passes through; no module is needed.
struct Host {
    Host() : context(new LibraryContext()), handle(&context) {
        context->initialised = 1;
        chooseAdapters(*context, nullptr);
        context->engineProcess = [](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) {};
        context->inputFormat = formatOf(kStereo);
        context->outputFormat = formatOf(k71);
        context->sampleRate = 48000;
        context->recordSampleRate = 48000;
    }
    ~Host() { delete context; }
    Host(const Host &) = delete;
    Host &operator=(const Host &) = delete;
    LibraryContext *context;
    VXHandle handle;
};

}  // namespace vxcomn::bench
