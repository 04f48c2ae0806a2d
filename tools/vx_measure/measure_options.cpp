// SPDX-License-Identifier: MIT
#include "tools/vx_measure/measure_options.h"

#include <vxcomn/block.h>

#include "tools/vx/audio_file.h"
#include "tools/vx/verb.h"

namespace vx {

std::string MeasureOptions::chainText() const {
    if (!recorded.empty()) return recorded;
    return plant.empty() ? "a wire" : plant;
}

void addEngineAndFormat(CLI::App &verb, MeasureOptions &options) {
    const char *group = "Engine and format";
    verb.add_option("--engine", options.engine, "Engine module, without its ending")
        ->capture_default_str()
        ->type_name("NAME")
        ->group(group);
    verb.add_option("--set", options.settings,
                    "A setting of the engine by name, as for vx run; may be repeated. Without any the engine is bypassed")
        ->allow_extra_args(false)
        ->type_name("NAME=VALUE")
        ->group(group);
    verb.add_option("--layout", options.layout, "Speaker layout, such as stereo, or a speaker mask; one channel if not given")
        ->type_name("LAYOUT")
        ->group(group);
    verb.add_option("--rate", options.rate, "Sample rate in Hz; 48000, or the recording's, if not given")
        ->check(CLI::Range(8000, kHighestRate))
        ->type_name("HZ")
        ->group(group);
    verb.add_option("--block", options.block, "Frames a block")
        ->check(CLI::Range(1, int{VX_MAX_FRAMES}))
        ->capture_default_str()
        ->type_name("N")
        ->group(group);
}

void addChain(CLI::App &verb, MeasureOptions &options) {
    const char *group = "Chain";
    verb.add_option("--plant", options.plant, "Simulate the chain by these parts, see below; a wire if not given")
        ->type_name("PARTS")
        ->group(group);
    verb.add_option("--seed", options.seed, "Seed of the simulated noise")->capture_default_str()->type_name("N")->group(group);
    verb.add_option("--play", options.play,
                    "Write what the host plays as a WAV. Alone it measures nothing: play the file, record it, come back with "
                    "--recorded and the same options")
        ->type_name("FILE")
        ->group(group);
    verb.add_option("--recorded", options.recorded,
                    "Measure what a microphone recorded of it. A mono recording is that of the measured channel")
        ->type_name("FILE")
        ->group(group);
}

void addResults(CLI::App &verb, MeasureOptions &options) {
    const char *group = "Results";
    verb.add_option("--csv", options.csv, "Write the numbers as CSV; - for standard output")->type_name("FILE")->group(group);
    verb.add_option("--plot", options.plots,
                    "Draw the result into a .svg or .png, with the numbers as .csv beside it; may be repeated")
        ->allow_extra_args(false)
        ->type_name("FILE")
        ->group(group);
    verb.add_flag("--force", options.force, "Write over files that exist")->group(group);
    addCommonOptions(verb, options.common);
}

void checkMeasureOptions(const MeasureOptions &options) {
    const auto fail = [](const std::string &what) { throw Failure(ExitStatus::usage, what); };
    if (!options.plant.empty() && !options.recorded.empty())
        fail("--plant and --recorded exclude each other: the chain is simulated or was recorded");
    if (options.csv == "-" && options.common.json) fail("--json and --csv - both want standard output; write the CSV to a file");
    if (options.play == "-") fail("--play - is not possible; name a file");
    if (options.onlyPlays() && (!options.csv.empty() || !options.plots.empty()))
        fail("--play alone only writes a file; --csv and --plot need a result: give --recorded or --plant");
}

}  // namespace vx
