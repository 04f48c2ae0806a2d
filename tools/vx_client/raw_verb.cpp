// SPDX-License-Identifier: MIT
//
// vx raw: parameters by component, id and channel, as the engine has them.
#include <iostream>
#include <memory>
#include <optional>

#include "tools/vx/parameters.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/hold.h"
#include "tools/vx_client/raw_value.h"

namespace vx::client {

namespace {

constexpr uint32_t kLargestValue = 65536;

struct RawOptions : SlotOptions {
    std::string parameter;
    bool everywhere = false;
    bool transient = false;
    std::optional<double> seconds;
};

Json headJson(const Session &session, const Triple &triple) {
    return {{"endpoint", deviceJson(session.device())},
            {"apo", session.apo()},
            {"component", triple.componentId},
            {"id", triple.paramId},
            {"name", textOrNull(parameterTitle(triple.componentId, triple.paramId))}};
}

void read(const RawOptions &options, const Triple &triple) {
    const Session session = openSlot(options.slot);
    std::vector<uint8_t> data(kLargestValue);
    uint32_t size = kLargestValue;
    // Source and time of the stored value come by vx watch; this call would take them out of the value itself.
    const int32_t answer = VXAPOCOMAPI_GetUserParameterEx(session.handle(), triple.componentId, triple.paramId, triple.channel,
                                                          data.data(), &size, nullptr, nullptr);
    if (answer != 1 || size > kLargestValue)
        throw Failure(ExitStatus::input,
                      session.device().name + ", " + session.apo() + ": parameter " + options.parameter +
                          ": neither the store nor the preset has it; vx watch --initial shows those that are stored");
    data.resize(size);
    if (options.common.json) {
        Json json = headJson(session, triple);
        json["value"] = rawJson(triple.componentId, triple.paramId, data);
        std::cout << documentText(json);
        return;
    }
    std::cout << rawText(triple.componentId, triple.paramId, data) << "\n";
}

void write(const RawOptions &options) {
    const ParameterWrite parameter = parseParameter(options.parameter);
    if (parameter.data.empty())
        throw Failure(ExitStatus::usage, "parameter " + options.parameter + ": has no bytes; expected a value");
    const Hold hold(options.transient ? options.seconds : std::optional<double>(0.0));
    const Session session = openSlot(options.slot);
    GUID source = {};
    uint64_t stamp = 0;
    const int32_t answer = VXAPOCOMAPI_SetUserParameterEx(
        session.handle(), parameter.componentId, parameter.paramId, static_cast<int32_t>(parameter.channel), parameter.data.data(),
        static_cast<uint32_t>(parameter.data.size()), options.everywhere ? 1 : 0, options.transient ? 1 : 0, &source, &stamp);
    if (answer != 1)
        throw Failure(ExitStatus::system, session.device().name + ", " + session.apo() + ": parameter " + options.parameter +
                                              ": the store does not take it; vx doctor tells whether the slot has a preset");
    const Triple triple = {parameter.componentId, parameter.paramId, static_cast<int32_t>(parameter.channel)};
    if (options.common.json) {
        Json json = headJson(session, triple);
        json["value"] = rawJson(triple.componentId, triple.paramId, parameter.data);
        json["transient"] = options.transient;
        json["time"] = stamp;
        std::cout << documentText(json);
    } else if (!options.common.quiet) {
        std::cout << textf("%d,%d ", triple.componentId, triple.paramId)
                  << rawText(triple.componentId, triple.paramId, parameter.data)
                  << (options.transient ? ", while this runs\n" : "\n");
    }
    if (options.transient) hold.wait();
}

void raw(const RawOptions &options) {
    if (options.parameter.find('=') != std::string::npos) return write(options);
    if (options.everywhere || options.transient)
        throw Failure(ExitStatus::usage, "--everywhere and --transient are for writing; expected COMPONENT,ID=TYPE:VALUE");
    read(options, parseTriple(options.parameter));
}

}  // namespace

void addRawVerb(CLI::App &app) {
    auto options = std::make_shared<RawOptions>();
    CLI::App *verb = app.add_subcommand("raw", "Read or write a parameter by component, id and channel");
    addSlotOptions(*verb, *options);
    verb->add_option("PARAMETER", options->parameter,
                     "COMPONENT,ID[,CHANNEL] to read; with =TYPE:VALUE,... behind it to write; types u8 u16 u32 i32 f32 hex")
        ->required();
    CLI::Option *const everywhere =
        verb->add_flag("--everywhere", options->everywhere, "Write it for every configuration and content type of the slot");
    CLI::Option *const transient =
        verb->add_flag("--transient", options->transient, "Write a value that lapses with this program, and stay");
    everywhere->excludes(transient);
    addHoldOption(*verb, options->seconds, "With --transient: stay for so long");
    verb->footer(
        "Examples:\n"
        "  vx raw speakers 3,-12\n"
        "  vx raw speakers 3,-12=f32:0.5\n"
        "  vx raw speakers -1,-18=u8:1 --transient --for 10\n");
    verb->callback([options] { raw(*options); });
}

}  // namespace vx::client
