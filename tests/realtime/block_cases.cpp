// SPDX-License-Identifier: MIT
#include "block_cases.h"

#include <cstring>

namespace realtime {
namespace {

using Library = const LibraryUnderTest &;

void setBytes(Library library, VXHandle handle, int32_t component, int32_t id, std::vector<uint8_t> data) {
    library.setParameter(handle, component, id, 0, data.data(), static_cast<uint32_t>(data.size()));
}

std::vector<uint8_t> bytesOf(float value) {
    std::vector<uint8_t> bytes(sizeof value);
    std::memcpy(bytes.data(), &value, sizeof value);
    return bytes;
}

// Every stage of the sample engine at work.
void engineEffects(Library library, VXHandle handle, LibraryContext &) {
    for (int32_t component = 0; component < 4; ++component) setBytes(library, handle, component, -12, bytesOf(0.8F));
}

void engineBypassed(Library library, VXHandle handle, LibraryContext &) {
    setBytes(library, handle, -1, -18, {1});
}

void filteredPink(Library library, VXHandle handle, size_t taps) {
    std::vector<uint8_t> data(sizeof(uint16_t) + taps * sizeof(float), 0);
    const auto count = static_cast<uint16_t>(taps);
    std::memcpy(data.data(), &count, sizeof count);
    for (size_t tap = 0; tap < taps; ++tap) {
        const float value = 1.0F / static_cast<float>(tap + 1);
        std::memcpy(data.data() + sizeof count + tap * sizeof value, &value, sizeof value);
    }
    setBytes(library, handle, -1, -16, data);
    setBytes(library, handle, -1, -15, {1});
    setBytes(library, handle, -1, -17, {1});
}

void analysersOn(LibraryContext &context, int32_t choice) {
    context.analyserFeedMode = choice;
    for (RealTimeAnalyser &analyser : context.analyser) analyser.enabled = 1;
}

void secondEngine(Library library, VXHandle handle, LibraryContext &) {
    setBytes(library, handle, -1, -25, {3, 0, 0, 0});
}

}  // namespace

std::vector<BlockCase> blockCases() {
    constexpr const char *kPreset = "C:\\ProgramData\\none.preset";
    std::vector<BlockCase> cases = {
        {.name = "engine at rest"},
        {.name = "engine bypassed", .prepare = engineBypassed},
        {.name = "engine at work", .prepare = engineEffects},
        {.name = "engine at work, one frame", .frames = 1, .prepare = engineEffects},
        {.name = "engine at work, 511 frames", .frames = 511, .prepare = engineEffects},
        {.name = "white noise", .prepare = [](Library, VXHandle, LibraryContext &context) { context.whiteNoiseMode = 1; }},
        {.name = "pink noise", .prepare = [](Library, VXHandle, LibraryContext &context) { context.pinkNoiseMode = 1; }},
        {.name = "sines", .prepare = [](Library, VXHandle, LibraryContext &context) { context.sineMode = 1; }},
        {.name = "sweeps",
         .prepare =
             [](Library, VXHandle, LibraryContext &context) {
                 for (auto &active : context.sweepActive) active = 1;
             }},
        {.name = "polarity tones",
         .prepare =
             [](Library, VXHandle, LibraryContext &context) {
                 for (auto &active : context.polarityActive) active = 1;
             }},
        {.name = "pink noise on one channel",
         .prepare = [](Library library, VXHandle handle, LibraryContext &) { setBytes(library, handle, -1, -17, {1}); }},
        {.name = "filter of 4096 taps",
         .prepare = [](Library library, VXHandle handle, LibraryContext &) { filteredPink(library, handle, 4096); }},
        {.name = "filter of 16 taps, 512 frames",
         .frames = 512,
         .prepare = [](Library library, VXHandle handle, LibraryContext &) { filteredPink(library, handle, 16); }},
        {.name = "analysers on one channel",
         .prepare = [](Library, VXHandle, LibraryContext &context) { analysersOn(context, 0); }},
        {.name = "analysers on the mean", .prepare = [](Library, VXHandle, LibraryContext &context) { analysersOn(context, 2); }},
        {.name = "fixed point", .platform = "HiFi2", .prepare = engineEffects},
        {.name = "second engine", .hostType = 3, .prepare = secondEngine},
        {.name = "fold-down alone", .presetPath = kPreset},
        {.name = "block too long", .frames = 513},
        {.name = "empty block", .frames = 0},
        {.name = "blocks stopped", .prepare = [](Library, VXHandle, LibraryContext &context) { context.processStop = 1; }},
        {.name = "readers at work",
         .prepare =
             [](Library, VXHandle, LibraryContext &context) {
                 for (VXAtomicByte *lock :
                      {&context.inputMeterLock, &context.outputMeterLock, &context.processStatsLock, context.analyserLock})
                     *lock = 1;
             }},
    };
    return cases;
}

}  // namespace realtime
