// SPDX-License-Identifier: MIT
#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

namespace {

Json selectionJson(const Selection &selection) {
    Json json = {{"value", textOrNull(selection.value)}, {"origin", originName(selection.origin)}};
    if (!selection.setter.empty()) json["setter"] = selection.setter;
    if (!selection.ignored.empty()) json["ignored"] = selection.ignored;
    return json;
}

Json presetJson(const PresetFacts &preset) {
    return {{"packageName", textOrNull(preset.packageName)},
            {"packageFolder", preset.packageFolder},
            {"package", textOrNull(preset.packagePath)},
            {"path", textOrNull(preset.path)},
            {"found", preset.found},
            {"entry", textOrNull(preset.entry)},
            {"digest", textOrNull(preset.digest)},
            {"digestHolds", preset.digestHolds},
            {"engine", textOrNull(preset.engine)}};
}

Json switchJson(const std::optional<bool> &on) {
    return on ? Json(*on) : Json();
}

}  // namespace

Json textOrNull(const std::string &text) {
    return text.empty() ? Json() : Json(text);
}

Json deviceJson(const Device &device) {
    return {{"id", device.idText},
            {"name", device.name},
            {"flow", device.isCapture ? "capture" : "render"},
            {"state", stateText(device.state)},
            {"index", device.index < 0 ? Json() : Json(device.index)},
            {"deviceId", textOrNull(vxcomn::toUtf8(device.deviceId))},
            {"subsystemId", textOrNull(vxcomn::toUtf8(device.subsystemId))},
            {"effectsOff", device.effectsOff}};
}

Json slotJson(const SlotFacts &slot) {
    Json json = {{"apo", slot.apo},
                 {"key", slot.configurationKey},
                 {"keyThere", slot.keyThere},
                 {"engine", selectionJson(slot.engine)},
                 {"ioConfig", selectionJson(slot.ioConfig)},
                 {"profile", selectionJson(slot.profile)},
                 {"content", selectionJson(slot.content)},
                 {"preset", presetJson(slot.preset)}};
    json["parameters"] = {{"key", textOrNull(slot.parameterKey)},
                          {"filled", slot.storedDigest.has_value()},
                          {"digest", slot.storedDigest ? Json(*slot.storedDigest) : Json()},
                          {"consistent", slot.storedDigest && *slot.storedDigest == slot.preset.digest},
                          {"power", switchJson(slot.power)},
                          {"bypass", switchJson(slot.bypass)}};
    json["clients"] = Json::array();
    for (const Client &client : slot.clients) json["clients"].push_back({{"id", client.id}, {"alive", client.alive}});
    json["receiver"] = slot.receiverRuns;
    return json;
}

std::string documentText(const Json &json) {
    return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

std::string lineText(const Json &json) {
    return json.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n";
}

}  // namespace vx::client
