// SPDX-License-Identifier: MIT
//
// The sample engine with its fixed-point build behind it (host type 3): which of the two does what, and what changes while blocks
// run.
#include "commands.h"
#include "scene_list.h"

namespace golden {
namespace {

constexpr int32_t kComponents = 6;

Step hardwareMode(uint32_t mode) {
    return parameter(-1, -25, Bytes().u32(mode));
}

// Components count as disabled until somebody enables them.
Step allEnabled() {
    return [](VXHandle handle) {
        for (int32_t component = 0; component < kComponents; ++component) componentEnable(component, true)(handle);
    };
}

Step allOnModule(bool on) {
    return [=](VXHandle handle) {
        for (int32_t component = 0; component < kComponents; ++component) componentOnModule(component, on)(handle);
    };
}

Scene &addHybrid(List &list, const std::string &name, Step placement) {
    Scene &scene = list.add("hybrid, " + name);
    scene.hostType = 3;
    scene.prepare = all({moduleInBlock(), allEnabled(), everything(), std::move(placement)});
    scene.read = moduleState();
    return scene;
}

}  // namespace

void addHybrids(List &list) {
    for (int32_t component = 0; component < kComponents; ++component) {
        addHybrid(list, "component " + std::to_string(component) + " on the module", componentOnModule(component, true));
    }
    for (const uint32_t mask : {kStereo, kSurroundBack, kSevenOne}) {
        Scene &scene = addHybrid(list, "everything on the module, layout " + std::to_string(mask), allOnModule(true));
        scene.input = scene.output = mask;
    }
    for (const int frames : {1, 17, 512, 0}) {
        addHybrid(
            list,
            std::string("voice and bass on the module, ") + (frames == 0 ? "random cut" : "blocks of " + std::to_string(frames)),
            all({componentOnModule(0, true), componentOnModule(3, true)}))
            .blockFrames = frames;
    }
    for (const int rate : {44100, 96000}) {
        addHybrid(list, "everything on the module at " + std::to_string(rate), allOnModule(true)).sampleRate = rate;
    }
    addHybrid(list, "everything on the module, noise", allOnModule(true)).signal = Signal::noise;
    addHybrid(list, "everything on the module, overload", allOnModule(true)).signal = Signal::overload;
    addHybrid(list, "everything on the module, quiet", allOnModule(true)).signal = Signal::quiet;
    addHybrid(list, "everything on the module, denormals", allOnModule(true)).signal = Signal::denormals;
    addHybrid(list, "everything on the module, infinities", allOnModule(true)).signal = Signal::infinities;
    addHybrid(list, "over to the module halfway", allOnModule(false)).half = allOnModule(true);
    addHybrid(list, "back from the module halfway", allOnModule(true)).half = allOnModule(false);
    addHybrid(list, "bass off on the module", all({componentOnModule(3, true), componentEnable(3, false)}));
    addHybrid(list, "module leaves halfway", allOnModule(true)).half = hardwareMode(0);
    addHybrid(list, "module out of the block", all({hardwareMode(1), allOnModule(true)}));
    addHybrid(list, "module into the block halfway", all({hardwareMode(1), allOnModule(true)})).half = hardwareMode(3);
    addHybrid(list, "settings change halfway", allOnModule(true)).half =
        all({bass(0.1F), voice(1.0F), band(4, 700.0F, 1.5F, -8.0F)});
    addHybrid(list, "cleared halfway", allOnModule(true)).half = clear();
    Scene &swept = addHybrid(list, "sweep comes back", all({allOnModule(true), sweep(true, {})}));
    swept.signal = Signal::silence;
    swept.frames = 19200;
    swept.path = Return::bent;
    swept.read = readAll({moduleState(), sweepResult(0)});
}

}  // namespace golden
