// SPDX-License-Identifier: MIT
#include "scene.h"

#include <array>
#include <memory>
#include <stdexcept>

namespace golden {
namespace {

constexpr size_t kLongestBlock = 600;  // some scenes hand over more than the host takes

// The slot tables of a mask; speakers beyond the eight share slots with them.
IOFormat formatOf(uint32_t mask, int frames, int sampleRate) {
    static constexpr uint8_t kSlotOfBit[18] = {0, 1, 2, 3, 4, 5, 0, 1, 2, 6, 7, 2, 0, 2, 1, 4, 2, 5};
    IOFormat format = {};
    format.channelMask = mask;
    format.frames = frames;
    format.sampleRate = sampleRate;
    for (uint32_t bit = 0; bit < 18 && format.channels < VX_SLOT_COUNT; ++bit) {
        if ((mask >> bit & 1U) == 0) continue;
        format.channelSlot[format.channels++] = kSlotOfBit[bit];
        format.slotSpeaker[kSlotOfBit[bit]] = static_cast<uint8_t>(bit + 1);
    }
    return format;
}

struct FreeLibrary {
    void operator()(void *handle) const { VXDSPAPI_FreeLibrary(handle); }
};
using Instance = std::unique_ptr<void, FreeLibrary>;

Instance open(const Scene &scene) {
    Instance instance(
        VXDSPAPI_InitializeLibrary(scene.engine, scene.platform, 0, nullptr, scene.presetPath, 48000, scene.hostType));
    if (instance == nullptr) throw std::runtime_error("scene " + scene.name + ": the host did not open the engine");
    return instance;
}

// Eight buffers that are filled anew for each block.
class Stage {
  public:
    explicit Stage(Signal signal) : samples_(VX_SLOT_COUNT * kLongestBlock) {
        for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) {
            sources_.emplace_back(signal, slot);
            pointers_[static_cast<size_t>(slot)] = samples_.data() + static_cast<size_t>(slot) * kLongestBlock;
        }
        buffers_.channels = pointers_.data();
    }

    void play(VXHandle handle, IOFormat input, IOFormat output, int frames) {
        for (size_t slot = 0; slot < sources_.size(); ++slot) {
            for (int frame = 0; frame < frames; ++frame) pointers_[slot][frame] = sources_[slot].next();
        }
        input.frames = frames;
        output.frames = frames;
        VXDSPAPI_Process(handle, &buffers_, &input, &output);
    }

    void addTo(Digest &digest, int frames) const {
        for (const float *samples : pointers_) {
            for (int frame = 0; frame < frames; ++frame) digest.add(samples[frame]);
        }
        digest.add(static_cast<uint32_t>(buffers_.silent));
    }

    float sample(size_t slot, int frame) const { return pointers_[slot][frame]; }

  private:
    std::vector<float> samples_;
    std::array<float *, VX_SLOT_COUNT> pointers_{};
    std::vector<SignalSource> sources_;
    ProcessBuffers buffers_ = {};
};

// Eight buffers of the capture side, filled from those of the render side.
class Microphone {
  public:
    explicit Microphone(const Scene &scene)
        : path_(scene.path),
          format_(formatOf(scene.capture, VX_MAX_FRAMES, scene.sampleRate)),
          samples_(VX_SLOT_COUNT * kLongestBlock),
          underWay_(VX_SLOT_COUNT, std::vector<float>(static_cast<size_t>(scene.returnDelay) + 1)) {
        for (size_t slot = 0; slot < pointers_.size(); ++slot) pointers_[slot] = samples_.data() + slot * kLongestBlock;
        buffers_.channels = pointers_.data();
    }

    void record(VXHandle handle, const Stage &stage, int frames) {
        for (int frame = 0; frame < frames; ++frame) {
            const size_t next = (place_ + 1) % underWay_[0].size();
            for (size_t slot = 0; slot < pointers_.size(); ++slot) {
                underWay_[slot][place_] = heard(stage.sample(slot, frame));
                pointers_[slot][frame] = underWay_[slot][next];
            }
            place_ = next;
        }
        format_.frames = frames;
        VXDSPAPI_Record(handle, &buffers_, &format_);
    }

    void addTo(Digest &digest, int frames) const {
        for (const float *samples : pointers_) {
            for (int frame = 0; frame < frames; ++frame) digest.add(samples[frame]);
        }
    }

  private:
    float heard(float sample) const {
        switch (path_) {
            case Return::none:
            case Return::straight:
                return sample * 0.5F;
            case Return::inverted:
                return sample * -0.5F;
            case Return::bent:
                return sample * 0.5F + sample * sample * sample * 0.25F;
        }
        return 0.0F;
    }

    Return path_;
    IOFormat format_;
    std::vector<float> samples_;
    std::array<float *, VX_SLOT_COUNT> pointers_{};
    std::vector<std::vector<float>> underWay_;  // a ring for each slot
    size_t place_ = 0;
    ProcessBuffers buffers_ = {};
};

class Cut {
  public:
    explicit Cut(const Scene &scene) : fixed_(scene.blockFrames), state_(scene.cutSeed) {}
    int next() {
        if (fixed_ != 0) return fixed_;
        state_ = state_ * 1664525U + 1013904223U;
        return static_cast<int>(state_ >> 16) % VX_MAX_FRAMES + 1;
    }

  private:
    int fixed_;
    uint32_t state_;
};

}  // namespace

uint64_t digestOf(const Scene &scene) {
    const Instance instance = open(scene);
    VXHandle handle = instance.get();
    IOFormat input = formatOf(scene.input, VX_MAX_FRAMES, scene.sampleRate);
    IOFormat output = formatOf(scene.output, VX_MAX_FRAMES, scene.sampleRate);
    if (!scene.unformatted) VXDSPAPI_SetIOFormat(handle, &input, &output);
    if (scene.prepare) scene.prepare(handle);

    Stage stage(scene.signal);
    Microphone microphone(scene);
    Cut cut(scene);
    Digest digest;
    bool halfDone = false;
    for (int done = 0; done < scene.frames;) {
        if (!halfDone && done >= scene.frames / 2) {
            if (scene.half) scene.half(handle);
            if (scene.read) scene.read(handle, digest);
            halfDone = true;
        }
        const int frames = cut.next();
        stage.play(handle, input, output, frames);
        stage.addTo(digest, frames);
        if (scene.path != Return::none) {
            microphone.record(handle, stage, frames);
            microphone.addTo(digest, frames);
        }
        done += frames;
    }
    if (scene.read) scene.read(handle, digest);
    return digest.value();
}

}  // namespace golden
