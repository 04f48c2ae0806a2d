// SPDX-License-Identifier: MIT
//
// The WAV reader against good files of every coding and against hostile ones. It must end every one of them in samples or in a
// Failure of the status for inputs, without ever allocating what a size field asks for.
#include <doctest/doctest.h>

#include "tests/tools/vx_fixture.h"
#include "tools/vx/riff_reader.h"

using test::has;
using vx::ExitStatus;
using vx::Failure;

namespace {

std::string little(uint64_t value, int bytes) {
    std::string text;
    for (int i = 0; i < bytes; ++i) text += static_cast<char>(value >> 8 * i & 0xFF);
    return text;
}

std::string chunk(const std::string &id, const std::string &body) {
    return id + little(body.size(), 4) + body + (body.size() % 2 != 0 ? std::string(1, '\0') : "");
}

std::string plainFormat(int tag, int channels, int rate, int bits) {
    const int frame = channels * bits / 8;
    return chunk("fmt ", little(static_cast<uint64_t>(tag), 2) + little(static_cast<uint64_t>(channels), 2) +
                             little(static_cast<uint64_t>(rate), 4) + little(static_cast<uint64_t>(rate * frame), 4) +
                             little(static_cast<uint64_t>(frame), 2) + little(static_cast<uint64_t>(bits), 2));
}

std::string wave(const std::string &chunks) {
    return "RIFF" + little(4 + chunks.size(), 4) + "WAVE" + chunks;
}

struct ReaderFixture : test::VxFixture {
    // All samples, or the Failure's text.
    std::string outcome(const std::string &bytes, std::vector<float> *samples = nullptr) {
        writeBytes("in.wav", bytes);
        try {
            vx::File file = vx::openFile(vx::pathOf(path("in.wav")), "rb");
            std::FILE *stream = file.get();
            vx::RiffReader reader("in.wav", stream, std::move(file));
            std::vector<float> block(64 * static_cast<size_t>(reader.format().channels));
            while (const size_t got = reader.read(block.data(), 64)) {
                if (samples != nullptr)
                    samples->insert(samples->end(), block.begin(),
                                    block.begin() + static_cast<long>(got) * reader.format().channels);
            }
            return "";
        } catch (const Failure &failure) {
            CHECK(failure.status == ExitStatus::input);
            return failure.what();
        }
    }
};

}  // namespace

TEST_CASE_FIXTURE(ReaderFixture, "every coding reads to the samples that it means") {
    struct Case {
        int tag, bits;
        std::string data;
        std::vector<float> samples;
    };
    const Case cases[] = {
        {1, 8, std::string("\x00\x80\xC0\xFF", 4), {-1.0F, 0.0F, 0.5F, 127.0F / 128.0F}},
        {1, 16, little(0x8000, 2) + little(0x4000, 2), {-1.0F, 0.5F}},
        {1, 24, little(0x800000, 3) + little(0x000001, 3), {-1.0F, 0x1p-23F}},
        {1, 32, little(0x80000000, 4) + little(0x20000000, 4), {-1.0F, 0.25F}},
        {3, 32, little(0x3F800000, 4) + little(0xC0000000, 4), {1.0F, -2.0F}},
        {3, 64, little(0x3FF0000000000000, 8) + little(0xBFE0000000000000, 8), {1.0F, -0.5F}},
    };
    for (const Case &c : cases) {
        CAPTURE(c.tag);
        CAPTURE(c.bits);
        std::vector<float> samples;
        CHECK(outcome(wave(plainFormat(c.tag, 1, 48000, c.bits) + chunk("data", c.data)), &samples) == "");
        CHECK(samples == c.samples);
    }
}

TEST_CASE_FIXTURE(ReaderFixture, "chunks of odd length and unknown name ahead of the samples are passed over") {
    std::vector<float> samples;
    const std::string odd =
        chunk("LIST", "abc") + plainFormat(1, 1, 48000, 16) + chunk("junk", "x") + chunk("data", little(0x4000, 2));
    CHECK(outcome(wave(odd), &samples) == "");
    CHECK(samples == std::vector<float>{0.5F});
}

TEST_CASE_FIXTURE(ReaderFixture, "what is no WAV, no known coding or out of bounds is refused with what was expected") {
    struct Case {
        std::string bytes, text;
    };
    const std::string data = chunk("data", std::string(16, '\0'));
    const Case cases[] = {
        {"", "the file ends inside the RIFF header"},
        {"not a sound file at all", "expected \"RIFF\" and \"WAVE\""},
        {wave(data), "the samples come before their format"},
        {wave(plainFormat(1, 1, 48000, 16)), "the file ends inside the chunks ahead of \"data\""},
        {wave(plainFormat(1, 1, 48000, 16) + plainFormat(1, 1, 48000, 16) + data), "a second \"fmt \" chunk"},
        {wave(plainFormat(17, 1, 48000, 16) + data), "format tag 17"},
        {wave(plainFormat(1, 1, 48000, 12) + data), "with 12 bits"},
        {wave(plainFormat(1, 0, 48000, 16) + data), "has 0 channels"},
        {wave(plainFormat(1, 9, 48000, 16) + data), "has 9 channels"},
        {wave(plainFormat(1, 1, 0, 16) + data), "sample rate of 0 Hz"},
        {wave(plainFormat(1, 1, 1000000, 16) + data), "sample rate of 1000000 Hz"},
        {wave(chunk("fmt ", "short") + data), "the format chunk has 5 bytes"},
    };
    for (const Case &c : cases) {
        CAPTURE(c.text);
        CHECK(has(outcome(c.bytes), c.text));
    }
}

TEST_CASE_FIXTURE(ReaderFixture, "a file cut at any length ends in its samples or in a failure, never in invented samples") {
    const std::string whole = wave(plainFormat(1, 2, 48000, 16) + chunk("data", std::string(400, '\x11')));
    for (size_t length = 0; length < whole.size(); ++length) {
        CAPTURE(length);
        std::vector<float> samples;
        const std::string failure = outcome(whole.substr(0, length), &samples);
        CHECK(failure != "");
        CHECK(samples.size() <= 200);
    }
    CHECK(has(outcome(whole.substr(0, whole.size() - 8)), "truncated: it announces 100 frames and holds 98"));
    CHECK(outcome(whole) == "");
}

TEST_CASE_FIXTURE(ReaderFixture, "each byte of the header flipped leads to samples or to a failure") {
    const std::string good = wave(plainFormat(1, 2, 48000, 16) + chunk("data", std::string(64, '\x22')));
    size_t refused = 0;
    for (size_t offset = 0; offset < 44; ++offset)
        for (const int flip : {0x01, 0x80, 0xFF}) {
            std::string bytes = good;
            bytes[offset] = static_cast<char>(bytes[offset] ^ flip);
            std::vector<float> samples;
            if (outcome(bytes, &samples) != "") ++refused;
            CHECK(samples.size() <= 64);
        }
    CHECK(refused > 60);
}

TEST_CASE_FIXTURE(ReaderFixture, "count fields of 0, 1 and the largest value allocate nothing and invent nothing") {
    const std::string good = wave(plainFormat(1, 1, 48000, 16) + chunk("data", std::string(64, '\x22')));
    struct Field {
        size_t offset;
        int bytes;
    };
    for (const Field &field : {Field{4, 4}, Field{16, 4}, Field{22, 2}, Field{24, 4}, Field{32, 2}, Field{34, 2}, Field{40, 4}})
        for (const uint64_t value : {uint64_t{0}, uint64_t{1}, uint64_t{0x7FFFFFFF}, uint64_t{0xFFFFFFFF}}) {
            CAPTURE(field.offset);
            CAPTURE(value);
            std::string bytes = good;
            bytes.replace(field.offset, static_cast<size_t>(field.bytes), little(value, field.bytes));
            std::vector<float> samples;
            outcome(bytes, &samples);
            CHECK(samples.size() <= 32);
        }
}

TEST_CASE_FIXTURE(ReaderFixture, "a data size of the largest value means until the end of the file") {
    std::string bytes = wave(plainFormat(1, 1, 48000, 16) + chunk("data", std::string(64, '\x22')));
    bytes.replace(40, 4, little(UINT32_MAX, 4));
    std::vector<float> samples;
    CHECK(outcome(bytes, &samples) == "");
    CHECK(samples.size() == 32);
}

TEST_CASE_FIXTURE(ReaderFixture, "what the writer writes reads back: float to the bit, PCM to half a step") {
    const auto ramp = [](size_t frame, int channel) { return std::sin(0.37 * static_cast<double>(frame) + channel) * 1.1; };
    for (const auto type : {vx::SampleType::float32, vx::SampleType::pcm24, vx::SampleType::pcm16})
        for (const int channels : {1, 2, 6, 8}) {
            CAPTURE(channels);
            makeSound("out.wav", channels, channels == 6 ? 0x60FU : 0U, 501, ramp, type);
            const std::vector<float> samples = readSound("out.wav");
            REQUIRE(samples.size() == 501 * static_cast<size_t>(channels));
            const double step = type == vx::SampleType::pcm16 ? 0x1p-15 : type == vx::SampleType::pcm24 ? 0x1p-23 : 0.0;
            for (size_t i = 0; i < samples.size(); ++i) {
                const auto exact = static_cast<double>(static_cast<float>(
                    ramp(i / static_cast<size_t>(channels), static_cast<int>(i % static_cast<size_t>(channels)))));
                const double held = step == 0.0 ? exact : std::min(std::max(exact, -1.0), 1.0 - step);
                CHECK(std::fabs(static_cast<double>(samples[i]) - held) <= step / 2.0);
            }
        }
    CHECK(vx::openAudioFile(path("out.wav"))->format().mask == 0);
    makeSound("side.wav", 6, 0x60F, 3, ramp);
    CHECK(vx::openAudioFile(path("side.wav"))->format().mask == 0x60F);
}
