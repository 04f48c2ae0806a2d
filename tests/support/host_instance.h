// SPDX-License-Identifier: MIT
//
// A host instance around the mock engine, and a block of audio, for tests of the host.
#pragma once

#include <array>
#include <vector>

#include "VXDSPAPI.h"
#include "platform/module.h"
#include "tests/support/mock_engine.h"

namespace vxcomn::testing {

// Eight buffers in one place, and the record that points at them.
struct Block {
    explicit Block(int length = VX_MAX_FRAMES, float fill = 0.0F);
    // A copy has samples and pointers of its own.
    Block(const Block &other);
    Block &operator=(const Block &other);
    ~Block() = default;

    float *slot(int index) { return storage.data() + static_cast<size_t>(index) * static_cast<size_t>(length); }
    // Fills all eight slots from a seed with samples between -1 and 1.
    void fillNoise(uint32_t seed);
    bool operator==(const Block &other) const;  // bit for bit

    int length;
    std::vector<float> storage;
    std::array<float *, VX_SLOT_COUNT> pointers;
    ProcessBuffers buffers{};

  private:
    void point();
};

// A format with its slot tables.
IOFormat formatOf(uint32_t mask, int frames = 480, int sampleRate = 48000);

// Opens "MockEngine" (or another module) through the host and frees it again.
class HostInstance {
  public:
    struct Options {
        const char *engine = "MockEngine";
        const char *platform = nullptr;
        uint32_t hardware = 0;
        const char *commandLine = nullptr;
        const char *presetPath = nullptr;
        int32_t recordRate = 48000;
        int32_t hostType = 0;
    };

    HostInstance();
    explicit HostInstance(const Options &options);
    ~HostInstance();
    HostInstance(const HostInstance &) = delete;
    HostInstance &operator=(const HostInstance &) = delete;

    LibraryContext &context() const { return **static_cast<LibraryContext **>(handle); }
    // The state of the engine module that the host loaded.
    MockEngine &engine() const { return *engine_; }
    // Frees the instance; what VXDSPAPI_FreeLibrary returned.
    int32_t free();

    // Sets a format on both sides, or one on each.
    void setFormat(const IOFormat &format);
    void process(Block &block, IOFormat input, IOFormat output) const;

    VXHandle handle = nullptr;

  private:
    Module module_;
    MockEngine *engine_ = nullptr;
};

// The state of a mock module by its file name; loads it if it isn't.
MockEngine &mockEngine(const char *fileName, Module &keep);

}  // namespace vxcomn::testing
