// SPDX-License-Identifier: MIT
#include "tools/vx_preset/check.h"

#include "platform/text.h"
#include "preset/package_reader.h"
#include "preset/preset_reader.h"
#include "preset/preset_writer.h"
#include "tools/vx_preset/archive.h"

namespace vx::preset {
namespace {

using namespace vxcomn;

struct Lines final : ReadLog {
    void line(WideView text) override {
        std::string utf8 = toUtf8(text);
        while (!utf8.empty() && utf8.back() == '\n') utf8.pop_back();
        lines.push_back(std::move(utf8));
    }
    void standardError(std::string_view text) override { lines.emplace_back(text); }
    std::vector<std::string> lines;
};

// An owner without an engine, which takes whatever the preset names.
struct NewOwner final : PresetOwner {
    PresetHash &presetHash() override { return hash; }
    const WideString &engineShortName() const override { return name; }
    const EngineConfig &engineConfig() const override { return config; }
    bool engineLocked() const override { return false; }
    void setEngineShortName(const WideString &value) override { name = value; }
    void setEngineConfig(const EngineConfig &value) override { config = value; }
    PresetHash hash{};
    WideString name;
    EngineConfig config{};
};

struct Counter final : PresetParameters {
    bool parameter(int32_t, int32_t, int32_t, std::span<const uint8_t>) override { return true; }
};

struct FaultText {
    PresetFault fault;
    const char *found;
    const char *expected;
};
constexpr FaultText kFaults[] = {
    {PresetFault::versionMissing, "fewer than four bytes", "a version word"},
    {PresetFault::versionTooLow, "version ", "at least 1048578 (0x100002)"},
    {PresetFault::componentIdCutOff, "the end of the file inside a component id", "a whole block, or the end of the image"},
    {PresetFault::blockHeaderCutOff, "the end of the file inside a block's header", "component id, first and last id"},
    {PresetFault::sizeMissing, "the end of the file", "the size of a value"},
    {PresetFault::sizeTooLarge, "a value of as many bytes as ", "at most 65536"},
    {PresetFault::valueCutOff, "the end of the file inside a value of as many bytes as ", "the whole value"},
    {PresetFault::runsPastEnd, "a block that runs past the image's end", "blocks that end with the image"},
};

std::string outcomeText(const PresetLoadResult &result) {
    const std::string kept = "; " + std::to_string(result.delivered) + " values are delivered";
    switch (result.outcome) {
        case PresetLoad::badVersion:
            return "refuses the preset: nothing is loaded";
        case PresetLoad::damaged:
            return "reports damage" + kept;
        default:
            return "says nothing" + kept;
    }
}

void checkHeader(const Bytes &image, uint64_t base, const std::string &entry, CheckReport &report) {
    PresetDocument document;
    if (parsePreset(image, document) == PresetParse::headerCutOff) {
        report.findings.push_back({base + image.size(), entry, "the end of the file inside the header",
                                   document.hasLongHeader() ? "72 bytes of header" : "36 bytes of header",
                                   "takes missing words for 0"});
        return;
    }
    if (document.hash) {
        report.findings.push_back({base + kHashOffset, entry, "a hash that is not the image's digest",
                                   "the digest, as vx preset compile writes it",
                                   "takes the hash for an identity and never checks it"});
    }
    if (!document.hasLongHeader() || document.version < kLowestPresetVersion) return;
    uint32_t size = 0;
    ByteCursor(document.engineConfig).u32(size);
    if (size != document.engineConfig.size() || size > kEngineConfigBytes) {
        report.findings.push_back(
            {base + 52, entry,
             "an engine record of " + std::to_string(document.engineConfig.size()) + " bytes that says " + std::to_string(size),
             "equal numbers up to 524", "keeps at most 524 bytes"});
    }
    if (document.engineName.empty() || document.engineName.back() != 0) {
        report.findings.push_back(
            {base + 44, entry, "an engine name without its NUL", "a name that counts its NUL", "takes the bytes as they are"});
    }
}

// Loads the image of `size` bytes that begins where the stream stands.
void checkLoad(ByteCursor &stream, uint32_t size, const std::string &entry, CheckReport &report) {
    const uint64_t base = stream.position();
    NewOwner owner;
    Counter counter;
    Lines log;
    const PresetLoadResult result = loadPreset(stream, size, LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS, owner, &counter, &log);
    report.log.insert(report.log.end(), log.lines.begin(), log.lines.end());
    for (const FaultText &text : kFaults) {
        if (text.fault != result.fault) continue;
        const std::string found = std::string(text.found).ends_with(' ') ? text.found + std::to_string(result.found) : text.found;
        report.findings.push_back({base + result.faultOffset, entry, found, text.expected, outcomeText(result)});
    }
}

// What the archive's own structures tell against it.
void checkArchive(const Archive &archive, CheckReport &report) {
    if (archive.problem) {
        report.findings.push_back(
            {archive.problem->offset, "", archive.problem->what, "a sound zip directory", "opens nothing behind this place"});
    }
    const char *const names[] = {"SSIDMAP.bin", "CHIDMAP.bin"};
    const bool sound[] = {archive.ssids.has_value(), archive.chids.has_value()};
    for (size_t i = 0; i < std::size(names); ++i) {
        if (sound[i]) continue;
        const bool there = i < archive.entries.size();
        report.findings.push_back({there ? archive.entries[i].dataOffset : 0, there ? archive.entries[i].name : "",
                                   "no sound map as entry #" + std::to_string(i), names[i],
                                   i == 0 ? "opens nothing" : "opens nothing for an unknown unit"});
    }
    if (!archive.problem && archive.entries.size() < kFewestEntries) {
        report.findings.push_back(
            {0, "", std::to_string(archive.entries.size()) + " entries", "a preset behind the two maps", "opens nothing"});
    }
    for (const ArchiveEntry &entry : archive.entries) {
        if (entry.method != 0) {
            report.findings.push_back({entry.headerOffset, entry.name, "compression method " + std::to_string(entry.method),
                                       "0, stored (zip -0)", "takes the compressed bytes for the preset"});
        } else if (entry.bytes.size() < entry.size) {
            report.findings.push_back({entry.dataOffset, entry.name,
                                       std::to_string(entry.bytes.size()) + " bytes up to the file's end",
                                       std::to_string(entry.size), "reads what there is"});
        } else if (zipChecksum(entry.bytes) != entry.crc) {
            report.findings.push_back({entry.headerOffset, entry.name, "a checksum that is not the entry's",
                                       "the checksum of its bytes", "never checks it"});
        }
    }
}

}  // namespace

CheckReport checkPreset(const Bytes &image) {
    CheckReport report;
    checkHeader(image, 0, "", report);
    MemorySource source(image);
    ByteCursor stream(source);
    checkLoad(stream, static_cast<uint32_t>(image.size()), "", report);
    return report;
}

CheckReport checkPackage(const Bytes &bytes, const std::optional<OpenRequest> &request) {
    CheckReport report;
    const Archive archive = readArchive(bytes);
    checkArchive(archive, report);
    if (request) {
        Lines log;
        const auto open = [&bytes](const WideString &, Status &) { return std::make_unique<MemorySource>(bytes); };
        OpenedPreset opened = OpenPresetFile({VX_TEXT("package"), toWide(request->path), toWide(request->ssid)}, open, &log);
        report.log = log.lines;
        if (opened) {
            checkLoad(*opened.stream, opened.size, opened.entryName, report);
        } else {
            report.findings.push_back(
                {0, "", "no preset for " + request->path + " and " + request->ssid, "one", report.log.back()});
        }
        return report;
    }
    MemorySource source(bytes);
    for (const ArchiveEntry &entry : archive.entries) {
        if (!isPresetName(entry.name) || entry.method != 0) continue;
        checkHeader(entry.bytes, entry.dataOffset, entry.name, report);
        ByteCursor stream(source);
        stream.seek(entry.dataOffset);
        checkLoad(stream, entry.size, entry.name, report);
    }
    return report;
}

}  // namespace vx::preset
