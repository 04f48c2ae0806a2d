// SPDX-License-Identifier: MIT
//
// The package reader on any bytes: opens with a known and an unknown subsystem id, and loads what opens.
#include <cstdlib>

#include "preset/package_reader.h"
#include "preset/preset_reader.h"

using namespace vxcomn;

namespace {

struct Owner final : PresetOwner {
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

struct Log final : ReadLog {
    void line(WideView text) override { last = text; }
    void standardError(std::string_view) override {}
    WideString last;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    const std::span<const uint8_t> bytes(data, size);
    const SourceOpener open = [bytes](const WideString &, Status &) { return std::make_unique<MemorySource>(bytes); };
    for (const VXWCHAR *ssid : {VX_TEXT("SUBSYS_12345678"), VX_TEXT("UNKNOWN"), VX_TEXT("")}) {
        Log log;
        OpenedPreset opened = OpenPresetFile({VX_TEXT("p.zip"), VX_TEXT("0/EFX"), ssid}, open, &log);
        // Whatever happens, the last line tells it.
        if (static_cast<bool>(opened) != (log.last == VX_TEXT("Done.\n"))) std::abort();
        if (!opened) continue;
        Owner owner;
        loadPreset(*opened.stream, opened.size, LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS, owner, nullptr, nullptr);
    }
    return 0;
}
