// SPDX-License-Identifier: MIT
//
// The list that scenes gather in, and the groups that stand in files of their own.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "scene.h"

namespace golden {

class List {
  public:
    // Adds a scene; the caller changes what is special about it.
    Scene &add(std::string name) {
        Scene scene;
        scene.name = std::move(name);
        scenes_.push_back(std::move(scene));
        return scenes_.back();
    }
    std::vector<Scene> take() { return std::move(scenes_); }

  private:
    std::vector<Scene> scenes_;
};

// Every test signal of the host's, with its settings. Noise is among them.
void addGenerators(List &list);
// What the meters hold.
void addMeters(List &list);
// The bands of the analysers, and those of spectra of the caller's.
void addAnalysers(List &list);
// The capture side: filters, sweeps and tones that come back from the render side.
void addCaptures(List &list);
// The sample engine beside its fixed-point build, component by component.
void addHybrids(List &list);

}  // namespace golden
