// SPDX-License-Identifier: MIT
#include "tools/vx/parameters.h"

#include <bit>
#include <cmath>
#include <optional>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr int kLowestComponent = -4;
constexpr int kHighestComponent = 31;
constexpr int kLowestId = -64;
constexpr int kHighestId = 256;
constexpr size_t kMostBytes = 65536;

enum class Kind : int { toggle, slider, band, gain };

struct Setting {
    const char *name;
    Kind kind;
    int32_t componentId;
    int32_t paramId;
    double lowestDb;
    double highestDb;
    const char *meaning;
};

constexpr int32_t kFirstBandId = 117;
constexpr int32_t kLevelId = -12;
constexpr Setting kSettings[] = {
    {"power", Kind::toggle, -1, -2, 0, 0, "the effects as a whole"},
    {"bypass", Kind::toggle, -1, -18, 0, 0, "the input, untouched"},
    {"bass", Kind::slider, 3, kLevelId, -54, 6, "low frequencies"},
    {"detail", Kind::slider, 2, kLevelId, -48, 12, "high frequencies"},
    {"voice", Kind::slider, 0, kLevelId, -48, 12, "the octaves of speech"},
    {"surround", Kind::slider, 1, kLevelId, -48, 12, "width"},
    {"eq", Kind::toggle, 5, 115, 0, 0, "the equaliser"},
    {"input-gain", Kind::gain, -1, 0, -60, 24, "level ahead of the effects"},
    {"output-gain", Kind::gain, -1, kLevelId, -60, 24, "level behind the effects"},
};

// Kept: the tenth band lies at 1600 Hz, not at 16 kHz; applications' sliders are calibrated with it.
constexpr float kBandHz[] = {31, 62, 125, 250, 500, 1000, 2000, 4000, 8000, 1600};
constexpr int kBands = 10;
constexpr float kBandQuality = 1.44F;
constexpr uint8_t kBellType = 1;
constexpr double kBandLowestDb = -18.0;
constexpr double kBandHighestDb = 18.0;

[[noreturn]] void failUsage(const std::string &option, const std::string &text, const std::string &what) {
    throw Failure(ExitStatus::usage, option + " " + text + ": " + what);
}

void putBytes(std::vector<uint8_t> &data, uint32_t value, int count) {
    for (int i = 0; i < count; ++i) data.push_back(static_cast<uint8_t>(value >> 8 * i));
}

void putFloat(std::vector<uint8_t> &data, float value) {
    putBytes(data, std::bit_cast<uint32_t>(value), 4);
}

bool putHex(std::vector<uint8_t> &data, const std::string &digits) {
    if (digits.empty() || digits.size() % 2 != 0) return false;
    for (size_t i = 0; i < digits.size(); i += 2) {
        const auto byte = parseInteger("0x" + digits.substr(i, 2), 0, UINT8_MAX);
        if (!byte) return false;
        data.push_back(static_cast<uint8_t>(*byte));
    }
    return true;
}

bool putTyped(std::vector<uint8_t> &data, const std::string &type, const std::string &value) {
    if (type == "hex") return putHex(data, value);
    if (type == "f32") {
        const auto number = parseNumber(value);
        if (!number || std::fabs(*number) > 3.4e38) return false;
        putFloat(data, static_cast<float>(*number));
        return true;
    }
    const int bytes = type == "u8" ? 1 : type == "u16" ? 2 : type == "u32" || type == "i32" ? 4 : 0;
    if (bytes == 0) return false;
    const bool isSigned = type == "i32";
    const auto number = parseInteger(value, isSigned ? INT32_MIN : 0, isSigned ? INT32_MAX : (int64_t{1} << 8 * bytes) - 1);
    if (number) putBytes(data, static_cast<uint32_t>(*number), bytes);
    return number.has_value();
}

// A value in decibels: a slider's position from 0 to 1, or decibels with their unit.
double decibelsOf(const std::string &text, const std::string &value, double lowest, double highest, bool slider) {
    std::string digits = lowered(value);
    const bool hasUnit = digits.ends_with("db");
    if (hasUnit) digits.resize(digits.size() - 2);
    const auto number = parseNumber(digits);
    const std::string wanted =
        (slider ? "a slider's position from 0 to 1 or " : "") + textf("decibels from %gdB to %gdB", lowest, highest);
    if (!number || (!hasUnit && !slider)) failUsage("--set", text, "expected " + wanted);
    if (!hasUnit && (*number < 0.0 || *number > 1.0)) failUsage("--set", text, "is outside the slider; expected " + wanted);
    if (hasUnit && (*number < lowest || *number > highest)) failUsage("--set", text, "is out of range; expected " + wanted);
    return hasUnit ? *number : (highest - lowest) * *number + lowest;
}

float gainOf(double decibels) {
    return static_cast<float>(std::pow(10.0, decibels / 20.0));
}

uint8_t toggleOf(const std::string &text, const std::string &value) {
    const std::string word = lowered(value);
    if (word == "on" || word == "1" || word == "true") return 1;
    if (word == "off" || word == "0" || word == "false") return 0;
    failUsage("--set", text, "expected on or off");
}

// The number of "eq1" to "eq10", else nothing.
std::optional<int> bandOf(const std::string &name) {
    if (!name.starts_with("eq")) return std::nullopt;
    const auto number = parseInteger(name.substr(2), 1, kBands);
    return number ? std::optional<int>(static_cast<int>(*number)) : std::nullopt;
}

}  // namespace

ParameterWrite parseParameter(const std::string &text) {
    const size_t equals = text.find('=');
    const auto address = split(text.substr(0, equals), ',');
    if (equals == std::string::npos || address.size() < 2 || address.size() > 3)
        failUsage("--param", text, "expected COMPONENT,ID=TYPE:VALUE, such as 3,-12=f32:1.5");
    const auto component = parseInteger(address[0], kLowestComponent, kHighestComponent);
    const auto id = parseInteger(address[1], kLowestId, kHighestId);
    const auto channel = address.size() == 3 ? parseInteger(address[2], 0, UINT32_MAX) : 0;
    if (!component)
        failUsage("--param", text, textf("the component must be a number from %d to %d", kLowestComponent, kHighestComponent));
    if (!id) failUsage("--param", text, textf("the id must be a number from %d to %d", kLowestId, kHighestId));
    if (!channel) failUsage("--param", text, "the channel must be a number from 0 on");
    ParameterWrite write = {text, static_cast<int32_t>(*component), static_cast<int32_t>(*id), static_cast<uint32_t>(*channel), {}};
    for (const std::string &part : split(text.substr(equals + 1), ',')) {
        const size_t colon = part.find(':');
        if (colon == std::string::npos || !putTyped(write.data, part.substr(0, colon), part.substr(colon + 1)))
            failUsage("--param", text, "\"" + part + "\" is no value; expected u8:1, u16:1, u32:1, i32:-1, f32:1.5 or hex:00ff");
    }
    if (write.data.size() > kMostBytes)
        failUsage("--param", text, textf("has %zu bytes; a parameter holds at most 65536", write.data.size()));
    return write;
}

ParameterWrite parseSetting(const std::string &text) {
    const size_t equals = text.find('=');
    if (equals == std::string::npos) failUsage("--set", text, "expected NAME=VALUE, such as bass=0.7");
    const std::string name = lowered(text.substr(0, equals));
    const std::string value = text.substr(equals + 1);
    ParameterWrite write;
    write.text = text;
    if (const auto band = bandOf(name)) {
        write.componentId = 5;
        write.paramId = kFirstBandId + *band - 1;
        write.data.push_back(kBellType);
        putFloat(write.data, kBandHz[*band - 1]);
        putFloat(write.data, kBandQuality);
        putFloat(write.data, static_cast<float>(decibelsOf(text, value, kBandLowestDb, kBandHighestDb, true)));
        return write;
    }
    for (const Setting &setting : kSettings) {
        if (name != setting.name) continue;
        write.componentId = setting.componentId;
        write.paramId = setting.paramId;
        write.isInputGain = setting.paramId == 0;
        if (setting.kind == Kind::toggle)
            write.data.push_back(toggleOf(text, value));
        else
            putFloat(write.data,
                     gainOf(decibelsOf(text, value, setting.lowestDb, setting.highestDb, setting.kind == Kind::slider)));
        return write;
    }
    failUsage("--set", text, "there is no setting \"" + name + "\"; vx run --help lists them");
}

std::string settingNames() {
    std::string lines;
    for (const Setting &setting : kSettings) {
        const std::string range = setting.kind == Kind::toggle ? "on or off"
                                  : setting.kind == Kind::slider
                                      ? textf("0 to 1, or %gdB to %+gdB", setting.lowestDb, setting.highestDb)
                                      : textf("%gdB to %+gdB", setting.lowestDb, setting.highestDb);
        lines += textf("  %-12s %-24s %s\n", setting.name, range.c_str(), setting.meaning);
    }
    lines += textf("  %-12s %-24s %s\n", "eq1 ... eq10", "0 to 1, or -18dB to +18dB", "31 62 125 250 500 1k 2k 4k 8k 1.6k Hz");
    return lines;
}

}  // namespace vx
