// SPDX-License-Identifier: MIT
//
// The program behind every layer that runs code: takes the library that its argument names through all ways of the block, with the
// layer's watch around each block. Exit status 0 if the watch saw nothing, 1 if it did, 2 if the run failed.
#include <array>
#include <cstdio>
#include <exception>
#include <stdexcept>
#include <vector>

#include "block_cases.h"
#include "watch.h"

namespace {

using realtime::BlockCase;
using realtime::LibraryUnderTest;

constexpr int kLongest = 520;

IOFormat surroundFormat(uint32_t mask, int frames) {
    IOFormat format = {};
    format.channelMask = mask;
    format.frames = frames;
    format.sampleRate = 48000;
    for (uint8_t bit = 0, slot = 0; bit < 11; ++bit) {
        if (bit >= 6 && bit < 9) continue;
        if ((mask >> bit & 1U) != 0) {
            format.channelSlot[format.channels++] = slot;
            format.slotSpeaker[slot] = static_cast<uint8_t>(bit + 1);
        }
        ++slot;
    }
    return format;
}

class Instance {
  public:
    Instance(const LibraryUnderTest &library, const BlockCase &blockCase)
        : library_(library),
          handle_(library.initializeLibrary("SampleEngine", blockCase.platform, 0, nullptr, blockCase.presetPath, 48000,
                                            blockCase.hostType)) {
        if (handle_ == nullptr) throw std::runtime_error("the host did not open the sample engine");
    }
    ~Instance() { library_.freeLibrary(handle_); }
    Instance(const Instance &) = delete;
    Instance &operator=(const Instance &) = delete;

    VXHandle handle() const { return handle_; }
    LibraryContext &context() const { return **static_cast<LibraryContext **>(handle_); }

  private:
    const LibraryUnderTest &library_;
    VXHandle handle_;
};

class Buffers {
  public:
    Buffers() : samples_(static_cast<size_t>(kLongest) * VX_SLOT_COUNT) {
        for (size_t slot = 0; slot < VX_SLOT_COUNT; ++slot) pointers_[slot] = samples_.data() + slot * kLongest;
        record_.channels = pointers_.data();
        fill();
    }
    void fill() {
        for (float &sample : samples_) {
            state_ = state_ * 1664525U + 1013904223U;
            sample = static_cast<float>(static_cast<int32_t>(state_) >> 8) * 0x1p-24F;
        }
    }
    ProcessBuffers *record() { return &record_; }

  private:
    std::vector<float> samples_;
    std::array<float *, VX_SLOT_COUNT> pointers_{};
    ProcessBuffers record_ = {};
    uint32_t state_ = 1;
};

long runCase(const LibraryUnderTest &library, const BlockCase &blockCase) {
    const Instance instance(library, blockCase);
    IOFormat input = surroundFormat(0x63F, blockCase.frames);
    IOFormat output = surroundFormat(blockCase.presetPath == nullptr ? 0x63F : 0x3, blockCase.frames);
    library.setIOFormat(instance.handle(), &input, &output);
    if (blockCase.prepare != nullptr) blockCase.prepare(library, instance.handle(), instance.context());
    Buffers buffers;
    const realtime::WatchNeeds needs = realtime::watchNeeds();
    for (int block = 0; block < needs.warmBlocks; ++block) library.process(instance.handle(), buffers.record(), &input, &output);
    for (int block = 0; block < needs.watchedBlocks; ++block) {
        buffers.fill();
        realtime::enterBlock();
        library.process(instance.handle(), buffers.record(), &input, &output);
        realtime::leaveBlock();
    }
    return needs.watchedBlocks;
}

}  // namespace

int main(int argc, char **argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s LIBRARY\n", argv[0]);
        return 2;
    }
    try {
        const LibraryUnderTest library(argv[1]);
        realtime::beginWatch();
        long blocks = 0;
        for (const BlockCase &blockCase : realtime::blockCases()) blocks += runCase(library, blockCase);
        return realtime::endWatch(blocks) ? 0 : 1;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "%s\n", error.what());
        return 2;
    }
}
