// SPDX-License-Identifier: MIT
#include "preset/preset_reader.h"

#include <algorithm>
#include <string_view>

#include "preset/engine_identity.h"

namespace vxcomn {
namespace {

// Enough UTF-8 for the longest wide name and its NUL: no unit of wide text takes more than three bytes.
constexpr size_t kLongestEngineNameBytes = 3 * kLongestEngineName + 1;

struct Identity {
    WideString name;
    EngineConfig config;
};

class Load {
  public:
    Load(ByteCursor &stream, uint32_t size, PresetOwner &owner, PresetParameters *parameters, ReadLog *log)
        : stream_(stream), start_(stream.position()), end_(start_ + size), owner_(owner), parameters_(parameters), log_(log) {
        stream_.expectUpTo(end_);
    }

    PresetLoadResult run(uint32_t flags) {
        if (!readVersion()) return result_;
        readHash();
        if (hasLongHeader()) readLongHeader();
        if ((flags & LOAD_PRESET_ENGINE) != 0 && !adoptEngine())
            return end(PresetLoad::engineLocked, VX_TEXT("Skipped loading of parameters\n"));
        if ((flags & LOAD_PRESET_PARAMETERS) == 0)
            return end(PresetLoad::parametersSkipped, VX_TEXT("Skipped loading of parameters\n"));
        if (hasLongHeader()) stream_.seek(start_ + header_.globalParamsPos);
        if (!walkBlocks() || damaged_) return end(PresetLoad::damaged, VX_TEXT("Preset file is damaged!\n"));
        // A receiver is always told about the bypass, also when it has stopped the walk before.
        const uint8_t notBypassed = 0;
        if (parameters_ != nullptr && !bypassSeen_) {
            parameters_->parameter(kGlobalComponent, kBypassAllParam, kAllChannels, {&notBypassed, 1});
        }
        return end(!goOn_ ? PresetLoad::stopped : cutOff_ ? PresetLoad::cutOff : PresetLoad::complete, VX_TEXT("Done\n"));
    }

  private:
    bool hasLongHeader() const noexcept { return version_ < kShortHeaderVersion; }

    PresetLoadResult end(PresetLoad outcome, const VXWCHAR *line) {
        say(log_, line);
        result_.outcome = outcome;
        return result_;
    }

    void note(PresetFault fault, uint64_t position, uint32_t found) noexcept {
        if (result_.fault != PresetFault::none) return;
        result_.fault = fault;
        result_.faultOffset = position - start_;
        result_.found = found;
    }

    bool readVersion() {
        const bool arrived = stream_.u32(version_);
        if (arrived && version_ >= kLowestPresetVersion) {
            say(log_, VX_TEXT("Preset file version = 0x"), Hexadecimal{version_}, VX_TEXT("\n"));
            return true;
        }
        note(arrived ? PresetFault::versionTooLow : PresetFault::versionMissing, start_, version_);
        say(log_, VX_TEXT("Invalid preset file version 0x"), Hexadecimal{version_}, VX_TEXT("\n"));
        result_.outcome = PresetLoad::badVersion;
        return false;
    }

    // The owner's hash is the last preset's from here on, whatever becomes of the load. Words that are missing keep their old
    // value.
    void readHash() {
        PresetHash &hash = owner_.presetHash();
        for (uint32_t &word : hash) stream_.u32(word);
        if (log_ == nullptr) return;
        WideString digits;
        for (const uint32_t word : hash) read_log::append(digits, Hexadecimal{word});
        say(log_, VX_TEXT("Preset file hash = "), digits, VX_TEXT("\n"));
    }

    // Kept: not checked. A word that is missing reads as 0.
    void readLongHeader() {
        stream_.u32(header_.bypassAll);
        say(log_, VX_TEXT("BypassAll = "), static_cast<int32_t>(header_.bypassAll), VX_TEXT("\n"));
        readPair(VX_TEXT("EngineShortNamePos = "), header_.engineShortNamePos, VX_TEXT(", EngineShortNameSize = "),
                 header_.engineShortNameSize);
        readPair(VX_TEXT("EngineConfigPos = "), header_.engineConfigPos, VX_TEXT(", EngineConfigSize = "),
                 header_.engineConfigSize);
        readPair(VX_TEXT("globalParamsPos = "), header_.globalParamsPos, VX_TEXT(", globalParamsSize = "),
                 header_.globalParamsSize);
        readPair(VX_TEXT("componentParamsPos = "), header_.componentParamsPos, VX_TEXT(", componentParamsSize = "),
                 header_.componentParamsSize);
    }

    // The words print as signed numbers.
    void readPair(const VXWCHAR *posLabel, uint32_t &pos, const VXWCHAR *sizeLabel, uint32_t &size) {
        stream_.u32(pos);
        stream_.u32(size);
        say(log_, posLabel, static_cast<int32_t>(pos), sizeLabel, static_cast<int32_t>(size), VX_TEXT("\n"));
    }

    Identity readIdentity() {
        if (!hasLongHeader()) return {toWide(kDefaultEngineName), kDefaultEngineConfig};
        stream_.seek(start_ + header_.engineShortNamePos);
        const std::span<const uint8_t> stored =
            stream_.takeUpTo(std::min<size_t>(header_.engineShortNameSize, kLongestEngineNameBytes));
        std::string_view utf8(reinterpret_cast<const char *>(stored.data()), stored.size());
        utf8 = utf8.substr(0, utf8.find('\0'));
        Identity identity{toWide(utf8), {}};
        if (identity.name.size() > kLongestEngineName) identity.name.resize(kLongestEngineName);
        stream_.seek(start_ + header_.engineConfigPos);
        identity.config = engineConfigFromBytes(stream_.takeUpTo(std::min(header_.engineConfigSize, kEngineConfigBytes)));
        return identity;
    }

    // False if the preset wants another engine and the owner is locked to its own.
    bool adoptEngine() {
        const Identity preset = readIdentity();
        if (preset.name == owner_.engineShortName() && sameEngineConfig(preset.config, owner_.engineConfig())) return true;
        if (owner_.engineLocked()) {
            say(log_, VX_TEXT("Couldn't change engine to '"), preset.name, VX_TEXT("' because it's locked to '"),
                owner_.engineShortName(), VX_TEXT("'\n"));
            return false;
        }
        // In this order: the first two tear down what depends on the engine, the last two build it up again.
        owner_.setEngineConfig(EngineConfig{});
        owner_.setEngineShortName(WideString());
        owner_.setEngineConfig(preset.config);
        owner_.setEngineShortName(preset.name);
        return true;
    }

    // Kept: only standing exactly at the image's end ends the walk. A block that crosses it goes on in whatever follows in the
    // file. Kept: a receiver that stops the walk at the last value of a block stops it behind the next block's header. False if a
    // block's header is cut off.
    bool walkBlocks() {
        while (stream_.position() != end_) {
            const uint64_t at = stream_.position();
            if (at > end_) note(PresetFault::runsPastEnd, end_, 0);
            int32_t componentId = 0, paramIdMin = 0, paramIdMax = 0;
            if (!stream_.i32(componentId)) {
                note(PresetFault::componentIdCutOff, at, 0);
                cutOff_ = true;
                return true;
            }
            const bool hasMin = stream_.i32(paramIdMin);
            if (!hasMin || !stream_.i32(paramIdMax)) {
                note(PresetFault::blockHeaderCutOff, at, hasMin ? 2 : 1);
                return false;
            }
            say(log_, VX_TEXT("ComponentId = "), componentId, VX_TEXT(", ParamIdMin = "), paramIdMin, VX_TEXT(", ParamIdMax = "),
                paramIdMax, VX_TEXT("\n"));
            for (int64_t paramId = paramIdMin; paramId <= paramIdMax; ++paramId) {
                if (!goOn_) return true;
                if (!readEntry(componentId, static_cast<int32_t>(paramId))) break;
            }
        }
        return true;
    }

    // False if the block cannot go on. The walk goes on behind the place of the damage, and takes what stands there for a new
    // block.
    bool readEntry(int32_t componentId, int32_t paramId) {
        const uint64_t at = stream_.position();
        uint32_t size = 0;
        const bool arrived = stream_.u32(size);
        if (!arrived || size > kLargestValueBytes) {
            note(arrived ? PresetFault::sizeTooLarge : PresetFault::sizeMissing, at, size);
            damaged_ = true;
            return false;
        }
        if (size == 0) return true;
        const std::span<const uint8_t> value = stream_.takeUpTo(size);
        if (!value.empty()) firstByte_ = value.front();
        if (value.size() < size) {
            note(PresetFault::valueCutOff, at, size);
        } else if (parameters_ != nullptr) {
            ++result_.delivered;
            goOn_ = parameters_->parameter(componentId, paramId, kAllChannels, value);
        }
        // Kept: one that is cut off counts too, with the first byte of the value before it if none of its own arrived.
        if (componentId == kGlobalComponent && paramId == kBypassAllParam) {
            bypassSeen_ = true;
            say(log_, VX_TEXT("BypassAll == "), static_cast<int32_t>(firstByte_), VX_TEXT("\n"));
        }
        return true;
    }

    ByteCursor &stream_;
    const uint64_t start_;
    const uint64_t end_;
    PresetOwner &owner_;
    PresetParameters *const parameters_;
    ReadLog *const log_;
    uint32_t version_ = 0;
    LongHeader header_;
    bool goOn_ = true;
    bool damaged_ = false;
    bool cutOff_ = false;
    bool bypassSeen_ = false;
    uint8_t firstByte_ = 0;
    PresetLoadResult result_;
};

}  // namespace

PresetLoadResult loadPreset(ByteCursor &stream, uint32_t size, uint32_t flags, PresetOwner &owner, PresetParameters *parameters,
                            ReadLog *log) {
    return Load(stream, size, owner, parameters, log).run(flags);
}

}  // namespace vxcomn
