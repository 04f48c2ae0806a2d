// SPDX-License-Identifier: MIT
//
// The parameter keys of all presets that a slot has on this endpoint: what a parameter that holds everywhere is written to.
#include "preset/apo_preset_file.h"
#include "preset/file_source.h"
#include "preset/preset_names.h"
#include "preset/trace_read_log.h"
#include "preset/zip_directory.h"

using namespace vxcomn;

namespace {

constexpr WideView kPresetExtension = VX_TEXT(".bin");

// What the end of an entry's name tells: .../<APOType>/<IOConfig>/<ContentType>/<file>.
struct EntryPlace {
    WideView apoType, ioConfig, contentType;
};

// False for a name with fewer than four slashes.
bool placeOf(WideView name, EntryPlace &place) {
    WideView file;
    for (WideView *part : {&file, &place.contentType, &place.ioConfig, &place.apoType}) {
        const size_t slash = name.rfind(VXWCHAR{'/'});
        if (slash == WideView::npos) return false;
        *part = name.substr(slash + 1);
        name = name.substr(0, slash);
    }
    return true;
}

bool isPresetName(WideView name) {
    return name.size() > kPresetExtension.size() &&
           equalIgnoringCase(name.substr(name.size() - kPresetExtension.size()), kPresetExtension);
}

// The names of the archive's presets, of whatever package. False, with a line in the log, if it is no package.
bool presetsInArchive(const WideString &path, std::vector<WideString> &names, ReadLog *log) {
    Status why = status::ok;
    const std::unique_ptr<ByteSource> source = openFileSource(path, why);
    if (!source) {
        say(log, VX_TEXT("Failed to open zip archive with file name '"), path, VX_TEXT("'.\n"));
        return false;
    }
    ZipEndRecord end;
    if (const char *const message = ReadZipEndRecord(*source, end)) {
        log->standardError(message);
        say(log, VX_TEXT("Failed to read the end record.\n"));
        return false;
    }
    ByteCursor stream(*source);
    if (!stream.seek(end.centralDirectoryOffset)) {
        say(log, VX_TEXT("Failed to position to the central directory.\n"));
        return false;
    }
    stream.expectUpTo(end.position);
    if (end.totalEntries < kFewestEntries) {
        say(log, VX_TEXT("The selected zip archive doesn't contain any preset.\n"));
        return false;
    }
    ZipHeader header;
    for (const VXWCHAR *map : {VX_TEXT("SSIDMAP"), VX_TEXT("CHIDMAP")}) {
        if (readZipHeader(stream, kMapNameBytes, header) == nullptr) continue;
        say(log, VX_TEXT("Failed to read "), map, VX_TEXT(" zip entry.\n"));
        return false;
    }
    for (uint32_t entry = kFewestEntries - 1; entry < end.totalEntries; ++entry) {
        if (const char *const reason = readZipHeader(stream, kEntryNameBytes, header)) {
            say(log, VX_TEXT("Failed to read zip entry #"), entry, VX_TEXT(", reason: '"), std::string_view(reason),
                VX_TEXT("'.\n"));
            continue;
        }
        if (WideString name = toWide(header.name); isPresetName(name)) names.push_back(std::move(name));
    }
    return true;
}

std::vector<WideString> subfolders(const WideString &folder, ReadLog *log) {
    Status why = status::ok;
    std::vector<WideString> names;
    for (FoundFile &found : findFiles(folder + VX_TEXT("\\*"), &why)) {
        if (found.isFolder) names.push_back(std::move(found.name));
    }
    if (why != status::ok) say(log, VX_TEXT("Directory doesn't exist.\n"));
    return names;
}

bool isFile(const WideString &path) {
    const std::vector<FoundFile> found = findFiles(path);
    return !found.empty() && !found.front().isFolder;
}

}  // namespace

void CAPOPresetFile::GetAllParamRegKeysForAPOType(WideView apoType, std::vector<WideString> &keys) {
    keys.clear();
    if (const WideString archive = PresetZipPath.get(); archive.empty())
        log(VX_TEXT("Preset .zip path is empty.\n"));
    else if (addKeysOfPackage(archive, apoType, keys))
        return;
    addKeysOfLooseTree(apoType, keys);
}

WideString CAPOPresetFile::parameterKeyFor(WideView apoType, WideView ioConfig, WideView contentType) const {
    const WideString configuration = configurationKey(DeviceIDAndEndpointIndex.get(), apoType);
    const WideString engine = EngineShortName.get(), profile = UserProfileName.get();
    return parameterKey({configuration, engine, ioConfig, profile, contentType}, ModuleVersion.get());
}

bool CAPOPresetFile::addKeysOfPackage(const WideString &archive, WideView apoType, std::vector<WideString> &keys) {
    log(VX_TEXT("Try to access preset .zip package first ...\n"));
    TraceReadLog readLog(this);
    std::vector<WideString> names;
    if (!presetsInArchive(archive, names, &readLog)) return false;
    if (names.empty()) {
        log(VX_TEXT("No presets found in .zip package.\n"));
        return false;
    }
    log(VX_TEXT("Building array of APO parameter registry keys ...\n"));
    for (const WideString &name : names) {
        EntryPlace place;
        if (placeOf(name, place) && place.apoType == apoType)
            keys.push_back(parameterKeyFor(apoType, place.ioConfig, place.contentType));
    }
    log(VX_TEXT("Done.\n"));
    return true;
}

void CAPOPresetFile::addKeysOfLooseTree(WideView apoType, std::vector<WideString> &keys) {
    log(VX_TEXT("Iterate through all preset files to find existing configs and contents ...\n"));
    TraceReadLog readLog(this);
    PresetKey preset = {EndpointIndex.get(), WideString(apoType), {}, {}};
    WideString slot = kLoosePresetRoot;
    read_log::append(slot, preset.endpointIndex == -1 ? 0 : preset.endpointIndex);
    slot.append(VX_TEXT("\\")).append(apoType);
    for (WideString &ioConfig : subfolders(slot, &readLog)) {
        preset.ioConfig = std::move(ioConfig);
        const WideString folder = slot + VX_TEXT("\\") + preset.ioConfig;
        log(VX_TEXT("Looking into %s directory for presets.\n"), folder);
        for (WideString &contentType : subfolders(folder, &readLog)) {
            preset.contentType = std::move(contentType);
            const WideString path = loosePresetPath(preset);
            log(VX_TEXT("Looking for %s preset file.\n"), path);
            if (!isFile(path)) {
                log(VX_TEXT("File doesn't exist.\n"));
                continue;
            }
            keys.push_back(parameterKeyFor(apoType, preset.ioConfig, preset.contentType));
            log(VX_TEXT("Found preset with registry path %s.\n"), keys.back());
        }
    }
}
