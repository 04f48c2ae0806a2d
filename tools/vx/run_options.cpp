// SPDX-License-Identifier: MIT
#include "tools/vx/run_options.h"

#include "tools/vx/layout.h"
#include "tools/vx/parameters.h"
#include "tools/vx/verb.h"

namespace vx {

namespace {

constexpr int kMostLoops = 1000000;
constexpr double kMostSeconds = 30.0 * 24 * 3600;

void addEngineOptions(CLI::App &verb, RunOptions &options) {
    verb.add_option("--engine", options.engine, "Engine module, without its ending; with --follow the endpoint's if not given")
        ->default_str(kUsualEngine)
        ->type_name("NAME")
        ->group("Engine");
    verb.add_option("--platform", options.platform, "Platform name: Float, HiFi2, iSST or AIC326x; none if not given")
        ->check(CLI::IsMember({"Float", "HiFi2", "iSST", "AIC326x"}))
        ->type_name("NAME")
        ->group("Engine");
    verb.add_option("--host-type", options.hostType, "Host type: 1 to 4, or 0 for none of them")
        ->check(CLI::Range(0, 4))
        ->type_name("N")
        ->group("Engine");
    verb.add_option("--hardware", options.hardware, "Hardware flags, handed to the engine")->type_name("N")->group("Engine");
    verb.add_option("--command-line", options.commandLine, "Text handed to the engine")->type_name("TEXT")->group("Engine");
    verb.add_option("--param", options.parameters,
                    "COMPONENT,ID[,CHANNEL]=TYPE:VALUE,...; types u8 u16 u32 i32 f32 hex; may be repeated")
        ->allow_extra_args(false)
        ->type_name("PARAM")
        ->group("Engine");
    verb.add_option("--set", options.settings, "A setting by name, see below; may be repeated")
        ->allow_extra_args(false)
        ->type_name("NAME=VALUE")
        ->group("Engine");
}

void addFormatOptions(CLI::App &verb, RunOptions &options) {
    const char *group = "Format";
    verb.add_option("--file-layout", options.fileLayout, "Speakers of the file's channels, in order, instead of what the file says")
        ->type_name("LAYOUT")
        ->group(group);
    verb.add_option("--layout", options.layout,
                    "Layout that the engine gets; the library folds the file's channels into it. The file's if not given")
        ->type_name("LAYOUT")
        ->group(group);
    verb.add_option("--output-layout", options.outputLayout,
                    "Layout that the engine delivers and the output has. That of --layout if not given")
        ->type_name("LAYOUT")
        ->group(group);
    verb.add_option("--block", options.block, "Frames a block")
        ->check(CLI::Range(1, int{VX_MAX_FRAMES}))
        ->capture_default_str()
        ->type_name("N")
        ->group(group);
    verb.add_option("--bits", options.bits, "Output samples: 16, 24 or 32f. WAV takes 32f and FLAC 24 if not given")
        ->check(CLI::IsMember({"16", "24", "32f"}))
        ->type_name("BITS")
        ->group(group);
    verb.add_option("--record-rate", options.recordRate, "Sample rate of the capture side in Hz; the file's if not given")
        ->check(CLI::Range(1000, 768000))
        ->type_name("HZ")
        ->group(group);
    verb.add_option("--seconds", options.seconds, "Stop after this much audio")
        ->check(CLI::Range(0.0, kMostSeconds))
        ->type_name("S")
        ->group(group);
    verb.add_option("--loop", options.loops, "Play the input so many times")
        ->check(CLI::Range(1, kMostLoops))
        ->type_name("N")
        ->group(group);
}

void addFollowOptions(CLI::App &verb, RunOptions &options) {
    const char *group = "Following";
    CLI::Option *const follow =
        verb.add_option("--follow", options.follow,
                        "Play in real time with the settings of this endpoint's effect slot, and take every change as it comes")
            ->type_name("ENDPOINT")
            ->group(group);
    verb.add_option("--apo", options.apo, "The slot: EFX, MFX, SFX, LFX or GFX")
        ->check(CLI::IsMember({"EFX", "MFX", "SFX", "LFX", "GFX"}, CLI::ignore_case))
        ->capture_default_str()
        ->needs(follow)
        ->type_name("SLOT")
        ->group(group);
    verb.add_flag("--real-time", options.realTime, "Play as fast as it sounds, not as fast as it goes")->group(group);
}

void addResultOptions(CLI::App &verb, RunOptions &options) {
    const char *group = "Results";
    verb.add_option("--plot", options.plots,
                    "Draw a histogram of the load into a .svg or .png, with the numbers as .csv beside it; may be repeated")
        ->allow_extra_args(false)
        ->type_name("FILE")
        ->group(group);
    verb.add_option("--levels-plot", options.levelsPlots,
                    "Draw the levels over time into a .svg or .png, with changes that came by --follow; may be repeated")
        ->allow_extra_args(false)
        ->type_name("FILE")
        ->group(group);
    verb.add_option("--levels-csv", options.levelsCsv, "Write the peaks and the load of every block as CSV")
        ->type_name("FILE")
        ->group(group);
    verb.add_flag("--digest", options.digest, "Print a 64-bit FNV-1a digest of all output samples, also with -q")->group(group);
    verb.add_flag("--force", options.force, "Write over files that exist")->group(group);
}

}  // namespace

void addRunOptions(CLI::App &verb, RunOptions &options) {
    verb.add_option("INPUT", options.input, "Sound file to play; - for a WAV on standard input")->required();
    verb.add_option("-o,--output", options.output,
                    "Sound file to write; - for a WAV on standard output. Without it the run is only measured")
        ->type_name("FILE");
    addEngineOptions(verb, options);
    addFormatOptions(verb, options);
    addFollowOptions(verb, options);
    addResultOptions(verb, options);
    addCommonOptions(verb, options.common);
    verb.footer("Settings for --set:\n" + settingNames() + "\nLayouts: " + layoutNames() +
                ", or a speaker mask such as 0x3F\n"
                "\nExamples:\n"
                "  vx run speech.wav -o louder.wav --set voice=0.9 --set detail=-6dB\n"
                "  vx run film.wav -o stereo.wav --layout stereo --set bass=1 --set eq3=+6dB\n"
                "  vx run speech.wav --param 3,-12=f32:2.0 --plot load.svg --json\n"
                "  vx run speech.wav -o heard.wav --follow speakers --apo EFX --levels-plot when.svg\n");
}

void checkRunOptions(const RunOptions &options) {
    const auto fail = [](const std::string &what) { throw Failure(ExitStatus::usage, what); };
    if (options.output == "-" && options.common.json) fail("--json and -o - both want standard output; write the sound to a file");
    if (options.output == "-" && options.digest) fail("--digest and -o - both want standard output; write the sound to a file");
    if (options.input == "-" && options.loops > 1) fail("--loop needs a file; standard input can be played once only");
    if (options.seconds && *options.seconds <= 0.0) fail("--seconds must be more than 0");
}

}  // namespace vx
