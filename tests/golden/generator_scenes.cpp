// SPDX-License-Identifier: MIT
//
// The test signals, as they come out of the sample engine: noise, sine, sweep and polarity tone.
#include "commands.h"
#include "scene_list.h"

namespace golden {
namespace {

constexpr int kLengths[] = {1, 7, 480, 511, 0};

std::string lengthName(int frames) {
    return frames == 0 ? ", random cut" : ", blocks of " + std::to_string(frames);
}

void addNoise(List &list) {
    for (const int frames : kLengths) {
        for (const bool white : {true, false}) {
            Scene &scene = list.add((white ? "white noise" : "pink noise") + lengthName(frames));
            scene.input = scene.output = kSevenOne;
            scene.blockFrames = frames;
            scene.prepare = white ? whiteNoise(true) : pinkNoise(true);
        }
    }
    Scene &change = list.add("white noise, then pink");
    change.prepare = all({whiteNoise(true), pinkNoise(true)});
    change.half = whiteNoise(false);
    Scene &engine = list.add("pink noise through every stage");
    engine.input = engine.output = kSevenOne;
    engine.prepare = all({everything(), pinkNoise(true)});
    Scene &fixed = list.add("pink noise, fixed point");
    fixed.platform = "HiFi2";
    fixed.prepare = pinkNoise(true);
}

void addSines(List &list) {
    for (const uint32_t frequency : {1U, 20U, 440U, 997U, 1000U, 12345U, 20000U, 23999U, 65535U}) {
        Scene &scene = list.add("sine of " + std::to_string(frequency) + " Hz");
        scene.prepare = sine(true, frequency);
    }
    for (const int frames : kLengths) {
        Scene &scene = list.add("sine" + lengthName(frames));
        scene.input = scene.output = kSevenOne;
        scene.blockFrames = frames;
        scene.prepare = sine(true, 0);
        scene.half = sine(true, 3000);
    }
    for (const int rate : {8000, 44100, 192000}) {
        Scene &scene = list.add("sine at rate " + std::to_string(rate));
        scene.sampleRate = rate;
        scene.prepare = sine(true, 1000);
        scene.half = sine(true, 100);
    }
    Scene &stopped = list.add("sine until half");
    stopped.prepare = sine(true, 500);
    stopped.half = sine(false, 0);
}

void addSweeps(List &list) {
    for (const uint32_t bandsPerOctave : {1U, 3U, 6U, 12U, 24U, 48U, 5U}) {
        Sweep values;
        values.bandsPerOctave = bandsPerOctave;
        Scene &scene = list.add("sweep over " + std::to_string(bandsPerOctave) + " bands an octave");
        scene.frames = 14400;
        scene.prepare = sweep(true, values);
    }
    for (const int frames : kLengths) {
        Scene &scene = list.add("sweep on two channels" + lengthName(frames));
        scene.input = scene.output = kSevenOne;
        scene.blockFrames = frames;
        scene.frames = 14400;
        scene.prepare = all({sweep(true, {0, 20, 20000, 150, 30, 10, 24}), sweep(true, {5, 500, 8000, 250, 0, 0, 3})});
    }
    for (const int rate : {8000, 44100, 192000}) {
        Scene &scene = list.add("sweep at rate " + std::to_string(rate));
        scene.sampleRate = rate;
        scene.frames = rate / 5;
        scene.prepare = sweep(true, {1, 50, 15000, 150, 20, 10, 12});
    }
    Scene &stopped = list.add("sweep until half");
    stopped.prepare = sweep(true, {});
    stopped.half = sweep(false, {});
    Scene &again = list.add("sweep armed again halfway");
    again.prepare = sweep(true, {});
    again.half = sweep(true, {0, 1000, 2000, 30, 10, 5, 48});
}

void addTones(List &list) {
    for (const uint32_t milliseconds : {0U, 1U, 10U, 100U}) {
        Scene &scene = list.add("polarity tone of twice " + std::to_string(milliseconds) + " ms");
        scene.input = scene.output = kSevenOne;
        scene.frames = 12000;
        scene.prepare = all({polarity(0, milliseconds), polarity(7, milliseconds + 3)});
    }
    for (const int frames : kLengths) {
        Scene &scene = list.add("polarity tone" + lengthName(frames));
        scene.blockFrames = frames;
        scene.prepare = polarity(1, 20);
    }
}

}  // namespace

void addGenerators(List &list) {
    addNoise(list);
    addSines(list);
    addSweeps(list);
    addTones(list);
}

}  // namespace golden
