// SPDX-License-Identifier: MIT
//
// Sound files as the verbs see them: interleaved f32 frames in and out, as a stream, so that a file's length does not matter.
// audio_file_sndfile.cpp (Linux: WAV by our own reader, everything else by libsndfile) and audio_file_riff.cpp (Windows: WAV)
// define the two functions at the end; the build chooses one. WAV goes through the same code on both, so that the same input gives
// the same bytes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "tools/vx/output_file.h"

namespace vx {

inline constexpr int kMostChannels = 8;  // one a slot of the library
inline constexpr int kLowestRate = 1000;
inline constexpr int kHighestRate = 768000;

enum class SampleType : int {
    pcm16 = 0,
    pcm24 = 1,
    float32 = 2,
};

struct AudioFormat {
    int channels = 0;
    uint32_t mask = 0;  // speaker mask; 0 if the file names no speakers
    int sampleRate = 0;
    std::string encoding;  // as told to a person
};

class AudioReader {
  public:
    AudioReader() = default;
    AudioReader(const AudioReader &) = delete;
    AudioReader &operator=(const AudioReader &) = delete;
    virtual ~AudioReader() = default;

    virtual const AudioFormat &format() const = 0;
    // Frames that the file announces; nothing for a stream that does not know.
    virtual std::optional<uint64_t> announcedFrames() const = 0;
    // Frames that are there, where that can be told ahead of reading; fewer than announced in a truncated file.
    virtual std::optional<uint64_t> presentFrames() const = 0;
    // Reads `count` frames, fewer at the end. Fails where an announced frame is missing.
    virtual size_t read(float *interleaved, size_t count) = 0;
    // Goes back to the first frame; false for a pipe.
    virtual bool rewind() = 0;
};

class AudioWriter {
  public:
    AudioWriter() = default;
    AudioWriter(const AudioWriter &) = delete;
    AudioWriter &operator=(const AudioWriter &) = delete;
    virtual ~AudioWriter() = default;

    virtual void write(const float *interleaved, size_t count) = 0;
    // Completes the header and hands everything to the system. The file counts only after this.
    virtual void finish() = 0;
};

// Opens a sound file for reading; "-" is standard input.
std::unique_ptr<AudioReader> openAudioFile(const std::string &path);

// The type that a file of this name has if none is asked for; fails for a type that it cannot hold.
SampleType sampleTypeFor(const std::string &path, std::optional<SampleType> asked);

// Begins a sound file. `frames` is the expected length, if known: what a pipe announces, since it cannot be corrected later.
std::unique_ptr<AudioWriter> createAudioFile(OutputFile &output, const AudioFormat &format, SampleType type,
                                             std::optional<uint64_t> frames);

// Fails for a format outside the bounds above; readers call it on what a file says.
void checkBounds(const std::string &path, const AudioFormat &format);

// "a.wav: truncated: ..."
[[noreturn]] void failTruncated(const std::string &path, uint64_t announced, uint64_t present);

}  // namespace vx
