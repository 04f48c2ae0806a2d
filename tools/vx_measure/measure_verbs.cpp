// SPDX-License-Identifier: MIT
#include "tools/vx_measure/measure_verbs.h"

#include <CLI/CLI.hpp>

namespace vx {

void addMeasureVerbs(CLI::App &app, int &exitStatus) {
    CLI::App *measure = app.add_subcommand("measure", "Measure a chain: distortion, polarity, spectrum, levels, load, equaliser");
    measure->require_subcommand(1);
    measure->footer(
        "The chain is simulated (--plant) or real: --play writes what the host plays, --recorded reads what a microphone heard.\n"
        "Exit status: 0 measured; 1 nothing could be measured; 2 usage; 3 an input is not usable; 4 the system refused.\n"
        "vx measure VERB --help tells more.\n"
        "Examples:\n"
        "  vx measure sweep --plant delay=12ms,h2=-40dB,noise=-70dB --plot distortion.png\n"
        "  vx measure polarity --play tone.wav      (play it and record it)\n"
        "  vx measure polarity --recorded heard.wav");
    addSweepVerb(*measure, exitStatus);
    addPolarityVerb(*measure, exitStatus);
    addSpectrumVerb(*measure, exitStatus);
    addMeterVerb(*measure, exitStatus);
    addLoadVerb(*measure, exitStatus);
    addEqualiserVerb(*measure, exitStatus);
}

}  // namespace vx
