// SPDX-License-Identifier: MIT
//
// Sound files where there is no libsndfile: WAV and nothing else.
#include <cerrno>
#include <cstring>

#include "tools/vx/audio_file.h"
#include "tools/vx/failure.h"
#include "tools/vx/riff_reader.h"
#include "tools/vx/riff_writer.h"
#include "tools/vx/text.h"

namespace vx {

std::unique_ptr<AudioReader> openAudioFile(const std::string &path) {
    if (path == "-") return std::make_unique<RiffReader>("standard input", binaryInput(), File());
    File file = openFile(pathOf(path), "rb");
    if (!file) throw Failure(ExitStatus::input, path + ": cannot be opened: " + std::strerror(errno) + "; expected a WAV file");
    std::FILE *stream = file.get();
    return std::make_unique<RiffReader>(path, stream, std::move(file));
}

SampleType sampleTypeFor(const std::string &path, std::optional<SampleType> asked) {
    if (lowered(path).ends_with(".flac"))
        throw Failure(ExitStatus::usage, path + ": this build of vx writes WAV only; name a file that ends in .wav");
    return asked.value_or(SampleType::float32);
}

std::unique_ptr<AudioWriter> createAudioFile(OutputFile &output, const AudioFormat &format, SampleType type,
                                             std::optional<uint64_t> frames) {
    return std::make_unique<RiffWriter>(output, format, type, frames);
}

}  // namespace vx
