// SPDX-License-Identifier: MIT
//
// The walk over a preset: loadPreset reads one image from a stream, changes its owner's engine identity if the preset names
// another, and hands every parameter to a receiver. Seeding the store, restoring one parameter and capturing metadata are the same
// walk with other receivers. Control threads, on the thread that changes a property or resets parameters and under that caller's
// locks.
#pragma once

#include <cstdint>
#include <span>

#include "platform/text.h"
#include "preset/byte_cursor.h"
#include "preset/preset_format.h"
#include "preset/read_log.h"

namespace vxcomn {

enum LoadPresetFlags : uint32_t {
    LOAD_PRESET_ENGINE = 1,      // compare the engine identity and change it if it differs
    LOAD_PRESET_PARAMETERS = 2,  // walk the parameters
};

// What a load reads and changes of the object that it belongs to.
class PresetOwner {
  public:
    virtual ~PresetOwner() = default;

    // The hash of the last preset read; written in place, before the rest of the load is known to be good.
    virtual PresetHash &presetHash() = 0;

    virtual const WideString &engineShortName() const = 0;
    virtual const EngineConfig &engineConfig() const = 0;
    virtual bool engineLocked() const = 0;

    // Fire the property's handlers, which may run another load.
    virtual void setEngineShortName(const WideString &name) = 0;
    virtual void setEngineConfig(const EngineConfig &config) = 0;
};

// Who receives the parameters.
class PresetParameters {
  public:
    virtual ~PresetParameters() = default;

    // True to go on, false to stop the walk. The value is valid only during the call.
    virtual bool parameter(int32_t componentId, int32_t paramId, int32_t channel, std::span<const uint8_t> value) = 0;
};

// How a load ended.
enum class PresetLoad : uint8_t {
    complete,           // walked to the image's end
    stopped,            // by the receiver
    cutOff,             // the file ends inside a component id, before the image's end; that is no damage
    parametersSkipped,  // not asked for
    engineLocked,       // another engine, and the owner keeps its own: nothing delivered
    badVersion,
    damaged,  // what was delivered before stays delivered
};

// What was found first that a sound preset does not have.
enum class PresetFault : uint8_t {
    none,
    versionMissing,     // fewer than four bytes
    versionTooLow,      // found: the version
    componentIdCutOff,  // the image ends inside a block's first word
    blockHeaderCutOff,  // found: which word is missing, 1 paramIdMin or 2 paramIdMax
    sizeMissing,        // the image ends where an entry's size should be
    sizeTooLarge,       // found: the size
    valueCutOff,        // found: the size; not delivered, and no damage in itself
    runsPastEnd,        // a block crosses the image's end and goes on in what follows it in the file
};

struct PresetLoadResult {
    PresetLoad outcome = PresetLoad::complete;
    PresetFault fault = PresetFault::none;
    uint64_t faultOffset = 0;  // from the image's first byte
    uint32_t found = 0;        // what stood there
    uint32_t delivered = 0;    // parameters handed to the receiver, without the one that is made up at the end

    // The result that callers of a load go by.
    bool succeeded() const noexcept { return outcome != PresetLoad::badVersion && outcome != PresetLoad::damaged; }
};

// Loads the image of `size` bytes that begins where the stream stands. `parameters` and `log` may be null. A preset that says
// nothing about kBypassAllParam is reported as not bypassed, once, at the end.
PresetLoadResult loadPreset(ByteCursor &stream, uint32_t size, uint32_t flags, PresetOwner &owner, PresetParameters *parameters,
                            ReadLog *log);

}  // namespace vxcomn
