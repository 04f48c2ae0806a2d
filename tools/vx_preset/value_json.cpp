// SPDX-License-Identifier: MIT
#include "tools/vx_preset/value_json.h"

#include <bit>
#include <charconv>
#include <cmath>
#include <cstdlib>

#include "preset/byte_cursor.h"
#include "preset/preset_format.h"

namespace vx::preset {
namespace {

using vxcomn::ByteCursor;
using vxcomn::ByteWriter;

enum class Form : uint8_t { bytes, on, real, band };

struct KnownParameter {
    int32_t componentId, first, last;
    Form form;
    const char *name;
};

constexpr KnownParameter kKnown[] = {
    {-1, -18, -18, Form::on, "bypass all"},
    {-1, -2, -2, Form::on, "power"},
    {-1, -12, -12, Form::real, "output level"},
    {0, -12, -12, Form::real, "voice level"},
    {1, -12, -12, Form::real, "surround level"},
    {2, -12, -12, Form::real, "detail level"},
    {3, -12, -12, Form::real, "bass level"},
    {0, -20, -20, Form::real, "voice lowest dB"},
    {0, -21, -21, Form::real, "voice highest dB"},
    {1, -20, -20, Form::real, "surround lowest dB"},
    {1, -21, -21, Form::real, "surround highest dB"},
    {2, -20, -20, Form::real, "detail lowest dB"},
    {2, -21, -21, Form::real, "detail highest dB"},
    {3, -20, -20, Form::real, "bass lowest dB"},
    {3, -21, -21, Form::real, "bass highest dB"},
    {5, 115, 115, Form::on, "EQ on"},
    {5, 117, 126, Form::band, "EQ band"},
};

// A switch that every component has.
constexpr int32_t kComponentOn = -6;
constexpr KnownParameter kComponentSwitch = {0, kComponentOn, kComponentOn, Form::on, "component on"};

const KnownParameter *find(int32_t componentId, int32_t paramId) {
    for (const KnownParameter &known : kKnown) {
        if (known.componentId == componentId && paramId >= known.first && paramId <= known.last) return &known;
    }
    return componentId >= 0 && paramId == kComponentOn ? &kComponentSwitch : nullptr;
}

// The shortest decimal that reads back as the same float; nothing for what JSON has no number for.
std::optional<Json> realJson(float value) {
    if (!std::isfinite(value)) return std::nullopt;
    char text[64];
    *std::to_chars(text, text + sizeof text - 1, value).ptr = '\0';
    const double number = std::strtod(text, nullptr);
    if (std::bit_cast<uint32_t>(static_cast<float>(number)) != std::bit_cast<uint32_t>(value)) return std::nullopt;
    return Json(number);
}

std::optional<Json> bandJson(std::span<const uint8_t> value) {
    ByteCursor in(value);
    uint8_t type = 0;
    float frequency = 0, q = 0, gain = 0;
    if (value.size() != 13 || !in.u8(type) || !in.f32(frequency) || !in.f32(q) || !in.f32(gain)) return std::nullopt;
    const auto frequencyJson = realJson(frequency), qJson = realJson(q), gainJson = realJson(gain);
    if (!frequencyJson || !qJson || !gainJson) return std::nullopt;
    return Json{{"type", type}, {"frequency", *frequencyJson}, {"q", *qJson}, {"gainDb", *gainJson}};
}

}  // namespace

std::string parameterName(int32_t componentId, int32_t paramId) {
    const KnownParameter *const known = find(componentId, paramId);
    if (known == nullptr) return {};
    if (known->form == Form::band) return std::string(known->name) + " " + std::to_string(paramId - known->first + 1);
    return known->name;
}

void putValue(Json &entry, int32_t componentId, int32_t paramId, std::span<const uint8_t> value) {
    if (value.empty()) return;
    const KnownParameter *const known = find(componentId, paramId);
    const Form form = known == nullptr ? Form::bytes : known->form;
    if (form == Form::on && value.size() == 1 && value[0] <= 1) {
        entry["on"] = value[0] == 1;
        return;
    }
    if (form == Form::real && value.size() == 4) {
        float number = 0;
        ByteCursor(value).f32(number);
        if (const auto json = realJson(number)) {
            entry["float"] = *json;
            return;
        }
    }
    if (form == Form::band) {
        if (auto json = bandJson(value)) {
            entry["band"] = std::move(*json);
            return;
        }
    }
    entry["bytes"] = hexText(value);
}

std::string valueText(int32_t componentId, int32_t paramId, std::span<const uint8_t> value) {
    constexpr size_t kShownBytes = 16;
    if (value.empty()) return "no value";
    Json entry;
    putValue(entry, componentId, paramId, value.size() > kShownBytes ? value.first(kShownBytes) : value);
    if (entry.contains("bytes")) return entry["bytes"].get<std::string>() + (value.size() > kShownBytes ? "..." : "");
    if (entry.contains("on")) return entry["on"].get<bool>() ? "on" : "off";
    return entry.begin().value().dump();
}

std::vector<uint8_t> takeValue(const JsonAt &entry) {
    ByteWriter out;
    int forms = 0;
    if (const auto on = entry.optional("on")) ++forms, out.u8(on->boolean() ? 1 : 0);
    if (const auto byte = entry.optional("byte")) ++forms, out.u8(static_cast<uint8_t>(byte->number(0, 255)));
    if (const auto integer = entry.optional("int")) ++forms, out.i32(integer->i32());
    if (const auto real = entry.optional("float")) ++forms, out.f32(real->real());
    if (const auto reals = entry.optional("floats")) {
        ++forms;
        for (const JsonAt &item : reals->items()) out.f32(item.real());
    }
    if (const auto text = entry.optional("text")) {
        ++forms;
        const std::string characters = text->text();
        out.bytes({reinterpret_cast<const uint8_t *>(characters.data()), characters.size()});
    }
    if (const auto band = entry.optional("band")) {
        ++forms;
        band->only({"type", "frequency", "q", "gainDb"});
        out.u8(static_cast<uint8_t>(band->member("type").number(0, 255)));
        for (const char *name : {"frequency", "q", "gainDb"}) out.f32(band->member(name).real());
    }
    if (const auto bytes = entry.optional("bytes")) ++forms, out.bytes(bytes->hex());
    if (forms > 1) entry.expected("one value");
    if (out.position() > vxcomn::kLargestValueBytes) {
        entry.fail(std::to_string(out.position()) + " bytes",
                   "at most " + std::to_string(vxcomn::kLargestValueBytes) + " in a value");
    }
    return out.release();
}

}  // namespace vx::preset
