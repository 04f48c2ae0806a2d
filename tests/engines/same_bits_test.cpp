// SPDX-License-Identifier: MIT
//
// One digest for each of a set of scenes, the same for every compiler, optimisation and system. The digests stand here as they were
// first computed; a change of the sound on purpose changes them, and nothing else may. `--test-case="*digest*" -s` prints them all.
#include <doctest/doctest.h>

#include "engine_rig.h"

namespace {

struct Scene {
    const char *name;
    uint32_t mask;
    int rate;
    float level;
    void (*set)(EngineRig &);
    void (*change)(EngineRig &, int step);  // at every 4,800th frame
    uint64_t digest;
};

void leave(EngineRig &, int) {}
void noSettings(EngineRig &) {}

const Scene kScenes[] = {
    {"neutral stereo", kStereo, 48000, 0.9F, noSettings, leave, 0x2A97569F3A335E6D},
    {"neutral, too loud", kSevenOne, 48000, 3.0F, noSettings, leave, 0x796BFF0C089B1EE3},
    {"bass", kStereo, 48000, 0.3F, [](EngineRig &rig) { rig.setBass(2.0F); }, leave, 0x1B173EB1D2821E4C},
    {"voice at 44.1 kHz", kStereo, 44100, 0.3F, [](EngineRig &rig) { rig.setVoice(3.98F); }, leave, 0xFE2472D730B36911},
    {"detail at 96 kHz", kStereo, 96000, 0.3F, [](EngineRig &rig) { rig.setDetail(0.7F); }, leave, 0x20ADB6F1F2646693},
    {"surround, 5.1", 0x3F, 48000, 0.3F, [](EngineRig &rig) { rig.setSurround(1.3F); }, leave, 0x180E957FA7F46C77},
    {"one band", kStereo, 48000, 0.3F, [](EngineRig &rig) { rig.setBand(6, 1, 1000.0F, 1.44F, 6.0F); }, leave, 0xE9ADF369C303E727},
    {"ten bands at 192 kHz", kStereo, 192000, 0.3F,
     [](EngineRig &rig) {
         for (int band = 1; band <= 10; ++band)
             rig.setBand(band, 1, 40.0F * static_cast<float>(band * band), 0.5F, 9.0F - 2.0F * static_cast<float>(band));
     },
     leave, 0x83223FC55D8ECDF5},
    {"everything, 7.1", kSevenOne, 48000, 0.8F, setEverything, leave, 0x3BD92D4ACFC83A59},
    {"everything, mono at 8 kHz", 0x4, 8000, 0.8F, setEverything, leave, 0xEB2899F3BD9CA98A},
    {"limited by 24 dB", kStereo, 48000, 1.0F, [](EngineRig &rig) { rig.setInputGain(16.0F); }, leave, 0x30B1F8727D52FB1E},
    {"sliders moving", 0x33, 48000, 0.5F, setEverything,
     [](EngineRig &rig, int step) {
         rig.setBass(static_cast<float>(step % 3));
         rig.setVoice(static_cast<float>(step % 5) * 0.7F);
         rig.setSurround(static_cast<float>(step % 2));
     },
     0xF9E9609CC3B1E747},
    {"bands moving", kStereo, 44100, 0.5F, setEverything,
     [](EngineRig &rig, int step) {
         rig.setBand(step % 10 + 1, 1, 100.0F * static_cast<float>(step + 1), 2.0F, static_cast<float>(step % 13) - 6.0F);
     },
     0xA39BE255934553FA},
    {"bypass on and off", kStereo, 48000, 0.5F, setEverything, [](EngineRig &rig, int step) { rig.setBypass(step % 2 != 0); },
     0x76E6A3DE5529143C},
    {"components on and off", 0x60F, 48000, 0.5F, setEverything,
     [](EngineRig &rig, int step) { rig.setSwitch(step % 6, -6, step % 4 > 1); }, 0x4FFCF18A8F5FFB5D},
    {"gains and their switches", kStereo, 48000, 0.5F, setEverything,
     [](EngineRig &rig, int step) {
         rig.setInputGain(static_cast<float>(step % 4));
         rig.setSwitch(-1, -29, step % 3 == 0);
         rig.setSwitch(-1, -30, step % 5 == 0);
     },
     0x6976B4A00D90F17A},
};

uint64_t digestOf(const Stream &stream) {
    uint64_t digest = 14695981039346656037u;  // FNV-1a
    for (const auto &plane : stream)
        for (const float sample : plane) {
            uint32_t bits = 0;
            std::memcpy(&bits, &sample, 4);
            for (int byte = 0; byte < 4; ++byte) digest = (digest ^ (bits >> (8 * byte) & 0xFF)) * 1099511628211u;
        }
    return digest;
}

std::string hexadecimal(uint64_t value) {
    std::string text = "0x";
    for (int shift = 60; shift >= 0; shift -= 4) text += "0123456789ABCDEF"[value >> shift & 15];
    return text;
}

}  // namespace

TEST_CASE("each scene has its digest, the same for every compiler and system") {
    for (const Scene &scene : kScenes) {
        EngineRig rig;
        REQUIRE(rig.setFormat(scene.mask, scene.rate) == 0);
        scene.set(rig);
        const Stream out = rig.run(testSignal(48000, scene.level), evenCuts(480), [&](int position) {
            if (position % 4800 == 0) scene.change(rig, position / 4800);
        });
        CAPTURE(std::string(scene.name));
        CHECK(hexadecimal(digestOf(out)) == hexadecimal(scene.digest));
    }
}
