// SPDX-License-Identifier: MIT
//
// Sound files where there is libsndfile: WAV by our own reader and writer, as everywhere, so that results compare byte for byte;
// FLAC and whatever else the library reads by the library.
#include <fcntl.h>
#include <sndfile.h>
#include <unistd.h>

#include <bit>
#include <cerrno>
#include <cstring>
#include <vector>

#include "tools/vx/audio_file.h"
#include "tools/vx/failure.h"
#include "tools/vx/quantise.h"
#include "tools/vx/riff_reader.h"
#include "tools/vx/riff_writer.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

struct CloseSound {
    void operator()(SNDFILE *file) const { sf_close(file); }
};
using Sound = std::unique_ptr<SNDFILE, CloseSound>;

bool isFlac(const std::string &path) {
    return lowered(path).ends_with(".flac");
}

std::string encodingName(int format) {
    SF_FORMAT_INFO major = {};
    major.format = format & SF_FORMAT_TYPEMASK;
    if (sf_command(nullptr, SFC_GET_FORMAT_INFO, &major, sizeof(major)) != 0 || major.name == nullptr) return "unknown";
    return major.name;
}

class SoundReader final : public AudioReader {
  public:
    explicit SoundReader(const std::string &path) : path_(path) {
        SF_INFO info = {};
        sound_.reset(sf_open(path.c_str(), SFM_READ, &info));
        if (!sound_) throw Failure(ExitStatus::input, path + ": is no sound file that can be read: " + sf_strerror(nullptr));
        format_.channels = info.channels;
        format_.sampleRate = info.samplerate;
        format_.encoding = encodingName(info.format);
        checkBounds(path, format_);
        if (info.frames >= 0 && info.frames < SF_COUNT_MAX) announced_ = static_cast<uint64_t>(info.frames);
    }

    const AudioFormat &format() const override { return format_; }
    std::optional<uint64_t> announcedFrames() const override { return announced_; }
    std::optional<uint64_t> presentFrames() const override { return std::nullopt; }

    size_t read(float *interleaved, size_t count) override {
        const sf_count_t got = sf_readf_float(sound_.get(), interleaved, static_cast<sf_count_t>(count));
        position_ += static_cast<uint64_t>(got);
        if (sf_error(sound_.get()) != SF_ERR_NO_ERROR)
            throw Failure(ExitStatus::input,
                          path_ + ": frame " + std::to_string(position_) + ": damaged: " + sf_strerror(sound_.get()));
        if (static_cast<size_t>(got) < count && announced_ && position_ < *announced_) failTruncated(path_, *announced_, position_);
        return static_cast<size_t>(got);
    }

    bool rewind() override {
        position_ = 0;
        return sf_seek(sound_.get(), 0, SEEK_SET) == 0;
    }

  private:
    std::string path_;
    Sound sound_;
    AudioFormat format_;
    std::optional<uint64_t> announced_;
    uint64_t position_ = 0;
};

class FlacWriter final : public AudioWriter {
  public:
    FlacWriter(OutputFile &output, const AudioFormat &format, SampleType type)
        : output_(output), channels_(format.channels), bits_(type == SampleType::pcm16 ? 16 : 24) {
        SF_INFO info = {};
        info.channels = format.channels;
        info.samplerate = format.sampleRate;
        info.format = SF_FORMAT_FLAC | (bits_ == 16 ? SF_FORMAT_PCM_16 : SF_FORMAT_PCM_24);
        sound_.reset(sf_open_fd(dup(fileno(output.stream())), SFM_WRITE, &info, SF_TRUE));
        if (!sound_) throw Failure(ExitStatus::system, output.path() + ": cannot be written as FLAC: " + sf_strerror(nullptr));
    }

    void write(const float *interleaved, size_t count) override {
        words_.resize(count * static_cast<size_t>(channels_));
        for (size_t i = 0; i < words_.size(); ++i)
            words_[i] = static_cast<int>(static_cast<uint32_t>(quantise(interleaved[i], bits_)) << (32 - bits_));
        errno = 0;
        if (sf_writef_int(sound_.get(), words_.data(), static_cast<sf_count_t>(count)) != static_cast<sf_count_t>(count)) fail();
    }

    void finish() override {
        errno = 0;
        sf_write_sync(sound_.get());
        if (sf_close(sound_.release()) != 0) fail();
        output_.closeStream();
    }

  private:
    [[noreturn]] void fail() const {
        const std::string why = errno != 0 ? std::strerror(errno) : "the encoder refused";
        throw Failure(ExitStatus::system, output_.path() + ": cannot be written: " + why);
    }

    OutputFile &output_;
    int channels_;
    int bits_;
    Sound sound_;
    std::vector<int> words_;
};

}  // namespace

std::unique_ptr<AudioReader> openAudioFile(const std::string &path) {
    if (path == "-") return std::make_unique<RiffReader>("standard input", binaryInput(), File());
    File file = openFile(pathOf(path), "rb");
    if (!file) throw Failure(ExitStatus::input, path + ": cannot be opened: " + std::strerror(errno) + "; expected a sound file");
    char head[4] = {};
    errno = 0;
    const size_t got = std::fread(head, 1, sizeof(head), file.get());
    if (got == 0 && std::ferror(file.get()) != 0)
        throw Failure(ExitStatus::input, path + ": cannot be read: " + std::strerror(errno));
    if (!fileSize(file.get()))
        throw Failure(ExitStatus::input, path + ": is no regular file; pass a pipe's WAV through standard input, with \"-\"");
    if (got == sizeof(head) && std::memcmp(head, "RIFF", sizeof(head)) != 0) return std::make_unique<SoundReader>(path);
    seekFile(file.get(), 0);
    std::FILE *stream = file.get();
    return std::make_unique<RiffReader>(path, stream, std::move(file));
}

SampleType sampleTypeFor(const std::string &path, std::optional<SampleType> asked) {
    if (!isFlac(path)) return asked.value_or(SampleType::float32);
    if (asked == SampleType::float32)
        throw Failure(ExitStatus::usage, path + ": FLAC holds no float samples; give --bits 16 or --bits 24");
    return asked.value_or(SampleType::pcm24);
}

std::unique_ptr<AudioWriter> createAudioFile(OutputFile &output, const AudioFormat &format, SampleType type,
                                             std::optional<uint64_t> frames) {
    if (isFlac(output.path())) return std::make_unique<FlacWriter>(output, format, type);
    return std::make_unique<RiffWriter>(output, format, type, frames);
}

}  // namespace vx
