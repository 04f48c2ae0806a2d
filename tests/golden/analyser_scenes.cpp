// SPDX-License-Identifier: MIT
//
// Meters and analysers: what they tell about programme and noise on both sides of the engine and on the capture side, and the bands
// that the library makes out of spectra of the caller's.
#include "commands.h"
#include "scene_list.h"

namespace golden {
namespace {

constexpr int32_t kBandsPerOctave[] = {1, 3, 6, 12, 24, 48, -24};
constexpr size_t kMostBands = 555;

Reading allMeters() {
    return readAll({meter(VXDSP_DATA_METER_RECORD), meter(VXDSP_DATA_METER_INPUT), meter(VXDSP_DATA_METER_OUTPUT)});
}

// The edges of a table are one more than its bands.
size_t bandsOf(int32_t bandsPerOctave) {
    const float power[2] = {};
    float bands[kMostBands];
    return static_cast<size_t>(VXDSPAPI_RTA_CalcSpectrum(power, 2, bands, 48000, bandsPerOctave, 0)) - 1;
}

Reading bandsRead(uint32_t index, uint32_t fftSize, int32_t bandsPerOctave, bool integrate) {
    return [=](VXHandle handle, Digest &digest) {
        const Bytes request = Bytes().u8(index).u8(0).u8(integrate ? 1 : 0).u32(fftSize).u32(static_cast<uint32_t>(bandsPerOctave));
        const Answer answer(handle, VXDSP_DATA_RTA_READ, request);
        const float *bands = answer.floats(0);
        for (size_t i = 0; i < bandsOf(bandsPerOctave); ++i) digest.add(bands[i]);
    };
}

// Each table, with and without integration.
Reading allBands(uint32_t index, uint32_t fftSize) {
    return [=](VXHandle handle, Digest &digest) {
        for (const int32_t bandsPerOctave : kBandsPerOctave) {
            for (const bool integrate : {false, true}) bandsRead(index, fftSize, bandsPerOctave, integrate)(handle, digest);
        }
    };
}

// `count` values from 0 to 1, some of them 0.
std::vector<float> spectrumOf(size_t count) {
    SignalSource noise(Signal::noise, 3);
    std::vector<float> power(count);
    for (float &value : power) {
        const float sample = noise.next();
        value = sample < -0.75F ? 0.0F : sample * sample;
    }
    return power;
}

Reading calculatedBands(int32_t fftSize, int32_t rate) {
    return [=](VXHandle, Digest &digest) {
        const std::vector<float> power = spectrumOf(static_cast<size_t>(fftSize) / 2 + 1);
        for (const int32_t bandsPerOctave : kBandsPerOctave) {
            for (const int32_t integrate : {0, 1}) {
                float bands[kMostBands] = {};
                const int32_t edges = VXDSPAPI_RTA_CalcSpectrum(power.data(), fftSize, bands, rate, bandsPerOctave, integrate);
                digest.add(static_cast<uint32_t>(edges));
                for (const float band : bands) digest.add(band);
            }
        }
    };
}

// A table of the caller's, with bands narrower and wider than a bin and some above half of the rate.
Reading bandsOfOwnTable(int32_t halfSize, int32_t rate) {
    return [=](VXHandle, Digest &digest) {
        const std::vector<float> power = spectrumOf(static_cast<size_t>(halfSize) + 1);
        std::vector<float> edges{0.0F};
        std::vector<float> centres;
        for (float width = 0.5F; edges.size() < 100; width *= 1.0625F) {
            centres.push_back(edges.back() + width * 0.5F);
            edges.push_back(edges.back() + width);
        }
        for (const int32_t integrate : {0, 1}) {
            std::vector<float> bands(centres.size());
            VXDSPAPI_RTA_FFTToBands(power.data(), halfSize, edges.data(), centres.data(), static_cast<int32_t>(edges.size()),
                                    bands.data(), rate, integrate);
            for (const float band : bands) digest.add(band);
        }
    };
}

}  // namespace

void addMeters(List &list) {
    for (const uint32_t mask : {kMono, kStereo, kSurroundBack, kSevenOne}) {
        for (const int frames : {1, 3, 17, 480, 511}) {
            Scene &scene = list.add("meters, layout " + std::to_string(mask) + ", blocks of " + std::to_string(frames));
            scene.input = scene.output = scene.capture = mask;
            scene.blockFrames = frames;
            scene.frames = 2400;
            scene.path = Return::straight;
            scene.prepare = outputGain(0.7F);
            scene.read = allMeters();
        }
    }
    constexpr struct {
        const char *name;
        Signal signal;
    } kSignals[] = {{"silence", Signal::silence},
                    {"denormals", Signal::denormals},
                    {"infinities", Signal::infinities},
                    {"overload", Signal::overload}};
    for (const auto &entry : kSignals) {
        Scene &scene = list.add(std::string("meters, ") + entry.name);
        scene.signal = entry.signal;
        scene.path = Return::inverted;
        scene.read = allMeters();
    }
}

void addAnalysers(List &list) {
    for (const uint32_t fftSize : {2U, 16U, 256U, 1024U, 2048U, 8192U, 65536U}) {
        for (const uint32_t index : {0U, 1U, 2U}) {
            Scene &scene = list.add("analyser " + std::to_string(index) + ", transform of " + std::to_string(fftSize));
            scene.frames = fftSize == 65536 ? 40000 : 9600;
            scene.signal = index == 1 ? Signal::noise : Signal::programme;
            scene.path = Return::bent;
            scene.prepare = analyser(index, true);
            scene.read = allBands(index, fftSize);
        }
    }
    for (const uint32_t choice : {0U, 1U, 2U, 9U}) {
        Scene &scene = list.add("analysers listening to " + std::to_string(choice));
        scene.input = scene.output = scene.capture = kSevenOne;
        scene.blockFrames = 0;
        scene.path = Return::straight;
        scene.prepare = all({analyserChoice(choice), analyser(0, true), analyser(1, true), analyser(2, true)});
        scene.read = readAll({bandsRead(0, 4096, 3, true), bandsRead(1, 4096, 24, true), bandsRead(2, 4096, 48, false)});
    }
    Scene &whole = list.add("analyser with a frame as long as its ring");
    whole.sampleRate = 8192;
    whole.prepare = analyser(0, true);
    whole.read = readAll({bandsRead(0, 8192, 12, true), bandsRead(0, 16384, 12, true), bandsRead(0, 16384, 12, false)});
    Scene &switched = list.add("analyser off and on halfway");
    switched.prepare = analyser(0, true);
    switched.half = all({analyser(0, false), analyser(0, true)});
    switched.read = allBands(0, 2048);
    Scene &loud = list.add("analyser of infinities");
    loud.signal = Signal::infinities;
    loud.prepare = analyser(0, true);
    loud.read = allBands(0, 4096);

    for (const int32_t fftSize : {2, 64, 1024, 65536}) {
        for (const int32_t rate : {8000, 44100, 48000, 192000}) {
            Scene &scene = list.add("bands of a spectrum of " + std::to_string(fftSize) + " at " + std::to_string(rate));
            scene.frames = 480;
            scene.read = calculatedBands(fftSize, rate);
        }
    }
    for (const int32_t halfSize : {1, 100, 4096}) {
        Scene &scene = list.add("bands of a table of the caller's over " + std::to_string(halfSize));
        scene.frames = 480;
        scene.read = bandsOfOwnTable(halfSize, 48000);
    }
}

}  // namespace golden
