// SPDX-License-Identifier: MIT
#include "tools/vx_client/raw_value.h"

#include "preset/byte_cursor.h"
#include "tools/vx/failure.h"
#include "tools/vx/text.h"
#include "tools/vx_client/user_parameters.h"
#include "tools/vx_preset/json_at.h"
#include "tools/vx_preset/value_json.h"

namespace vx::client {

namespace {

constexpr int kLowestComponent = -4, kHighestComponent = 31, kLowestId = -64, kHighestId = 256;
constexpr size_t kBandBytes = 13;  // the last four are the gain in decibels

}  // namespace

Triple parseTriple(const std::string &text) {
    const auto parts = split(text, ',');
    const auto fail = [&](const std::string &what) { throw Failure(ExitStatus::usage, "parameter " + text + ": " + what); };
    if (parts.size() < 2 || parts.size() > 3) fail("expected COMPONENT,ID[,CHANNEL], such as 3,-12");
    const auto component = parseInteger(parts[0], kLowestComponent, kHighestComponent);
    const auto id = parseInteger(parts[1], kLowestId, kHighestId);
    const auto channel = parts.size() == 3 ? parseInteger(parts[2], INT32_MIN, INT32_MAX) : 0;
    if (!component) fail(textf("the component must be a number from %d to %d", kLowestComponent, kHighestComponent));
    if (!id) fail(textf("the id must be a number from %d to %d", kLowestId, kHighestId));
    if (!channel) fail("the channel must be a number");
    return {static_cast<int32_t>(component.value_or(0)), static_cast<int32_t>(id.value_or(0)),
            static_cast<int32_t>(channel.value_or(0))};
}

std::string parameterTitle(int32_t componentId, int32_t paramId) {
    if (const UserParameter *parameter = userParameterAt(componentId, paramId)) return parameter->name;
    return preset::parameterName(componentId, paramId);
}

std::string rawText(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes) {
    constexpr size_t kMostShown = 64;
    if (bytes.size() > kMostShown) return textf("%zu bytes", bytes.size());
    return preset::valueText(componentId, paramId, bytes);
}

std::string spokenText(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes) {
    const UserParameter *const parameter = userParameterAt(componentId, paramId);
    const bool isBand = bytes.size() == kBandBytes;
    if (parameter == nullptr || parameter->isSwitch || (!isBand && bytes.size() != sizeof(float)))
        return rawText(componentId, paramId, bytes);
    float number = 0.0F;
    vxcomn::ByteCursor(bytes.last(sizeof number)).f32(number);
    return isBand ? textf("%.2f dB", static_cast<double>(number)) : decibelText(static_cast<double>(number));
}

Json rawJson(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes) {
    Json json = {{"hex", preset::hexText(bytes)}};
    Json form = Json::object();
    preset::putValue(form, componentId, paramId, bytes);
    for (const char *name : {"on", "float", "band"})
        if (form.contains(name)) json[name] = form[name];
    return json;
}

}  // namespace vx::client
