// SPDX-License-Identifier: MIT
#include "tools/vx_preset/package_json.h"

#include <algorithm>

#include "platform/text.h"
#include "preset/zip_directory.h"
#include "tools/vx_preset/failure.h"
#include "tools/vx_preset/preset_json.h"

namespace vx::preset {
namespace {

using namespace vxcomn;
namespace fs = std::filesystem;

constexpr MapHeader kNoHeader{};
constexpr uint32_t kUsualRecordSize = 36;  // room for "SUBSYS_12345678" and a spare half
constexpr uint32_t kLargestRecordSize = 0x10000;

std::string trimmed(const std::string &field) {
    const size_t last = field.find_last_not_of('\0');
    return last == std::string::npos ? std::string() : field.substr(0, last + 1);
}

bool isAscii(const std::string &text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c <= '~'; });
}

void putRecords(Json &json, const SsidMap &map, const char *textName) {
    if (!map.records.empty()) json["recordSize"] = map.recordSize;
    json["records"] = Json::array();
    for (const SsidRecord &record : map.records) {
        Json item = {{"package", record.packageIndex}};
        const std::string text = trimmed(record.text);
        if (isAscii(text)) {
            item[textName] = text;
        } else {
            item["bytes"] = hexText({reinterpret_cast<const uint8_t *>(text.data()), text.size()});
        }
        json["records"].push_back(std::move(item));
    }
}

SsidMap takeRecords(const JsonAt &json, const char *textName) {
    SsidMap map;
    const std::vector<JsonAt> records = json.member("records").items();
    map.recordSize = kUsualRecordSize;
    if (const auto size = json.optional("recordSize"))
        map.recordSize = static_cast<uint32_t>(size->number(kRecordIndexBytes, kLargestRecordSize));
    for (const JsonAt &item : records) {
        item.only({"package", textName, "bytes"});
        SsidRecord record{item.member("package").u32(), {}};
        if (const auto bytes = item.optional("bytes")) {
            const Bytes raw = bytes->hex();
            record.text.assign(raw.begin(), raw.end());
        } else {
            record.text = item.member(textName).text();
        }
        if (record.text.size() > map.recordSize - kRecordIndexBytes) {
            item.fail(std::to_string(record.text.size()) + " bytes of text",
                      "at most " + std::to_string(map.recordSize - kRecordIndexBytes) + ", what \"recordSize\" leaves");
        }
        record.text.resize(map.recordSize - kRecordIndexBytes);
        map.records.push_back(std::move(record));
    }
    if (map.records.empty()) map.recordSize = 0;
    return map;
}

void takeHeader(const JsonAt &json, MapHeader &header) {
    const auto given = json.optional("header");
    if (!given) return;
    const Bytes bytes = given->hex();
    if (bytes.size() != header.size()) given->expected("eight bytes");
    std::copy(bytes.begin(), bytes.end(), header.begin());
}

Bytes ssidMapFromJson(const JsonAt &json) {
    if (json.has("bytes")) return json.member("bytes").hex();
    json.only({"header", "recordSize", "records"});
    MapHeader header{};
    takeHeader(json, header);
    return writeSsidMap(header, takeRecords(json, "ssid"));
}

Bytes chidMapFromJson(const JsonAt &json) {
    if (json.has("bytes")) return json.member("bytes").hex();
    json.only({"header", "groups"});
    ChidMap map;
    takeHeader(json, map.header);
    for (const JsonAt &group : json.member("groups").items()) {
        group.only({"word", "recordSize", "records"});
        map.groups.push_back({group.member("word").u32(), takeRecords(group, "chid")});
    }
    return writeChidMap(map);
}

// Maps that the records don't account for to the last byte are given as bytes.
Json ssidMapToJson(const Archive &archive) {
    const Bytes &bytes = archive.entries[0].bytes;
    if (!archive.ssids || writeSsidMap(archive.ssidHeader, *archive.ssids) != bytes) return {{"bytes", hexText(bytes)}};
    Json json = Json::object();
    if (archive.ssidHeader != kNoHeader) json["header"] = hexText(archive.ssidHeader);
    putRecords(json, *archive.ssids, "ssid");
    return json;
}

Json chidMapToJson(const Archive &archive) {
    const Bytes &bytes = archive.entries[1].bytes;
    if (!archive.chids || writeChidMap(*archive.chids) != bytes) return {{"bytes", hexText(bytes)}};
    Json json = Json::object();
    if (archive.chids->header != kNoHeader) json["header"] = hexText(archive.chids->header);
    json["groups"] = Json::array();
    for (const ChidGroup &group : archive.chids->groups) {
        Json item = {{"word", group.word}};
        putRecords(item, group.map, "chid");
        json["groups"].push_back(std::move(item));
    }
    return json;
}

// An entry's content in its most readable form that gives the same bytes back.
void putContent(Json &item, const Bytes &bytes) {
    PresetDocument document;
    if (parsePreset(bytes, document) == PresetParse::parsed && writePreset(document) == bytes) {
        item["preset"] = presetToJson(document);
    } else {
        item["bytes"] = hexText(bytes);
    }
}

PackageEntry entryFromJson(const JsonAt &item, const fs::path &folder) {
    item.only({"name", "preset", "file", "bytes"});
    PackageEntry entry{item.member("name").text(), {}};
    if (entry.name.empty() || entry.name.find('\0') != std::string::npos || entry.name.size() >= kNameLengthLimit) {
        item.member("name").expected("a name of 1 to 65,534 bytes without a NUL");
    }
    if (int{item.has("preset")} + int{item.has("file")} + int{item.has("bytes")} != 1) item.expected("one of preset, file, bytes");
    if (const auto preset = item.optional("preset")) {
        entry.bytes = writePreset(presetFromJson(*preset));
    } else if (const auto file = item.optional("file")) {
        const std::string path = (folder / file->text()).string();
        entry.bytes = imageOf(path, readInput(path));
    } else {
        entry.bytes = item.member("bytes").hex();
    }
    return entry;
}

// Package indices and endpoint indices order as numbers, so that the lowest package stands first and is the default of unknown
// units.
bool pathLess(const fs::path &left, const fs::path &right) {
    return std::lexicographical_compare(
        left.begin(), left.end(), right.begin(), right.end(), [](const fs::path &a, const fs::path &b) {
            const std::string x = a.string(), y = b.string();
            const auto isNumber = [](const std::string &s) { return s.find_first_not_of("0123456789") == std::string::npos; };
            if (isNumber(x) && isNumber(y) && x.size() != y.size()) return x.size() < y.size();
            return x < y;
        });
}

}  // namespace

Bytes imageOf(const std::string &file, const Bytes &content) {
    const auto first =
        std::find_if(content.begin(), content.end(), [](uint8_t c) { return c != ' ' && c != '\t' && c != '\n' && c != '\r'; });
    if (first == content.end() || *first != '{') return content;
    const Json json = parseJson(file, content);
    const JsonAt document(file, json);
    if (document.member("format").text() != "package") return writePreset(presetFromJson(document));
    const PackageInput package = packageFromJson(document, file == "-" ? fs::path() : fs::path(file).parent_path());
    auto archive = writePackage(package.entries);
    if (!archive) document.fail("more than an archive can hold", "at most 65,535 entries and 2 GiB");
    return std::move(*archive);
}

Json packageToJson(const std::string &file, const Archive &archive) {
    const auto refuse = [&file](uint64_t offset, const std::string &found, const std::string &expected) {
        throw Failure(Exit::input, file + ": offset " + std::to_string(offset) + ": found " + found + ", expected " + expected +
                                       "; see vx preset check");
    };
    if (archive.problem) refuse(archive.problem->offset, "\"" + archive.problem->what + "\"", "a sound zip directory");
    for (const ArchiveEntry &entry : archive.entries) {
        if (toUtf8(toWide(entry.name)) != entry.name)
            refuse(entry.headerOffset, "an entry name that is no UTF-8", "names in UTF-8");
        if (entry.method != 0) {
            refuse(entry.headerOffset, "entry '" + entry.name + "' compressed by method " + std::to_string(entry.method),
                   "stored entries, which alone are read (zip -0)");
        }
        if (entry.bytes.size() < entry.size)
            refuse(entry.dataOffset, "entry '" + entry.name + "' cut off", "its " + std::to_string(entry.size) + " bytes");
    }
    const std::string_view maps[] = {kSsidMapName, kChidMapName};
    for (size_t i = 0; i < std::size(maps); ++i) {
        const bool named = i < archive.entries.size() && archive.entries[i].name.size() == maps[i].size() &&
                           beginsIgnoringCase(archive.entries[i].name, maps[i]);
        if (!named) refuse(0, "another entry #" + std::to_string(i), std::string(maps[i]));
    }
    Json json = {{"format", "package"}, {"ssidMap", ssidMapToJson(archive)}, {"chidMap", chidMapToJson(archive)}};
    json["entries"] = Json::array();
    for (size_t i = 2; i < archive.entries.size(); ++i) {
        Json item = {{"name", archive.entries[i].name}};
        putContent(item, archive.entries[i].bytes);
        json["entries"].push_back(std::move(item));
    }
    return json;
}

PackageInput packageFromJson(const JsonAt &json, const fs::path &folder) {
    json.only({"format", "device", "ssidMap", "chidMap", "entries"});
    if (const JsonAt format = json.member("format"); format.text() != "package") format.expected("\"package\"");
    PackageInput package;
    if (const auto device = json.optional("device")) package.device = device->text();
    package.entries.push_back({std::string(kSsidMapName), ssidMapFromJson(json.member("ssidMap"))});
    package.entries.push_back({std::string(kChidMapName), chidMapFromJson(json.member("chidMap"))});
    if (const auto entries = json.optional("entries")) {
        for (const JsonAt &item : entries->items()) package.entries.push_back(entryFromJson(item, folder));
    }
    return package;
}

PackageInput packageFromFolder(const fs::path &folder) {
    const std::string document = (folder / "package.json").string();
    std::error_code error;
    if (!fs::exists(document, error)) {
        throw Failure(Exit::input, folder.string() + ": found no package.json, expected one with ssidMap and chidMap");
    }
    const Json json = parseJson(document, readInput(document));
    PackageInput package = packageFromJson(JsonAt(document, json), folder);
    std::vector<fs::path> files;
    for (const fs::directory_entry &entry : fs::recursive_directory_iterator(folder, error)) {
        const fs::path name = entry.path().filename();
        if (entry.is_regular_file(error) && (name == "Preset.bin" || name == "Preset.json"))
            files.push_back(fs::relative(entry.path(), folder));
    }
    std::sort(files.begin(), files.end(), pathLess);
    for (fs::path file : files) {
        const std::string path = (folder / file).string();
        file.replace_extension(".bin");
        const std::string name = file.generic_string();
        if (!isPresetName(name)) {
            throw Failure(
                Exit::input,
                path + ": found a preset here, expected it at <package>/<endpoint>/<APO type>/<I/O configuration>/<content>");
        }
        package.entries.push_back({name, imageOf(path, readInput(path))});
    }
    return package;
}

}  // namespace vx::preset
