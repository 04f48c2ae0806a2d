// SPDX-License-Identifier: MIT
//
// One scene: an engine, formats, settings and a signal, run through VXDSPAPI_Process and, with a way back, VXDSPAPI_Record, as a
// customer of the library would, and what comes out as one digest. Single-threaded.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "VXDSPAPI.h"
#include "digest.h"
#include "signal.h"

namespace golden {

// Speaker masks by their usual names.
enum Layout : uint32_t {
    kMono = 0x4,
    kStereo = 0x3,
    kStereoBass = 0xB,
    kFront = 0x7,
    kQuadBack = 0x33,
    kQuadSide = 0x603,
    kFiveBack = 0x37,
    kSurroundBack = 0x3F,
    kSurroundSide = 0x60F,
    kSixSpeakers = 0x70F,
    kSevenOne = 0x63F,
    kSevenOneWide = 0xFF
};

using Step = std::function<void(VXHandle)>;
// Adds what an instance has measured.
using Reading = std::function<void(VXHandle, Digest &)>;

// The way from what comes out to what VXDSPAPI_Record takes in.
enum class Return : uint8_t {
    none,      // nothing is recorded
    straight,  // half as loud
    inverted,  // half as loud, upside down
    bent       // with a third harmonic
};

struct Scene {
    std::string name;
    const char *engine = "SampleEngine";
    const char *platform = nullptr;
    const char *presetPath = nullptr;
    int32_t hostType = 0;
    uint32_t input = kStereo;
    uint32_t output = kStereo;
    int32_t sampleRate = 48000;
    Signal signal = Signal::programme;
    int blockFrames = 480;     // 0: a random cut into blocks of 1 to 512
    uint32_t cutSeed = 1;      // of the random cut
    int frames = 4800;         // at least; the last block is whole
    Step prepare = nullptr;    // ahead of the first block
    Step half = nullptr;       // when half of the frames have passed
    bool unformatted = false;  // leaves VXDSPAPI_SetIOFormat out
    Reading read = nullptr;    // when half of the frames have passed, and at the end
    Return path = Return::none;
    int returnDelay = 0;         // frames
    uint32_t capture = kStereo;  // speakers of the capture side
};

// Over the samples of all eight slots and the silent word, block by block; with a return, over what has been recorded as well.
// Throws std::runtime_error if the host opens no engine.
uint64_t digestOf(const Scene &scene);

// All scenes, in the order in which they run: the noise generators' sequences go on from one scene to the next.
std::vector<Scene> allScenes();

}  // namespace golden
