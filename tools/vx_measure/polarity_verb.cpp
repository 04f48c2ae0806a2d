// SPDX-License-Identifier: MIT
//
// vx measure polarity: whether a chain keeps or inverts the polarity.
#include <VXDSPAPI.h>

#include <iostream>

#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_measure/data_bytes.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_measure/result.h"
#include "tools/vx_measure/rig.h"

namespace vx {

namespace {

constexpr const char *kDefinition =
    "the sign of the first peak that follows 10 ms of at most a sixth of it, over that of a tone which begins downwards";
constexpr const char *kNoOnset =
    "no onset came: no peak of more than six times what came 10 ms before it. Is the chain silent or very noisy?";
constexpr double kPatience = 2.0;  // seconds behind the tone, for the chain's delay
constexpr double kTailSeconds = 0.5;

struct PolarityOptions : MeasureOptions {
    int channel = 0;
    int halfLengthMs = 20;
};

void arm(Rig &rig, const PolarityOptions &options) {
    const auto channel = static_cast<uint32_t>(options.channel);
    const auto halfLength = static_cast<uint32_t>(options.halfLengthMs);
    rig.command(VXDSP_DATA_POLARITY_START, DataWriter().u8(1).u8(channel).u8(0).u16(halfLength).bytes());
}

// -1, 1, or 0 while it is unknown.
int signOf(Rig &rig, const PolarityOptions &options) {
    const auto channel = static_cast<uint32_t>(options.channel);
    return DataReader(rig.command(VXDSP_DATA_POLARITY_RESULT, DataWriter().u8(channel).bytes())).i32();
}

void runPolarity(const PolarityOptions &options, int &exitStatus) {
    checkMeasureOptions(options);
    ResultFiles files(options);
    Rig rig(options, options.channel);
    arm(rig, options);
    const double toneSeconds = 2.0 * options.halfLengthMs / 1000.0;
    if (options.onlyPlays()) {
        rig.stepUntil(toneSeconds + kTailSeconds);
        rig.commit();
        return tellPlayed(options, rig.seconds());
    }
    int sign = 0;
    while (sign == 0 && (!rig.isSimulated() || rig.seconds() < toneSeconds + kPatience) && rig.step()) sign = signOf(rig, options);
    rig.stepUntil(toneSeconds + kTailSeconds);  // what is written of it is whole
    rig.commit();
    // The tone begins downwards: a first peak downwards is one that was kept.
    const std::string polarity = sign < 0 ? "kept" : sign > 0 ? "inverted" : "not measurable";
    Result result;
    const Style style(options.common.colour, stdout);
    result.text = "chain    " + options.chainText() + textf(", channel %d\n", options.channel) +
                  (sign < 0   ? style.good("polarity kept")
                   : sign > 0 ? style.warning("polarity inverted")
                              : style.warning("polarity not measurable: no onset came")) +
                  "\nDefinition: " + kDefinition + ".\n";
    result.json = {{"measurement", "polarity"},    {"definition", kDefinition},
                   {"chain", options.chainText()}, {"sampleRate", rig.rate()},
                   {"channel", options.channel},   {"halfLengthMs", options.halfLengthMs},
                   {"polarity", polarity},         {"raw", sign}};
    if (sign == 0) result.json["why"] = "no onset came";
    result.table.columns = {"channel", "raw"};
    result.table.rows = {{static_cast<double>(options.channel), static_cast<double>(sign)}};
    files.deliver(result);
    if (sign != 0) return;
    std::cerr << "vx: " << kNoOnset << "\n";
    exitStatus = static_cast<int>(ExitStatus::found);
}

}  // namespace

void addPolarityVerb(CLI::App &measure, int &exitStatus) {
    auto options = std::make_shared<PolarityOptions>();
    CLI::App *verb = measure.add_subcommand("polarity", "Whether a chain keeps or inverts the polarity");
    verb->add_option("--channel", options->channel, "The measured channel")
        ->check(CLI::Range(0, 3))
        ->capture_default_str()
        ->type_name("N");
    // Shorter ones are over before the search looks, longer ones swell too slowly to be found.
    verb->add_option("--half-length", options->halfLengthMs, "Half the length of the tone in ms: 15 to 63")
        ->check(CLI::Range(15, 63))
        ->capture_default_str()
        ->type_name("MS");
    addEngineAndFormat(*verb, *options);
    addChain(*verb, *options);
    addResults(*verb, *options);
    verb->remove_option(verb->get_option("--plot"));
    verb->footer("Parts of --plant, separated by commas:\n" + plantParts() + "\nDefinition: " + kDefinition +
                 ".\nExit status: 0 kept or inverted, which is told; 1 not measurable.\n"
                 "Example: vx measure polarity --plant delay=12ms,invert,noise=-50dB");
    verb->callback([options, &exitStatus] { runPolarity(*options, exitStatus); });
}

}  // namespace vx
