// SPDX-License-Identifier: MIT
#include "preset/package_reader.h"

#include "preset/package_maps.h"
#include "preset/zip_directory.h"

namespace vxcomn {
namespace {

class PackageSearch {
  public:
    PackageSearch(const PresetLocation &where, OpenedPreset &out, ReadLog *log) : where_(where), out_(out), log_(log) {}

    // Leaves the stream on the image, or gives it up.
    void run() {
        const char *const message = ReadZipEndRecord(*out_.source, end_);
        if (message != nullptr) {
            if (log_ != nullptr) log_->standardError(message);
            return fail(VX_TEXT("Failed to read the end record.\n"));
        }
        out_.stream = std::make_unique<ByteCursor>(*out_.source);
        if (!out_.stream->seek(end_.centralDirectoryOffset)) return fail(VX_TEXT("Failed to position to the central directory.\n"));
        out_.stream->expectUpTo(end_.position);  // so that the directory comes in one read
        ZipHeader ssidMap, chidMap;
        if (!readMapHeader(kSsidMapName, VX_TEXT("first"), ssidMap) || !readMapHeader(kChidMapName, VX_TEXT("second"), chidMap))
            return;
        if (!choosePackage(ssidMap, chidMap)) return;
        if (end_.totalEntries < kFewestEntries) return fail(VX_TEXT("The selected zip archive doesn't contain any preset.\n"));
        say(log_, VX_TEXT("Package index = "), out_.packageIndex, VX_TEXT(".\n"));
        findEntry();
    }

  private:
    template <class... Pieces>
    void fail(const Pieces &...pieces) {
        say(log_, pieces...);
        out_.stream.reset();
        out_.source.reset();
    }

    bool readMapHeader(std::string_view name, const VXWCHAR *ordinal, ZipHeader &header) {
        const char *const reason = readZipHeader(*out_.stream, kMapNameBytes, header);
        if (reason != nullptr) {
            fail(VX_TEXT("Failed to access '"), name, VX_TEXT("'file, reason: "), std::string_view(reason), VX_TEXT(".\n"));
            return false;
        }
        if (header.name.size() != name.size() || !beginsIgnoringCase(header.name, name)) {
            fail(VX_TEXT("Invalid name of "), ordinal, VX_TEXT(" zip entry, must be '"), name, VX_TEXT("'.\n"));
            return false;
        }
        return true;
    }

    // Reads the maps with a window of their own, so that the directory stays in the stream's.
    bool choosePackage(const ZipHeader &ssidMap, const ZipHeader &chidMap) {
        MapHeader ignored;
        SsidMap ssids;
        ByteCursor maps(*out_.source);
        if (!seekZipEntry(maps, ssidMap) || !readSsidMap(maps, ignored, ssids)) {
            fail(VX_TEXT("Failed to init SSIDMap from zip archive.\n"));
            return false;
        }
        out_.packageIndex = ssids.find(toUtf8(where_.ssid));
        if (out_.packageIndex != -1) {
            say(log_, VX_TEXT("Found preset package with index "), out_.packageIndex, VX_TEXT(" for SSID "), where_.ssid,
                VX_TEXT(".\n"));
            return true;
        }
        ChidMap chids;
        if (!seekZipEntry(maps, chidMap) || !readChidMap(maps, chids)) {
            fail(VX_TEXT("Failed to init CHIDMap from zip archive.\n"));
            return false;
        }
        // Kept: what the map holds is compared with nothing.
        say(log_, VX_TEXT("Zip archive doesn't contain preset package for SSID = "), where_.ssid, VX_TEXT(".\n"));
        say(log_, VX_TEXT("CHIDs listed in zip archive don't match this unit.\n"));
        return true;
    }

    // Kept: a name matches that merely begins with the path. An unknown unit takes the first package that has it.
    bool matches(std::string_view name, std::string_view path) const noexcept {
        if (out_.packageIndex != -1) return beginsIgnoringCase(name, path);
        const size_t slash = name.find('/');
        return slash != std::string_view::npos && beginsIgnoringCase(name.substr(slash + 1), path);
    }

    void findEntry() {
        std::string path;
        if (out_.packageIndex != -1) path = std::to_string(static_cast<uint32_t>(out_.packageIndex)) + '/';
        path += toUtf8(where_.presetPath);
        say(log_, VX_TEXT("Searching for preset package with path '"), std::string_view(path), VX_TEXT("' ...\n"));
        ZipHeader header;
        for (uint32_t entry = kFewestEntries - 1; entry < end_.totalEntries; ++entry) {
            const char *const reason = readZipHeader(*out_.stream, kEntryNameBytes, header);
            if (reason != nullptr) {
                out_.entryName = header.name;
                return fail(VX_TEXT("Failed to read zip entry #"), entry, VX_TEXT(", reason: '"), std::string_view(reason),
                            VX_TEXT("'.\n"));
            }
            if (matches(header.name, path)) return select(header);
        }
        out_.entryName = header.name;
        fail(VX_TEXT("Couldn't find matching preset binary.\n"));
    }

    void select(const ZipHeader &header) {
        out_.entryName = header.name;
        say(log_, VX_TEXT("Found preset binary '"), header.name, VX_TEXT("', selecting it.\n"));
        if (!seekZipEntry(*out_.stream, header)) return fail(VX_TEXT("Failed to open preset file.\n"));
        out_.size = header.size;
        say(log_, VX_TEXT("Done.\n"));
    }

    const PresetLocation &where_;
    OpenedPreset &out_;
    ReadLog *const log_;
    ZipEndRecord end_;
};

OpenedPreset openLooseFile(const PresetLocation &where, const SourceOpener &open, ReadLog *log) {
    OpenedPreset opened;
    if (where.presetPath.empty()) {
        say(log, VX_TEXT("Failed to open preset file.\n"));
        return opened;
    }
    say(log, VX_TEXT("Opening preset binary file '"), where.presetPath, VX_TEXT("' ...\n"));
    Status why = status::ok;
    opened.source = open(where.presetPath, why);
    opened.packageIndex = 0;
    const std::optional<uint64_t> size = opened.source ? opened.source->size() : std::nullopt;
    // Kept: this line stands whether the file opened or not.
    say(log, VX_TEXT("Done.\n"));
    if (!size) {
        say(log, VX_TEXT("Failed to open preset file.\n"));
        opened.source.reset();
        return opened;
    }
    opened.size = static_cast<uint32_t>(*size);
    opened.stream = std::make_unique<ByteCursor>(*opened.source);
    return opened;
}

}  // namespace

OpenedPreset OpenPresetFile(const PresetLocation &where, const SourceOpener &open, ReadLog *log) {
    if (where.presetZipPath.empty()) return openLooseFile(where, open, log);
    OpenedPreset opened;
    say(log, VX_TEXT("Opening preset zip archive '"), where.presetZipPath, VX_TEXT("' ...\n"));
    Status why = status::ok;
    opened.source = open(where.presetZipPath, why);
    if (!opened.source) {
        say(log, VX_TEXT("Failed to open zip archive with file name '"), where.presetZipPath, VX_TEXT("' with error code "), why,
            VX_TEXT(".\n"));
        return opened;
    }
    PackageSearch(where, opened, log).run();
    return opened;
}

}  // namespace vxcomn
