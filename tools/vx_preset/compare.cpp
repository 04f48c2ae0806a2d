// SPDX-License-Identifier: MIT
#include "tools/vx_preset/compare.h"

#include <algorithm>
#include <map>

#include "preset/preset_writer.h"
#include "tools/vx_preset/archive.h"
#include "tools/vx_preset/failure.h"
#include "tools/vx_preset/preset_json.h"
#include "tools/vx_preset/value_json.h"

namespace vx::preset {
namespace {

using namespace vxcomn;

PresetDocument documentOf(const std::string &file, const Bytes &image) {
    PresetDocument document;
    switch (parsePreset(image, document)) {
        case PresetParse::parsed:
            return document;
        case PresetParse::versionMissing:
            throw Failure(Exit::input, file + ": offset 0: found fewer than four bytes, expected a preset's version word");
        case PresetParse::versionTooLow:
            throw Failure(Exit::input, file + ": offset 0: found version " + std::to_string(document.version) +
                                           ", expected at least 1048578 (0x100002); is this a preset?");
        default:
            throw Failure(Exit::input, file + ": offset " + std::to_string(image.size()) +
                                           ": found the end of the file, expected the rest of the header");
    }
}

std::string hexWord(uint32_t value) {
    constexpr char kDigits[] = "0123456789abcdef";
    std::string text = "0x";
    for (int shift = 28; shift >= 0; shift -= 4) text += kDigits[value >> shift & 0xF];
    return text;
}

// Every value by its address and how often the address came before; and the values in words.
struct Parameters {
    using Address = std::tuple<int32_t, int32_t, int>;
    std::map<Address, std::vector<uint8_t>> values;

    explicit Parameters(const PresetDocument &document) {
        std::map<std::pair<int32_t, int32_t>, int> seen;
        for (const PresetBlock &block : document.blocks) {
            int64_t id = block.paramIdMin;
            for (const std::vector<uint8_t> &value : block.values) {
                const auto paramId = static_cast<int32_t>(id++);
                if (!value.empty()) values[{block.componentId, paramId, seen[{block.componentId, paramId}]++}] = value;
            }
        }
    }
};

std::string addressText(const Parameters::Address &address) {
    const auto [componentId, paramId, occurrence] = address;
    std::string text = "component " + std::to_string(componentId) + " parameter " + std::to_string(paramId);
    const std::string name = parameterName(componentId, paramId);
    if (!name.empty()) text += " (" + name + ")";
    if (occurrence > 0) text += " again " + std::to_string(occurrence);
    return text;
}

void compareText(const std::string &where, const std::string &left, const std::string &right,
                 std::vector<Difference> &differences) {
    if (left != right) differences.push_back({where, left, right});
}

std::string engineText(const PresetDocument &document) {
    const std::string name(document.engineName.begin(), document.engineName.end());
    return document.hasLongHeader() ? name.substr(0, name.find('\0')) : kDefaultEngineName;
}

std::string configText(const PresetDocument &document) {
    return document.hasLongHeader() ? engineConfigToJson(document.engineConfig).dump() : "that of the version";
}

void comparePresets(const std::string &prefix, const PresetDocument &left, const PresetDocument &right,
                    std::vector<Difference> &differences) {
    compareText(prefix + "version", hexWord(left.version), hexWord(right.version), differences);
    compareText(prefix + "engine name", engineText(left), engineText(right), differences);
    compareText(prefix + "engine record", configText(left), configText(right), differences);
    const Parameters before(left), after(right);
    for (const auto &[address, value] : before.values) {
        const auto other = after.values.find(address);
        if (other != after.values.end() && other->second == value) continue;
        const auto [componentId, paramId, ignored] = address;
        const std::string old = valueText(componentId, paramId, value);
        const std::string now = other == after.values.end() ? "" : valueText(componentId, paramId, other->second);
        differences.push_back({prefix + addressText(address), old, now == old ? now + " (other bytes)" : now});
    }
    for (const auto &[address, value] : after.values) {
        if (before.values.contains(address)) continue;
        differences.push_back({prefix + addressText(address), "", valueText(std::get<0>(address), std::get<1>(address), value)});
    }
}

// One image against another, which may be presets or any bytes.
void compareImages(const std::string &prefix, const Bytes &left, const Bytes &right, std::vector<Difference> &differences) {
    if (left == right) return;
    const size_t before = differences.size();
    PresetDocument one, other;
    if (parsePreset(left, one) == PresetParse::parsed && parsePreset(right, other) == PresetParse::parsed) {
        comparePresets(prefix, one, other, differences);
    }
    if (differences.size() > before) return;
    const auto [first, ignored] = std::mismatch(left.begin(), left.end(), right.begin(), right.end());
    const std::string at = "from byte " + std::to_string(first - left.begin()) + " on, of ";
    differences.push_back({prefix + "layout", at + std::to_string(left.size()), at + std::to_string(right.size())});
}

void compareArchives(const Archive &left, const Archive &right, std::vector<Difference> &differences) {
    std::vector<bool> matched(right.entries.size());
    for (const ArchiveEntry &entry : left.entries) {
        size_t i = 0;
        while (i < right.entries.size() && (matched[i] || right.entries[i].name != entry.name)) ++i;
        if (i == right.entries.size()) {
            differences.push_back({entry.name, std::to_string(entry.bytes.size()) + " bytes", ""});
            continue;
        }
        matched[i] = true;
        compareImages(entry.name + ": ", entry.bytes, right.entries[i].bytes, differences);
    }
    for (size_t i = 0; i < right.entries.size(); ++i) {
        if (!matched[i])
            differences.push_back({right.entries[i].name, "", std::to_string(right.entries[i].bytes.size()) + " bytes"});
    }
}

Json presetListing(const PresetDocument &document) {
    Json json = {{"kind", "preset"}, {"version", hexWord(document.version)}, {"engine", engineText(document)}};
    json["parameters"] = Json::array();
    for (const auto &[address, value] : Parameters(document).values) {
        const auto [componentId, paramId, ignored] = address;
        json["parameters"].push_back({{"component", componentId},
                                      {"id", paramId},
                                      {"name", parameterName(componentId, paramId)},
                                      {"size", value.size()},
                                      {"value", valueText(componentId, paramId, value)}});
    }
    return json;
}

Json packageListing(const Archive &archive) {
    Json json = {{"kind", "package"}, {"models", Json::array()}, {"entries", Json::array()}};
    if (archive.ssids) {
        for (const SsidRecord &record : archive.ssids->records) {
            json["models"].push_back({{"package", record.packageIndex}, {"ssid", record.text.substr(0, record.text.find('\0'))}});
        }
    }
    for (const ArchiveEntry &entry : archive.entries) {
        Json item = {{"name", entry.name}, {"offset", entry.dataOffset}, {"size", entry.size}};
        PresetDocument document;
        if (isPresetName(entry.name) && entry.method == 0 && parsePreset(entry.bytes, document) == PresetParse::parsed) {
            item["version"] = hexWord(document.version);
            item["engine"] = engineText(document);
            item["parameters"] = Parameters(document).values.size();
        }
        json["entries"].push_back(std::move(item));
    }
    return json;
}

std::string plain(const Json &value) {
    return value.is_string() ? value.get<std::string>() : value.dump(-1, ' ', false, Json::error_handler_t::replace);
}

// Rows of the named members, each column as wide as its widest text.
std::string table(const Json &rows, std::initializer_list<const char *> columns) {
    std::vector<std::vector<std::string>> cells = {{columns.begin(), columns.end()}};
    for (const Json &row : rows) {
        std::vector<std::string> &line = cells.emplace_back();
        for (const char *column : columns) line.push_back(row.contains(column) ? plain(row[column]) : "-");
    }
    std::string text;
    for (const std::vector<std::string> &line : cells) {
        std::string row;
        for (size_t i = 0; i < line.size(); ++i) {
            size_t width = 0;
            for (const std::vector<std::string> &other : cells) width = std::max(width, other[i].size());
            row += line[i] + std::string(width - line[i].size() + 2, ' ');
        }
        text += row.substr(0, row.find_last_not_of(' ') + 1) + "\n";
    }
    return text;
}

}  // namespace

std::vector<Difference> differencesOf(const std::string &leftFile, const Bytes &left, const std::string &rightFile,
                                      const Bytes &right) {
    std::vector<Difference> differences;
    if (looksLikePackage(left) != looksLikePackage(right)) {
        throw Failure(Exit::usage, leftFile + ", " + rightFile + ": found a preset and a package, expected two of one kind");
    }
    if (looksLikePackage(left)) {
        const Archive one = readArchive(left), other = readArchive(right);
        for (const auto &[archive, file] : {std::pair{&one, &leftFile}, {&other, &rightFile}}) {
            if (archive->problem) {
                throw Failure(Exit::input, *file + ": offset " + std::to_string(archive->problem->offset) + ": found \"" +
                                               archive->problem->what + "\", expected a sound zip directory; see vx preset check");
            }
        }
        compareArchives(one, other, differences);
        return differences;
    }
    documentOf(leftFile, left);
    documentOf(rightFile, right);
    compareImages("", left, right, differences);
    return differences;
}

Json listing(const std::string &file, const Bytes &bytes) {
    if (!looksLikePackage(bytes)) return presetListing(documentOf(file, bytes));
    const Archive archive = readArchive(bytes);
    if (archive.problem) {
        throw Failure(Exit::input, file + ": offset " + std::to_string(archive.problem->offset) + ": found \"" +
                                       archive.problem->what + "\", expected a sound zip directory; see vx preset check");
    }
    return packageListing(archive);
}

std::string listingText(const Json &listing) {
    if (listing["kind"] == "preset") {
        return "version " + plain(listing["version"]) + ", engine " + plain(listing["engine"]) + "\n" +
               table(listing["parameters"], {"component", "id", "size", "value", "name"});
    }
    return table(listing["models"], {"package", "ssid"}) + "\n" +
           table(listing["entries"], {"name", "offset", "size", "version", "engine", "parameters"});
}

}  // namespace vx::preset
