// SPDX-License-Identifier: MIT
#include "tools/vx/host_session.h"

#include <algorithm>
#include <bit>

#include "tools/vx/engine_search.h"
#include "tools/vx/failure.h"
#include "tools/vx/layout.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr int32_t kComponentEnable = -6;
constexpr size_t kMostOutput = 36;  // of a command of the host's own

const char *textOrNull(const std::optional<std::string> &text) {
    return text ? text->c_str() : nullptr;
}

float floatOf(const std::vector<uint8_t> &data) {
    uint32_t word = 0;
    for (size_t byte = 0; byte < 4; ++byte) word |= static_cast<uint32_t>(data.at(byte)) << 8 * byte;
    return std::bit_cast<float>(word);
}

}  // namespace

HostSession::HostSession(const EngineChoice &choice) : choice_(choice) {
    handle_ = VXDSPAPI_InitializeLibrary(choice.engine.c_str(), textOrNull(choice.platform), choice.hardware,
                                         textOrNull(choice.commandLine), nullptr, choice.recordRate, choice.hostType);
    if (handle_ == nullptr) failEngine(choice.engine, choice.platform, choice.hostType);
}

HostSession::~HostSession() {
    VXDSPAPI_FreeLibrary(handle_);
}

std::string HostSession::engineFile() const {
    return context().engineFileName;
}

void HostSession::failFormat(const char *side, const IOFormat &wanted, const IOFormat &offered, uint32_t answer) const {
    const bool offersOther = wanted.channelMask != offered.channelMask || wanted.sampleRate != offered.sampleRate;
    const std::string option = std::string(side) == "input" ? "--layout " : "--output-layout ";
    std::string advice = "; try another layout or a file of another sample rate";
    if (offersOther && wanted.sampleRate == offered.sampleRate)
        advice = "; it offers " + layoutText(offered.channelMask) + ": try " + option + layoutName(offered.channelMask);
    else if (offersOther)
        advice = "; it offers " + layoutText(offered.channelMask) +
                 textf(" at %d Hz: bring the file to that rate first", offered.sampleRate);
    throw Failure(ExitStatus::input, choice_.engine + ": does not take " + layoutText(wanted.channelMask) +
                                         textf(" at %d Hz as %s (its answer is %u)", wanted.sampleRate, side, answer) + advice);
}

void HostSession::start(IOFormat input, IOFormat output) {
    // The queries set both lengths to 512 and may rewrite the tested record, so each gets copies.
    IOFormat tested = input;
    IOFormat other = output;
    uint32_t answer = VXDSPAPI_IsInputFormatSupported(handle_, &tested, &other);
    if (answer != 0) failFormat("input", input, tested, answer);
    tested = output;
    other = input;
    answer = VXDSPAPI_IsOutputFormatSupported(handle_, &tested, &other);
    if (answer != 0) failFormat("output", output, tested, answer);
    const uint32_t refused = VXDSPAPI_SetIOFormat(handle_, &input, &output);
    if (refused != 0)
        throw Failure(ExitStatus::input, choice_.engine + ": said yes to both formats and then refused to set " +
                                             layoutText(input.channelMask) + " to " + layoutText(output.channelMask) +
                                             textf(" at %d Hz (its answer is %u)", output.sampleRate, refused) +
                                             "; try another layout or --block");
    createComponents(output.sampleRate);
}

void HostSession::createComponents(int sampleRate) {
    const EngineConfig &description = context().engineDescription;
    std::vector<EngineComponent> components(
        description.Components, description.Components + std::min<uint32_t>(description.ComponentCount, VX_MAX_ENGINE_COMPONENTS));
    std::stable_sort(components.begin(), components.end(),
                     [](const EngineComponent &left, const EngineComponent &right) { return left.Position < right.Position; });
    for (const EngineComponent &component : components)
        VXDSPAPI_CreateComponent(handle_, static_cast<uint32_t>(component.ComponentId), component.ComponentId,
                                 static_cast<uint32_t>(sampleRate), static_cast<uint32_t>(choice_.recordRate));
    for (const EngineComponent &component : components) {
        uint8_t enabled = 1;
        VXDSPAPI_SetParameter(handle_, component.ComponentId, kComponentEnable, 0, &enabled, 1);
    }
}

ParameterAnswer HostSession::send(const ParameterWrite &write) {
    ParameterAnswer answer = {write, 1};
    if (write.isInputGain) {
        VXDSPAPI_SetInputGain(handle_, floatOf(write.data));
        return answer;
    }
    std::vector<uint8_t> data = write.data;
    answer.result = VXDSPAPI_SetParameter(handle_, write.componentId, write.paramId, write.channel, data.data(),
                                          static_cast<uint32_t>(data.size()));
    return answer;
}

std::vector<uint8_t> HostSession::command(int32_t id, const std::vector<uint8_t> &input) {
    std::vector<uint8_t> output(kMostOutput);
    const uint32_t written =
        VXDSPAPI_ReadWriteData(handle_, 0, id, input.data(), static_cast<int32_t>(input.size()), output.data());
    output.resize(std::min<size_t>(written, kMostOutput));
    return output;
}

}  // namespace vx
