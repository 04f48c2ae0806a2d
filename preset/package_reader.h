// SPDX-License-Identifier: MIT
//
// OpenPresetFile: turns a preset path into an open stream that stands on a preset image, from a file of its own or from an entry of
// a preset package. Everything is parsed again at every call. Nothing is decompressed, and of a package only the end record, the
// central directory, the maps and the chosen entry are read. Control threads; independent calls may run at the same time, each has
// its own buffers.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "platform/status.h"
#include "platform/text.h"
#include "preset/byte_cursor.h"
#include "preset/read_log.h"

namespace vxcomn {

// Opens a file by its path; null if that fails, with the system's status.
using SourceOpener = std::function<std::unique_ptr<ByteSource>(const WideString &path, Status &why)>;

// Where to look.
struct PresetLocation {
    WideString presetZipPath;  // empty: presetPath names a file
    WideString presetPath;
    WideString ssid;  // of the endpoint; chooses among a package's machine models
};

struct OpenedPreset {
    std::unique_ptr<ByteSource> source;  // null: there is no preset
    std::unique_ptr<ByteCursor> stream;  // stands on the image's first byte
    std::string entryName;               // of the last header read from a package: the chosen one's, if there is one
    uint32_t size = 0;                   // of the image
    int32_t packageIndex = -1;           // of the package chosen by the subsystem id; 0 for a loose file

    explicit operator bool() const noexcept { return stream != nullptr; }
};

// Every failure is a line in the log and nothing opened.
OpenedPreset OpenPresetFile(const PresetLocation &where, const SourceOpener &open, ReadLog *log);

}  // namespace vxcomn
