// SPDX-License-Identifier: MIT
//
// What the tests of vx share: a folder of their own, sound files made sample by sample, and the program itself.
#pragma once

#include <cmath>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <numbers>
#include <string>
#include <vector>

#include "tests/support/process.h"
#include "tools/vx/audio_file.h"
#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace test {

inline bool has(const std::string &text, const std::string &part) {
    return text.find(part) != std::string::npos;
}

struct VxFixture {
    VxFixture() : folder(std::filesystem::temp_directory_path() / ("vx-test-" + std::to_string(processId()))) {
        std::filesystem::remove_all(folder);
        std::filesystem::create_directories(folder);
    }
    ~VxFixture() {
        std::error_code ignored;
        std::filesystem::remove_all(folder, ignored);
    }

    std::string path(const std::string &name) const { return vx::utf8Of(folder / vx::pathOf(name)); }
    bool exists(const std::string &name) const { return std::filesystem::exists(folder / vx::pathOf(name)); }

    static Outcome vx(const std::vector<std::string> &arguments, const Environment &environment = {}) {
        return test::run(builtProgram("vx"), arguments, {}, environment);
    }

    std::string readBytes(const std::string &name) const {
        std::ifstream file(folder / vx::pathOf(name), std::ios::binary);
        return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    }
    void writeBytes(const std::string &name, const std::string &bytes) const {
        std::ofstream(folder / vx::pathOf(name), std::ios::binary) << bytes;
    }

    // A file with sample(frame, channel).
    std::string makeSound(const std::string &name, int channels, uint32_t mask, size_t frames,
                          const std::function<double(size_t, int)> &sample, vx::SampleType type = vx::SampleType::float32) const {
        vx::AudioFormat format;
        format.channels = channels;
        format.mask = mask;
        format.sampleRate = 48000;
        std::vector<float> samples;
        for (size_t frame = 0; frame < frames; ++frame)
            for (int channel = 0; channel < channels; ++channel) samples.push_back(static_cast<float>(sample(frame, channel)));
        vx::OutputFile output(path(name), true);
        const auto writer = vx::createAudioFile(output, format, type, std::nullopt);
        writer->write(samples.data(), frames);
        writer->finish();
        output.commit();
        return path(name);
    }
    std::string makeSine(const std::string &name, double hz, double amplitude, size_t frames = 48000, int channels = 2) const {
        return makeSound(name, channels, channels == 2 ? 0x3 : 0x4, frames, [=](size_t frame, int) {
            return amplitude * std::sin(2.0 * std::numbers::pi * hz * static_cast<double>(frame) / 48000.0);
        });
    }

    std::vector<float> readSound(const std::string &name) const {
        const auto reader = vx::openAudioFile(path(name));
        std::vector<float> samples;
        std::vector<float> block(1024 * static_cast<size_t>(reader->format().channels));
        while (const size_t got = reader->read(block.data(), 1024))
            samples.insert(samples.end(), block.begin(), block.begin() + static_cast<long>(got) * reader->format().channels);
        return samples;
    }

    // Files in the folder whose names hold this.
    size_t count(const std::string &part) const {
        size_t found = 0;
        for (const auto &entry : std::filesystem::directory_iterator(folder))
            if (has(vx::utf8Of(entry.path().filename()), part)) ++found;
        return found;
    }

    std::filesystem::path folder;
};

}  // namespace test
