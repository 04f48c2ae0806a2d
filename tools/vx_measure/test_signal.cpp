// SPDX-License-Identifier: MIT
#include "tools/vx_measure/test_signal.h"

#include <VXDSPAPI.h>
#include <CLI/CLI.hpp>

#include "tools/vx/text.h"
#include "tools/vx_measure/data_bytes.h"

namespace vx {

std::string TestSignal::text() const {
    if (!input.empty()) return input;
    if (name == "sine") return textf("sine of %d Hz", frequencyHz);
    return name == "silence" ? name : name + " noise";
}

void addTestSignal(CLI::App &verb, TestSignal &signal) {
    const char *group = "Signal";
    CLI::Option *name = verb.add_option("--signal", signal.name, "What the host plays: white, pink, sine or silence")
                            ->check(CLI::IsMember({"white", "pink", "sine", "silence"}))
                            ->capture_default_str()
                            ->type_name("NAME")
                            ->group(group);
    verb.add_option("--frequency", signal.frequencyHz, "Frequency of the sine in Hz")
        ->check(CLI::Range(1, 65535))
        ->capture_default_str()
        ->type_name("HZ")
        ->group(group);
    verb.add_option("--input", signal.input, "A sound file that plays instead of a signal")
        ->excludes(name)
        ->type_name("FILE")
        ->group(group);
}

void switchOn(Rig &rig, const TestSignal &signal) {
    if (!signal.input.empty() || signal.name == "silence") return;
    if (signal.name == "sine" && signal.frequencyHz >= rig.rate() / 2)
        throw Failure(ExitStatus::usage,
                      textf("--frequency %d: expected less than half the sample rate, %d Hz", signal.frequencyHz, rig.rate() / 2));
    DataWriter bytes;
    bytes.u8(1);
    if (signal.name == "sine") bytes.u16(static_cast<uint32_t>(signal.frequencyHz));
    rig.command(signal.name == "white"  ? VXDSP_DATA_WHITE_NOISE
                : signal.name == "pink" ? VXDSP_DATA_PINK_NOISE
                                        : VXDSP_DATA_SINE,
                bytes.bytes());
}

}  // namespace vx
