// SPDX-License-Identifier: MIT
//
// The preset reader and the tools' parser on any bytes. The first byte chooses flags, whether the engine is locked and where the
// walk is stopped; the rest is the image. Taking the image apart and writing it again must be the identity.
#include <algorithm>
#include <cstdlib>
#include <vector>

#include "preset/preset_reader.h"
#include "preset/preset_writer.h"

using namespace vxcomn;

namespace {

struct Owner final : PresetOwner {
    PresetHash &presetHash() override { return hash; }
    const WideString &engineShortName() const override { return name; }
    const EngineConfig &engineConfig() const override { return config; }
    bool engineLocked() const override { return locked; }
    void setEngineShortName(const WideString &value) override { name = value; }
    void setEngineConfig(const EngineConfig &value) override { config = value; }
    PresetHash hash{};
    WideString name;
    EngineConfig config{};
    bool locked = false;
};

struct Receiver final : PresetParameters {
    bool parameter(int32_t, int32_t, int32_t, std::span<const uint8_t> value) override {
        if (value.empty() || value.size() > kLargestValueBytes) std::abort();
        for (const uint8_t byte : value) sum += byte;  // touches every byte that is said to be there
        return ++calls != stopAfter;
    }
    size_t calls = 0, stopAfter = 0, sum = 0;
};

struct Log final : ReadLog {
    void line(WideView text) override { units += text.size(); }
    void standardError(std::string_view) override {}
    size_t units = 0;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    if (size == 0) return 0;
    const uint8_t choice = data[0];
    const std::vector<uint8_t> image(data + 1, data + size);
    MemorySource source(image);
    ByteCursor stream(source);
    Owner owner;
    owner.locked = (choice & 4) != 0;
    Receiver receiver;
    receiver.stopAfter = choice >> 5;
    Log log;
    // The image may be said to be shorter than the file is, as in a package.
    const size_t said = (choice & 8) != 0 ? image.size() - image.size() / 4 : image.size();
    const PresetLoadResult result = loadPreset(stream, static_cast<uint32_t>(said), choice & 3, owner, &receiver, &log);
    if (receiver.calls < result.delivered || receiver.calls > result.delivered + 1) std::abort();

    PresetDocument document;
    if (parsePreset(image, document) == PresetParse::parsed && writePreset(document) != image) std::abort();
    return 0;
}
