// SPDX-License-Identifier: MIT
//
// The WAV reader: RIFF/WAVE with PCM of 8, 16, 24 or 32 bits or float of 32 or 64, plain or WAVE_FORMAT_EXTENSIBLE. The input is
// hostile until checked: chunk sizes are never used to allocate, every length is compared with what is left, and anything else
// than a sound file ends in a Failure that says at which offset and why. Reads from pipes too, so it never goes back while it
// parses.
#pragma once

#include <vector>

#include "tools/vx/audio_file.h"
#include "tools/vx/system.h"

namespace vx {

class RiffReader final : public AudioReader {
  public:
    // Takes a file or stream at its beginning. `owned` closes it in the end; standard input is not owned.
    RiffReader(std::string path, std::FILE *stream, File owned);

    const AudioFormat &format() const override { return format_; }
    std::optional<uint64_t> announcedFrames() const override { return announced_; }
    std::optional<uint64_t> presentFrames() const override { return present_; }
    size_t read(float *interleaved, size_t count) override;
    bool rewind() override;

  private:
    enum class Coding : int { unsigned8, pcm16, pcm24, pcm32, float32, float64 };

    void parse();
    void readFormat(uint32_t size);
    void chooseCoding(uint16_t tag, int bits);
    void beginData(uint32_t size);
    void skip(uint64_t count, const char *what);
    void need(uint8_t *bytes, size_t count, const char *what);
    void convert(const uint8_t *bytes, float *samples, size_t count) const;
    [[noreturn]] void fail(const std::string &what) const;

    std::string path_;
    File owned_;
    std::FILE *stream_;
    AudioFormat format_;
    Coding coding_ = Coding::pcm16;
    size_t frameBytes_ = 0;
    uint64_t offset_ = 0;      // bytes read so far
    uint64_t dataOffset_ = 0;  // where the samples begin
    uint64_t position_ = 0;    // frames read
    std::optional<uint64_t> announced_;
    std::optional<uint64_t> present_;
    std::vector<uint8_t> bytes_;
};

}  // namespace vx
