// SPDX-License-Identifier: MIT
//
// The capture side: its filters, and what it finds when the render side's sweep and polarity tone come back.
#include "commands.h"
#include "scene_list.h"

namespace golden {
namespace {

constexpr struct {
    const char *name;
    Return path;
} kWays[] = {{"straight", Return::straight}, {"upside down", Return::inverted}, {"bent", Return::bent}};

void addFilters(List &list) {
    for (const int taps : {1, 2, 33, 127, 512, 4096}) {
        for (const int frames : {480, 0}) {
            Scene &scene =
                list.add("captures through " + std::to_string(taps) + " taps, " + (frames == 0 ? "random cut" : "blocks of 480"));
            scene.capture = kSevenOne;
            scene.input = scene.output = kSevenOne;
            scene.blockFrames = frames;
            scene.frames = 9600;
            scene.path = Return::straight;
            scene.prepare =
                all({recordFirLoad(0, taps), recordFirEnable(0, true), recordFirLoad(3, taps), recordFirEnable(3, true)});
            scene.read = meter(VXDSP_DATA_METER_RECORD);
        }
    }
    Scene &off = list.add("captures, filter off halfway");
    off.path = Return::straight;
    off.prepare = all({recordFirLoad(1, 300), recordFirEnable(1, true)});
    off.half = recordFirEnable(1, false);
    Scene &reloaded = list.add("captures, filters replaced halfway");
    reloaded.path = Return::straight;
    reloaded.prepare = all({recordFirLoad(0, 256), recordFirEnable(0, true), recordFirLoad(1, 256), recordFirEnable(1, true)});
    reloaded.half = all({recordFirLoad(0, 64), recordFirLoad(1, 256)});
    Scene &unfiltered = list.add("captures as they are, fixed point");
    unfiltered.platform = "HiFi2";
    unfiltered.path = Return::bent;
    Scene &noise = list.add("captures of pink noise");
    noise.path = Return::straight;
    noise.prepare = all({recordFirLoad(0, 100), recordFirEnable(0, true), pinkNoise(true)});
}

Scene &addSweep(List &list, const std::string &name, const Sweep &values) {
    Scene &scene = list.add("sweep comes back " + name);
    scene.signal = Signal::silence;
    scene.frames = 19200;
    scene.path = Return::straight;
    scene.returnDelay = 100;
    scene.prepare = sweep(true, values);
    scene.read = sweepResult(values.channel);
    return scene;
}

void addSweeps(List &list) {
    for (const auto &way : kWays) addSweep(list, way.name, {}).path = way.path;
    for (const int frames : {1, 31, 441, 512, 0}) {
        Scene &scene = addSweep(list, frames == 0 ? "in a random cut" : "in blocks of " + std::to_string(frames), {});
        scene.blockFrames = frames;
        scene.path = Return::bent;
    }
    for (const int delay : {0, 1, 479, 2000}) {
        Scene &scene = addSweep(list, std::to_string(delay) + " frames later", {1, 200, 5000, 200, 60, 50, 24});
        scene.returnDelay = delay;
        scene.path = Return::bent;
    }
    for (const uint32_t bandsPerOctave : {1U, 3U, 6U, 24U, 48U}) {
        addSweep(list, "over " + std::to_string(bandsPerOctave) + " bands an octave", {0, 40, 18000, 250, 40, 20, bandsPerOctave})
            .path = Return::bent;
    }
    for (const int rate : {8000, 44100, 192000}) {
        Scene &scene = addSweep(list, "at rate " + std::to_string(rate), {});
        scene.sampleRate = rate;
        scene.frames = rate * 2 / 5;
    }
    Scene &programme = addSweep(list, "through every stage", {});
    programme.path = Return::bent;
    programme.prepare = all({everything(), sweep(true, {})});
}

void addTones(List &list) {
    for (const auto &way : kWays) {
        for (const uint32_t milliseconds : {5U, 20U, 60U}) {
            Scene &scene = list.add("polarity tone of twice " + std::to_string(milliseconds) + " ms comes back " + way.name);
            scene.signal = Signal::silence;
            scene.frames = 9600;
            scene.path = way.path;
            scene.returnDelay = 333;
            scene.blockFrames = milliseconds == 20 ? 0 : 480;
            scene.prepare = all({polarity(0, milliseconds), polarity(1, milliseconds)});
            scene.read = readAll({polarityResult(0), polarityResult(1)});
        }
    }
    Scene &programme = list.add("polarity of programme");
    programme.path = Return::straight;
    programme.prepare = polarity(1, 0);
    programme.read = polarityResult(1);
}

}  // namespace

void addCaptures(List &list) {
    addFilters(list);
    addSweeps(list);
    addTones(list);
}

}  // namespace golden
