// SPDX-License-Identifier: MIT
//
// Speaker layouts by name and by mask, and the format records that the library takes.
#pragma once

#include <vxcomn/block.h>

#include <cstdint>
#include <string>

namespace vx {

// A layout's mask from its name ("stereo", "5.1", ...) or from a mask in hexadecimal behind 0x. Fails with the list of names.
uint32_t parseLayout(const std::string &text);

// "stereo (0x3)", or the mask alone where it has no name.
std::string layoutText(uint32_t mask);
// The text that parseLayout takes.
std::string layoutName(uint32_t mask);

// The mask of a file of so many channels that names no speakers; 0 if there is no usual one.
uint32_t usualLayout(int channels);

// A format record with both slot tables.
IOFormat makeFormat(uint32_t mask, int frames, int sampleRate);

// The speakers of a mask.
int channelCount(uint32_t mask);

// "FL", "FR", ... of the channel's speaker.
std::string speakerName(uint32_t mask, int channel);

// All names, for --help.
std::string layoutNames();

}  // namespace vx
