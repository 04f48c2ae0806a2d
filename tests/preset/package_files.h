// SPDX-License-Identifier: MIT
//
// Packages for the tests, made by the library's own writer, and one call that opens a preset in them.
#pragma once

#include "preset/package_maps.h"
#include "preset/package_writer.h"
#include "tests/preset/recording.h"

namespace vxcomn::testing {

inline const WideString kZipPath = VX_TEXT("C:\\Windows\\System32\\VXAPODATU.BUS.DEV.zip");
inline const WideString kEfxPath = VX_TEXT("0/EFX/Output/AnyContent/Preset.bin");

inline SsidMap ssidMap(std::vector<SsidRecord> records, uint32_t recordSize = 36) {
    for (SsidRecord &record : records) record.text.resize(recordSize - 4);
    return {recordSize, std::move(records)};
}

inline ChidMap chidMap() {
    ChidMap map;
    map.groups = {{17, ssidMap({{3, "00000000-1111"}}, 64)}, {18, {}}};
    return map;
}

struct Package {
    explicit Package(SsidMap ssids = ssidMap({{7, "SUBSYS_1234ABCD"}, {9, "SUBSYS_00000009"}}))
        : entries{{"SSIDMAP.bin", writeSsidMap({}, ssids)}, {"CHIDMAP.bin", writeChidMap(chidMap())}} {}

    Package &add(std::string name, Bytes bytes = writePreset(shortDocument())) {
        entries.push_back({std::move(name), std::move(bytes)});
        return *this;
    }
    Bytes archive() const { return writePackage(entries).value(); }

    std::vector<PackageEntry> entries;
};

// One entry for each of two machine models.
inline Package twoModels() {
    PresetDocument other = shortDocument();
    other.blocks = {{2, 1, 1, {{99}}}};
    return Package().add("7/0/EFX/Output/AnyContent/Preset.bin").add("9/0/EFX/Output/AnyContent/Preset.bin", writePreset(other));
}

struct OpenRun {
    explicit OpenRun(Bytes archive, const WideString &ssid = VX_TEXT("SUBSYS_1234ABCD"), const WideString &path = kEfxPath) {
        files.files[kZipPath] = std::move(archive);
        open(ssid, path);
    }

    void open(const WideString &ssid, const WideString &path) {
        log = {};
        opened = OpenPresetFile({kZipPath, path, ssid}, files.opener(), &log);
    }

    // What a load from the opened stream delivers.
    std::vector<Delivered> load() {
        RecordingReceiver receiver;
        RecordingOwner owner;
        result = loadPreset(*opened.stream, opened.size, 3, owner, &receiver, nullptr);
        return receiver.values;
    }

    MemoryFiles files;
    RecordingLog log;
    OpenedPreset opened;
    PresetLoadResult result;
};

}  // namespace vxcomn::testing
