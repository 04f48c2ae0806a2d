// SPDX-License-Identifier: MIT
#include "tools/vx/layout.h"

#include <array>
#include <bit>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

struct NamedLayout {
    const char *name;
    uint32_t mask;
};

// The first of several with one channel count is the usual one.
constexpr NamedLayout kLayouts[] = {{"mono", 0x4}, {"stereo", 0x3}, {"2.1", 0xB},        {"3.0", 0x7},  {"quad", 0x33},
                                    {"5.0", 0x37}, {"5.1", 0x3F},   {"5.1-side", 0x60F}, {"7.1", 0x63F}};
constexpr uint32_t kSpeakers = 0x3FFFF;

struct Speaker {
    const char *name;
    uint8_t slot;
};

// By mask bit; several speakers share a slot, as the library lays them out.
constexpr std::array<Speaker, 18> kSpeakerOfBit = {{{"FL", 0},
                                                    {"FR", 1},
                                                    {"FC", 2},
                                                    {"LFE", 3},
                                                    {"BL", 4},
                                                    {"BR", 5},
                                                    {"FLC", 0},
                                                    {"FRC", 1},
                                                    {"BC", 2},
                                                    {"SL", 6},
                                                    {"SR", 7},
                                                    {"TC", 2},
                                                    {"TFL", 0},
                                                    {"TFC", 2},
                                                    {"TFR", 1},
                                                    {"TBL", 4},
                                                    {"TBC", 2},
                                                    {"TBR", 5}}};

const NamedLayout *namedLayout(uint32_t mask) {
    for (const NamedLayout &layout : kLayouts)
        if (layout.mask == mask) return &layout;
    return nullptr;
}

}  // namespace

std::string layoutNames() {
    std::string names;
    for (const NamedLayout &layout : kLayouts) names += std::string(names.empty() ? "" : ", ") + layout.name;
    return names;
}

uint32_t parseLayout(const std::string &text) {
    for (const NamedLayout &layout : kLayouts)
        if (lowered(text) == layout.name) return layout.mask;
    const auto mask = lowered(text).starts_with("0x") ? parseInteger(text, 1, kSpeakers) : std::nullopt;
    if (!mask)
        throw Failure(ExitStatus::usage,
                      "layout \"" + text + "\" is unknown; expected " + layoutNames() + " or a speaker mask such as 0x3F");
    return static_cast<uint32_t>(*mask);
}

std::string layoutName(uint32_t mask) {
    const NamedLayout *layout = namedLayout(mask);
    return layout != nullptr ? layout->name : textf("0x%X", mask);
}

std::string layoutText(uint32_t mask) {
    const NamedLayout *layout = namedLayout(mask);
    return layout != nullptr ? textf("%s (0x%X)", layout->name, mask) : textf("speakers 0x%X", mask);
}

uint32_t usualLayout(int channels) {
    for (const NamedLayout &layout : kLayouts)
        if (channelCount(layout.mask) == channels) return layout.mask;
    return 0;
}

int channelCount(uint32_t mask) {
    return std::popcount(mask);
}

IOFormat makeFormat(uint32_t mask, int frames, int sampleRate) {
    IOFormat format = {};
    format.channels = channelCount(mask);
    format.channelMask = mask;
    format.frames = frames;
    format.sampleRate = sampleRate;
    int channel = 0;
    for (size_t bit = 0; bit < kSpeakerOfBit.size() && channel < VX_SLOT_COUNT; ++bit) {
        if ((mask >> bit & 1U) == 0) continue;
        const uint8_t slot = kSpeakerOfBit[bit].slot;
        format.channelSlot[channel++] = slot;
        format.slotSpeaker[slot] = static_cast<uint8_t>(bit + 1);
    }
    return format;
}

std::string speakerName(uint32_t mask, int channel) {
    for (size_t bit = 0; bit < kSpeakerOfBit.size(); ++bit)
        if ((mask >> bit & 1U) != 0 && channel-- == 0) return kSpeakerOfBit[bit].name;
    return "?";
}

}  // namespace vx
