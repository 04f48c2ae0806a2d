// SPDX-License-Identifier: MIT
//
// The WAV writer of both platforms: the same samples give the same bytes. Float and PCM of 16 or 24 bits; WAVE_FORMAT_EXTENSIBLE
// wherever the plain header would leave the speakers or the word length open.
#pragma once

#include <vector>

#include "tools/vx/audio_file.h"

namespace vx {

class RiffWriter final : public AudioWriter {
  public:
    RiffWriter(OutputFile &output, const AudioFormat &format, SampleType type, std::optional<uint64_t> frames);

    void write(const float *interleaved, size_t count) override;
    void finish() override;

  private:
    std::vector<uint8_t> header(uint64_t dataBytes) const;
    void checkLength(uint64_t dataBytes) const;

    OutputFile &output_;
    AudioFormat format_;
    SampleType type_;
    uint64_t announcedBytes_ = 0;
    uint64_t dataBytes_ = 0;
    std::vector<uint8_t> bytes_;
};

}  // namespace vx
