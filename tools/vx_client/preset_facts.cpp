// SPDX-License-Identifier: MIT
#include "tools/vx_client/preset_facts.h"

#include <algorithm>

#include "preset/file_source.h"
#include "preset/package_discovery.h"
#include "preset/package_reader.h"
#include "preset/preset_format.h"
#include "preset/preset_names.h"
#include "preset/preset_writer.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

using namespace vxcomn;

// More than any preset comes to.
constexpr size_t kLargestPreset = 16U << 20;
constexpr size_t kHashBytes = 32;

struct Lines final : ReadLog {
    void line(WideView text) override {
        std::string utf8 = toUtf8(text);
        while (!utf8.empty() && utf8.back() == '\n') utf8.pop_back();
        lines.push_back(printable(std::move(utf8)));
    }
    void standardError(std::string_view text) override { lines.emplace_back(printable(std::string(text))); }
    std::vector<std::string> lines;
};

std::vector<uint8_t> readImage(OpenedPreset &opened) {
    std::vector<uint8_t> image;
    while (image.size() < opened.size && image.size() < kLargestPreset) {
        const size_t left = opened.size - image.size();
        const auto piece = opened.stream->takeUpTo(std::min(left, ByteCursor::kLargestTake));
        if (piece.empty()) break;
        image.insert(image.end(), piece.begin(), piece.end());
    }
    return image;
}

void readPreset(const std::vector<uint8_t> &image, PresetFacts &facts) {
    PresetDocument document;
    if (image.size() < kHashOffset + kHashBytes || parsePreset(image, document) != PresetParse::parsed) return;
    facts.sound = true;
    facts.version = document.version;
    facts.digest = digestText(image.data() + kHashOffset);
    facts.digestHolds = !document.hash;
    if (!document.hasLongHeader()) {
        facts.engine = kDefaultEngineName;
        return;
    }
    const auto end = std::find(document.engineName.begin(), document.engineName.end(), uint8_t{0});
    facts.engine = std::string(document.engineName.begin(), end);
}

}  // namespace

std::string digestText(const uint8_t *bytes) {
    std::string text;
    for (size_t i = 0; i < kHashBytes; ++i) text += textf("%02x", bytes[i]);
    return text;
}

PresetFacts findPreset(const Device &device, const std::string &apo, const std::string &ioConfig, const std::string &content) {
    PresetFacts facts;
    Lines log;
    const SystemFacts system = systemFacts();
    facts.packageFolder = toUtf8(packageFolder(system));
    const WideString package = findPresetPackage(device.deviceId, system, nullptr);
    if (!device.deviceId.empty()) facts.packageName = toUtf8(presetPackageName(device.deviceId));
    facts.packagePath = toUtf8(package);
    if (ioConfig.empty()) return facts;
    const PresetKey key = {device.index, toWide(apo), toWide(ioConfig), toWide(content)};
    const WideString path = package.empty() ? loosePresetPath(key) : packagePresetPath(key);
    facts.path = toUtf8(path);
    OpenedPreset opened = OpenPresetFile({package, path, device.subsystemId}, openFileSource, &log);
    facts.log = std::move(log.lines);
    if (!opened) return facts;
    facts.found = true;
    facts.entry = opened.entryName;
    readPreset(readImage(opened), facts);
    return facts;
}

}  // namespace vx::client
