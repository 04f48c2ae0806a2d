// SPDX-License-Identifier: MIT
#include "tools/vx_preset/preset_json.h"

#include "preset/byte_cursor.h"
#include "tools/vx_preset/value_json.h"

namespace vx::preset {
namespace {

using namespace vxcomn;

// Beyond it a layout would only make an image of zeros.
constexpr uint32_t kFurthestPosition = 64u << 20;

struct HeaderWord {
    const char *name;
    uint32_t LongHeader::*word;
    bool isPosition;
};
constexpr HeaderWord kHeaderWords[] = {
    {"engineShortNamePos", &LongHeader::engineShortNamePos, true},
    {"engineShortNameSize", &LongHeader::engineShortNameSize, false},
    {"engineConfigPos", &LongHeader::engineConfigPos, true},
    {"engineConfigSize", &LongHeader::engineConfigSize, false},
    {"globalParamsPos", &LongHeader::globalParamsPos, true},
    {"globalParamsSize", &LongHeader::globalParamsSize, false},
    {"componentParamsPos", &LongHeader::componentParamsPos, false},
    {"componentParamsSize", &LongHeader::componentParamsSize, false},
};

std::string hexNumber(uint32_t value) {
    ByteWriter bytes;
    for (int shift = 24; shift >= 0; shift -= 8) bytes.u8(static_cast<uint8_t>(value >> shift));
    std::string digits = hexText(bytes.view());
    digits.erase(0, std::min(digits.find_first_not_of('0'), digits.size() - 1));
    return "0x" + digits;
}

bool isPlainText(const std::string &text) {
    if (text.find('\0') != std::string::npos) return false;
    try {
        (void)Json(text).dump();
    } catch (const Json::type_error &) {  // not UTF-8
        return false;
    }
    return true;
}

void putName(Json &engine, const std::vector<uint8_t> &stored) {
    const std::string name(stored.begin(), stored.end());
    if (!name.empty() && name.back() == '\0' && isPlainText(name.substr(0, name.size() - 1))) {
        engine["name"] = name.substr(0, name.size() - 1);
    } else {
        engine["nameBytes"] = hexText(stored);
    }
}

std::vector<uint8_t> takeName(const JsonAt &engine) {
    if (engine.has("name") && engine.has("nameBytes")) engine.expected("either name or nameBytes");
    if (const auto bytes = engine.optional("nameBytes")) return bytes->hex();
    const std::string name = engine.member("name").text();
    std::vector<uint8_t> stored(name.begin(), name.end());
    stored.push_back(0);
    return stored;
}

std::vector<uint8_t> takeConfig(const JsonAt &config) {
    config.only({"size", "reserved", "components", "bytes"});
    if (config.has("bytes")) {
        config.only({"bytes"});
        return config.member("bytes").hex();
    }
    const std::vector<JsonAt> components = config.member("components").items();
    if (components.size() > VX_MAX_ENGINE_COMPONENTS) {
        config.fail(std::to_string(components.size()) + " components", "at most " + std::to_string(VX_MAX_ENGINE_COMPONENTS));
    }
    const auto size = static_cast<uint32_t>(kEngineConfigHeadBytes + sizeof(EngineComponent) * components.size());
    ByteWriter out;
    out.u32(config.has("size") ? config.member("size").u32() : size);
    out.u32(config.has("reserved") ? config.member("reserved").u32() : 0);
    out.u32(static_cast<uint32_t>(components.size()));
    for (const JsonAt &component : components) {
        component.only({"component", "position"});
        out.i32(component.member("component").i32());
        out.i32(component.member("position").i32());
    }
    return out.release();
}

Json blockToJson(const PresetBlock &block) {
    Json json = {{"component", block.componentId}, {"first", block.paramIdMin}};
    if (block.values.empty()) json["last"] = block.paramIdMax;
    Json values = Json::array();
    int64_t id = block.paramIdMin;
    for (const std::vector<uint8_t> &value : block.values) {
        const auto paramId = static_cast<int32_t>(id++);
        Json entry = {{"id", paramId}};
        const std::string name = parameterName(block.componentId, paramId);
        if (!name.empty()) entry["name"] = name;
        putValue(entry, block.componentId, paramId, value);
        values.push_back(std::move(entry));
    }
    json["values"] = std::move(values);
    return json;
}

PresetBlock blockFromJson(const JsonAt &json) {
    json.only({"component", "first", "last", "values"});
    PresetBlock block;
    block.componentId = json.member("component").i32();
    block.paramIdMin = json.member("first").i32();
    const std::vector<JsonAt> values = json.member("values").items();
    int64_t id = block.paramIdMin;
    for (const JsonAt &value : values) {
        value.only({"id", "name", "on", "byte", "int", "float", "floats", "text", "band", "bytes"});
        if (const auto given = value.optional("id"); given && given->i32() != id) {
            given->expected(std::to_string(id) + ", since the ids of a block follow each other");
        }
        block.values.push_back(takeValue(value));
        ++id;
    }
    if (id - 1 > INT32_MAX) json.expected("ids up to " + std::to_string(INT32_MAX));
    const auto last = json.optional("last");
    if (values.empty()) {
        if (!last) json.fail("no values and no \"last\"", "one of them");
        block.paramIdMax = last->i32();
        if (block.paramIdMax >= block.paramIdMin) last->expected("an id below \"first\" in a block without values");
        return block;
    }
    block.paramIdMax = static_cast<int32_t>(id - 1);
    if (last && last->i32() != block.paramIdMax) last->expected(std::to_string(block.paramIdMax) + ", the last value's id");
    return block;
}

void takeLayout(const JsonAt &json, PresetDocument &document) {
    LongHeader header;
    header.bypassAll = document.bypassAllWord;
    for (const HeaderWord &word : kHeaderWords) {
        header.*word.word = json.member(word.name).u32();
    }
    // A position counts only where something stands there.
    const bool stands[] = {!document.engineName.empty(), !document.engineConfig.empty(), !document.blocks.empty()};
    const uint32_t positions[] = {header.engineShortNamePos, header.engineConfigPos, header.globalParamsPos};
    for (size_t i = 0; i < std::size(stands); ++i) {
        if (stands[i] && positions[i] > kFurthestPosition) json.expected("positions up to " + std::to_string(kFurthestPosition));
    }
    document.header = header;
}

}  // namespace

Json engineConfigToJson(std::span<const uint8_t> record) {
    ByteCursor in(record);
    uint32_t size = 0, reserved = 0, count = 0;
    const bool whole = in.u32(size) && in.u32(reserved) && in.u32(count) && count <= VX_MAX_ENGINE_COMPONENTS &&
                       record.size() == kEngineConfigHeadBytes + sizeof(EngineComponent) * count;
    if (!whole) return {{"bytes", hexText(record)}};
    Json components = Json::array();
    for (; count > 0; --count) {
        int32_t component = 0, position = 0;
        in.i32(component);
        in.i32(position);
        components.push_back({{"component", component}, {"position", position}});
    }
    return {{"size", size}, {"reserved", reserved}, {"components", std::move(components)}};
}

Json presetToJson(const PresetDocument &document) {
    Json json = {{"format", "preset"}, {"version", hexNumber(document.version)}};
    if (document.hash) {
        Json words = Json::array();
        for (const uint32_t word : *document.hash) words.push_back(hexNumber(word));
        json["hash"] = std::move(words);
    }
    if (document.hasLongHeader()) {
        json["bypassAllWord"] = document.bypassAllWord;
        Json engine = Json::object();
        putName(engine, document.engineName);
        engine["config"] = engineConfigToJson(document.engineConfig);
        json["engine"] = std::move(engine);
    }
    json["blocks"] = Json::array();
    for (const PresetBlock &block : document.blocks) json["blocks"].push_back(blockToJson(block));
    if (document.header) {
        for (const HeaderWord &word : kHeaderWords) json["layout"][word.name] = (*document.header).*word.word;
    }
    for (const PresetGap &gap : document.gaps) json["gaps"].push_back({{"position", gap.position}, {"bytes", hexText(gap.bytes)}});
    return json;
}

PresetDocument presetFromJson(const JsonAt &json) {
    json.only({"format", "version", "hash", "bypassAllWord", "engine", "blocks", "layout", "gaps"});
    if (const JsonAt format = json.member("format"); format.text() != "preset") format.expected("\"preset\"");
    PresetDocument document;
    document.version = static_cast<uint32_t>(json.member("version").number(kLowestPresetVersion, UINT32_MAX));
    if (const auto hash = json.optional("hash")) {
        const std::vector<JsonAt> words = hash->items();
        if (words.size() != document.hash.emplace().size()) hash->expected("eight words");
        for (size_t i = 0; i < words.size(); ++i) (*document.hash)[i] = words[i].u32();
    }
    if (document.hasLongHeader()) {
        if (const auto word = json.optional("bypassAllWord")) document.bypassAllWord = word->u32();
        const JsonAt engine = json.member("engine");
        engine.only({"name", "nameBytes", "config"});
        document.engineName = takeName(engine);
        document.engineConfig = takeConfig(engine.member("config"));
    } else {
        for (const char *name : {"bypassAllWord", "engine", "layout"}) {
            if (json.has(name)) json.fail("\"" + std::string(name) + "\"", "none from version 0x1000010 on");
        }
    }
    for (const JsonAt &block : json.member("blocks").items()) document.blocks.push_back(blockFromJson(block));
    if (const auto layout = json.optional("layout")) takeLayout(*layout, document);
    if (const auto gaps = json.optional("gaps")) {
        for (const JsonAt &gap : gaps->items()) {
            gap.only({"position", "bytes"});
            document.gaps.push_back(
                {static_cast<uint32_t>(gap.member("position").number(0, kFurthestPosition)), gap.member("bytes").hex()});
        }
    }
    return document;
}

}  // namespace vx::preset
