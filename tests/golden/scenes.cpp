// SPDX-License-Identifier: MIT
//
// The list of scenes: here those of the block path, in files beside this one those of the measuring tools and the hybrid chain. A
// new scene goes to the end of its group; one with noise of the host's own goes behind all others that have some, since its
// sequence runs on from scene to scene.
#include <utility>

#include "scene_list.h"
#include "steps.h"

namespace golden {
namespace {

struct NamedLayout {
    const char *name;
    uint32_t mask;
};

constexpr NamedLayout kLayouts[] = {
    {"mono", kMono},         {"stereo", kStereo},         {"2.1", kStereoBass},
    {"3.0", kFront},         {"quad back", kQuadBack},    {"quad side", kQuadSide},
    {"5.0 back", kFiveBack}, {"5.1 back", kSurroundBack}, {"5.1 side", kSurroundSide},
    {"6.1", kSixSpeakers},   {"7.1", kSevenOne},          {"7.1 wide", kSevenOneWide},
};

void addLayouts(List &list) {
    for (const NamedLayout &layout : kLayouts) {
        Scene &scene = list.add(std::string("layout ") + layout.name);
        scene.input = scene.output = layout.mask;
        scene.prepare = everything();
    }
}

void addBlockLengths(List &list) {
    for (const int frames : {1, 2, 3, 7, 15, 16, 17, 31, 64, 127, 128, 255, 256, 441, 480, 511, 512, 513, 600}) {
        Scene &scene = list.add("block length " + std::to_string(frames));
        scene.input = scene.output = kSurroundBack;
        scene.blockFrames = frames;
        scene.frames = 2048;
        scene.prepare = everything();
    }
    for (uint32_t seed = 1; seed <= 4; ++seed) {
        Scene &scene = list.add("random cut " + std::to_string(seed));
        scene.input = scene.output = seed % 2 == 0 ? kSevenOne : kStereo;
        scene.platform = seed > 2 ? "HiFi2" : nullptr;
        scene.blockFrames = 0;
        scene.cutSeed = seed;
        scene.prepare = everything();
    }
}

void addPlatforms(List &list) {
    for (const char *platform : {"Float", "HiFi2", "iSST", "AIC326x"}) {
        for (const uint32_t mask : {kStereo, kSevenOne}) {
            Scene &scene = list.add(std::string("platform ") + platform + (mask == kStereo ? " stereo" : " 7.1"));
            scene.platform = platform;
            scene.input = scene.output = mask;
            scene.signal = mask == kStereo ? Signal::noise : Signal::programme;
            scene.prepare = mask == kStereo ? Step() : everything();
        }
    }
}

void addRates(List &list) {
    for (const int rate : {8000, 16000, 44100, 96000, 192000}) {
        Scene &scene = list.add("rate " + std::to_string(rate));
        scene.sampleRate = rate;
        scene.prepare = everything();
    }
}

void addSettings(List &list) {
    const auto add = [&](const char *name, Step prepare, Step half = nullptr) {
        Scene &scene = list.add(std::string("setting ") + name);
        scene.prepare = std::move(prepare);
        scene.half = std::move(half);
    };
    add("none", nullptr);
    add("power off", all({everything(), power(false)}));
    add("power back on", all({everything(), power(false)}), power(true));
    add("bypass", all({everything(), bypass(true)}));
    add("bypass lifted", all({everything(), bypass(true)}), bypass(false));
    add("bass half", bass(0.5F));
    add("bass full", bass(1.0F));
    add("bass rising", bass(0.0F), bass(1.0F));
    add("detail half", detail(0.5F));
    add("detail full", detail(1.0F));
    add("voice half", voice(0.5F));
    add("voice full", voice(1.0F));
    add("surround half", surround(0.5F));
    add("surround full", surround(1.0F));
    add("surround falling", surround(1.0F), surround(0.0F));
    for (int index = 0; index < 10; ++index) {
        constexpr float kFrequencies[10] = {31, 62, 125, 250, 500, 1000, 2000, 4000, 8000, 1600};
        const float decibels = index % 2 == 0 ? 6.0F : -9.0F;
        add(("equaliser band " + std::to_string(index)).c_str(), band(index, kFrequencies[index], 1.44F, decibels));
    }
    add("equaliser off", all({everything(), equaliser(false)}));
    add("input gain", inputGain(0.5F));
    add("output gain", outputGain(1.5F));
    add("gains off",
        all({inputGain(2.0F), outputGain(0.25F), parameter(-1, -29, Bytes().u8(1)), parameter(-1, -30, Bytes().u8(1))}));
    add("limiter at work", all({inputGain(8.0F), bass(1.0F)}));
    add("component off", all({everything(), componentEnable(3, false)}));
    add("component disposed", all({everything(), disposeComponent(2)}), createComponent(2));
    add("cleared halfway", everything(), clear());
    add("everything changes halfway", everything(), all({bass(0.0F), voice(1.0F), band(2, 500.0F, 0.7F, -3.0F), outputGain(0.3F)}));
}

void addFolds(List &list) {
    constexpr struct {
        const char *name;
        uint32_t from;
        uint32_t to;
    } kFolds[] = {
        {"7.1 to stereo", kSevenOne, kStereo},          {"5.1 back to stereo", kSurroundBack, kStereo},
        {"5.1 side to stereo", kSurroundSide, kStereo}, {"7.1 to 5.1 side", kSevenOne, kSurroundSide},
        {"7.1 to quad back", kSevenOne, kQuadBack},     {"7.1 to mono", kSevenOne, kMono},
        {"stereo to bass alone", kStereo, 0x8},         {"stereo to no speaker", kStereo, 0},
        {"5.1 back to 3.0", kSurroundBack, kFront},
    };
    for (const auto &fold : kFolds) {
        Scene &scene = list.add(std::string("fold ") + fold.name);
        scene.presetPath = "C:\\ProgramData\\none.preset";
        scene.input = fold.from;
        scene.output = fold.to;
        scene.signal = Signal::noise;
        scene.blockFrames = 511;
    }
    Scene &engine = list.add("fold ahead of the engine");
    engine.input = kStereo;
    engine.output = kStereo;
    engine.signal = Signal::noise;
    engine.prepare = everything();
    list.add("no format yet").unformatted = true;
}

void addSignals(List &list) {
    constexpr struct {
        const char *name;
        Signal signal;
    } kSignals[] = {
        {"noise", Signal::noise},           {"threshold", Signal::threshold},  {"quiet", Signal::quiet},
        {"impulses", Signal::impulses},     {"full scale", Signal::fullScale}, {"overload", Signal::overload},
        {"direct current", Signal::direct}, {"denormals", Signal::denormals},  {"not a number", Signal::notANumber},
        {"infinities", Signal::infinities},
    };
    for (const auto &entry : kSignals) {
        for (const char *platform : {static_cast<const char *>(nullptr), "HiFi2"}) {
            Scene &scene = list.add(std::string("signal ") + entry.name + (platform == nullptr ? "" : ", fixed point"));
            scene.signal = entry.signal;
            scene.platform = platform;
            scene.frames = 2400;
            if (entry.signal == Signal::noise || entry.signal == Signal::overload) scene.prepare = everything();
        }
    }
    for (const int frames : {100, 512}) {
        Scene &scene = list.add("silence beyond a second, blocks of " + std::to_string(frames));
        scene.signal = Signal::silence;
        scene.sampleRate = 8000;
        scene.blockFrames = frames;
        scene.frames = 9000;
        scene.prepare = everything();
    }
}

void addModule(List &list) {
    for (const int32_t hostType : {2, 3, 4}) {
        Scene &scene = list.add("second engine, host type " + std::to_string(hostType));
        scene.hostType = hostType;
        scene.input = scene.output = kSevenOne;
        scene.prepare = all({moduleInBlock(), everything()});
    }
    Scene &shared = list.add("second engine does the bass");
    shared.hostType = 3;
    shared.prepare = all({moduleInBlock(), everything(), componentOnModule(3, true)});
}

void addHostNoise(List &list) {
    for (const int frames : {1, 480, 511}) {
        Scene &scene = list.add("pink noise on the first channel, blocks of " + std::to_string(frames));
        scene.input = scene.output = kSurroundSide;
        scene.blockFrames = frames;
        scene.prepare = pinkOnFirstChannel(true);
    }
    Scene &stopped = list.add("pink noise until half");
    stopped.prepare = pinkOnFirstChannel(true);
    stopped.half = pinkOnFirstChannel(false);
    for (const int taps : {1, 2, 127, 512, 4096}) {
        Scene &scene = list.add("pink noise through a filter of " + std::to_string(taps) + " taps");
        scene.blockFrames = taps == 127 ? 0 : 480;
        scene.prepare = all({firLoad(taps), firEnable(true), pinkOnFirstChannel(true)});
    }
    Scene &reloaded = list.add("pink noise, filter replaced halfway");
    reloaded.prepare = all({firLoad(256), firEnable(true), pinkOnFirstChannel(true)});
    reloaded.half = firLoad(64);
}

}  // namespace

std::vector<Scene> allScenes() {
    List list;
    addLayouts(list);
    addBlockLengths(list);
    addPlatforms(list);
    addRates(list);
    addSettings(list);
    addFolds(list);
    addSignals(list);
    addModule(list);
    addHostNoise(list);
    addGenerators(list);
    addMeters(list);
    addAnalysers(list);
    addCaptures(list);
    addHybrids(list);
    return list.take();
}

}  // namespace golden
