// SPDX-License-Identifier: MIT
#include "tools/vx/audio_file.h"

#include "tools/vx/failure.h"

namespace vx {

void checkBounds(const std::string &path, const AudioFormat &format) {
    if (format.channels < 1 || format.channels > kMostChannels)
        throw Failure(ExitStatus::input, path + ": has " + std::to_string(format.channels) + " channels; expected 1 to " +
                                             std::to_string(kMostChannels) + ", one for each speaker slot of the library");
    if (format.sampleRate < kLowestRate || format.sampleRate > kHighestRate)
        throw Failure(ExitStatus::input, path + ": has a sample rate of " + std::to_string(format.sampleRate) + " Hz; expected " +
                                             std::to_string(kLowestRate) + " to " + std::to_string(kHighestRate));
}

void failTruncated(const std::string &path, uint64_t announced, uint64_t present) {
    throw Failure(ExitStatus::input, path + ": truncated: it announces " + std::to_string(announced) + " frames and holds " +
                                         std::to_string(present) +
                                         "; fetch the file again, or play only what is there with --seconds");
}

}  // namespace vx
