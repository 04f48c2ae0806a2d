// SPDX-License-Identifier: MIT
//
// The library's steady test signals by name: "white", "pink", "sine", or none. Switched on over the host's commands.
#pragma once

#include <string>

#include "tools/vx_measure/rig.h"

namespace CLI {
class App;
}

namespace vx {

struct TestSignal {
    std::string name = "pink";
    int frequencyHz = 1000;  // of the sine
    std::string input;       // a sound file that plays instead

    // "pink noise", "sine of 1000 Hz" or the file.
    std::string text() const;
};

void addTestSignal(CLI::App &verb, TestSignal &signal);

// Switches the signal on; nothing for a file, which the rig plays.
void switchOn(Rig &rig, const TestSignal &signal);

}  // namespace vx
