// SPDX-License-Identifier: MIT
//
// What the readers' tests hand in and look at afterwards: a log that keeps its lines, an owner and a receiver that keep what they
// were told, files that exist in memory only.
#pragma once

#include <algorithm>
#include <cstdint>
#include <map>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "platform/text.h"
#include "preset/package_reader.h"
#include "preset/preset_reader.h"
#include "preset/preset_writer.h"

namespace vxcomn::testing {

using Bytes = std::vector<uint8_t>;

struct RecordingLog final : ReadLog {
    void line(WideView text) override { lines.push_back(toUtf8(text)); }
    void standardError(std::string_view text) override { errors.emplace_back(text); }

    bool has(std::string_view line) const { return std::find(lines.begin(), lines.end(), line) != lines.end(); }
    std::string last() const { return lines.empty() ? std::string() : lines.back(); }

    std::vector<std::string> lines;
    std::vector<std::string> errors;
};

struct RecordingOwner final : PresetOwner {
    PresetHash &presetHash() override { return hash; }
    const WideString &engineShortName() const override { return name; }
    const EngineConfig &engineConfig() const override { return config; }
    bool engineLocked() const override { return locked; }
    void setEngineShortName(const WideString &value) override {
        name = value;
        changes.push_back("name " + toUtf8(value));
    }
    void setEngineConfig(const EngineConfig &value) override {
        config = value;
        changes.push_back("config " + std::to_string(value.Size));
    }

    PresetHash hash{};
    WideString name;
    EngineConfig config{};
    bool locked = false;
    std::vector<std::string> changes;
};

struct Delivered {
    int32_t componentId, paramId, channel;
    Bytes value;

    friend bool operator==(const Delivered &, const Delivered &) = default;
};

struct RecordingReceiver final : PresetParameters {
    bool parameter(int32_t componentId, int32_t paramId, int32_t channel, std::span<const uint8_t> value) override {
        values.push_back({componentId, paramId, channel, Bytes(value.begin(), value.end())});
        return values.size() != stopAfter;
    }

    size_t stopAfter = 0;  // the walk is stopped at this value; 0: never
    std::vector<Delivered> values;
};

// One load with everything that it left behind.
struct LoadRun {
    explicit LoadRun(std::span<const uint8_t> image, uint32_t flags = LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS) {
        run(image, flags);
    }
    LoadRun() = default;

    void run(std::span<const uint8_t> image, uint32_t flags = LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS) {
        MemorySource source(image);
        ByteCursor stream(source);
        result = loadPreset(stream, static_cast<uint32_t>(image.size()), flags, owner, &receiver, &log);
    }

    RecordingOwner owner;
    RecordingReceiver receiver;
    RecordingLog log;
    PresetLoadResult result;
};

inline const Delivered kNotBypassed = {-1, -18, -1, {0}};

// A preset with a long header, an engine of its own and values of several kinds.
inline PresetDocument longDocument() {
    PresetDocument document;
    document.version = 0x1000001;
    document.engineName = {'K', 'Z', 'N', 'O', 'V', 'A', 0};
    document.engineConfig = {20, 0, 0, 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
    document.blocks = {{-1, -18, -18, {{1}}},
                       {0, -21, -20, {{0, 0, 64, 65}, {0, 0, 64, 193}}},
                       {5, 115, 118, {{1}, {}, Bytes(13, 7), Bytes(13, 9)}}};
    return document;
}

// The same values behind the short header.
inline PresetDocument shortDocument() {
    PresetDocument document = longDocument();
    document.version = 0x1000010;
    document.engineName.clear();
    document.engineConfig.clear();
    return document;
}

// Files by path. Also counts what a reader asks of them and can let the n-th operation fail.
struct MemoryFiles {
    struct Source final : ByteSource {
        Source(MemoryFiles &owner, const Bytes &content) : files(owner), bytes(content) {}
        std::optional<uint64_t> size() override {
            if (files.fails()) return std::nullopt;
            return MemorySource(bytes).size();
        }
        bool seek(uint64_t) override { return !files.fails(); }
        size_t readAt(uint64_t offset, void *to, size_t count) override {
            ++files.reads;
            files.bytesRead += count;
            if (files.fails()) return 0;
            return MemorySource(bytes).readAt(offset, to, count);
        }
        MemoryFiles &files;
        const Bytes &bytes;
    };

    bool fails() { return ++operations == failAt; }

    SourceOpener opener() {
        return [this](const WideString &path, Status &why) -> std::unique_ptr<ByteSource> {
            const auto file = files.find(path);
            if (file == files.end() || fails()) {
                why = status::fileNotFound;
                return nullptr;
            }
            return std::make_unique<Source>(*this, file->second);
        };
    }

    std::map<WideString, Bytes> files;
    size_t operations = 0;
    size_t failAt = 0;
    size_t reads = 0;
    size_t bytesRead = 0;
};

}  // namespace vxcomn::testing
