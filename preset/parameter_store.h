// SPDX-License-Identifier: MIT
//
// The parameter store: typed values below HKLM, each write stamped so that a watcher tells what is new. A stamp is a value of the
// performance counter, compared for equality only; two writes never share one. Keys are made for everybody to read and write
// (security.h). Failures are logged by `trace` (may be null) and come back as results; nothing is undone. Control threads, any
// number, in any number of processes: the caller holds the slot's GlobalMutex where an operation has to be whole.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "diag/debug_trace.h"
#include "platform/status.h"
#include "platform/text.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

// E_INVALIDARG, as the helpers answer to an empty key path.
inline constexpr Status kInvalidArgument = 0x80070057;

// What a parameter's value may hold at most.
inline constexpr size_t kMaxParameterBytes = 65536;

// A stamp that no other call, in this process or another, has got.
uint64_t freshStamp();

// Writes REG_SZ, or deletes the value if `text` is null. Either sets WriteTime of the key to a fresh stamp if it succeeds. The
// registry's status, kInvalidArgument for an empty path.
Status SetRegString(WideView keyPath, WideView valueName, const WideString *text);
// The same with REG_BINARY; null `bytes` deletes.
Status SetRegBinary(WideView keyPath, WideView valueName, const uint8_t *bytes, size_t size);
// Reads REG_SZ whole; 1630 for another type, 234 for more than 65,536 bytes.
Status GetRegString(WideView keyPath, WideView valueName, WideString &text);
// Reads REG_BINARY into `buffer`; `size` is its size before and the value's behind. 234 if it is too small,
// 1630 for another type, and nothing is written then.
Status GetRegBinary(WideView keyPath, WideView valueName, uint8_t *buffer, uint32_t &size);

// Deletes a key with all below it, or with `keepTop` all below it. Paths beyond 520 characters are cut there.
bool DeleteRegKeyTree(WideView keyPath, bool keepTop);

// Who writes a parameter. Without an id nothing is said of the source.
struct ParameterSource {
    GUID guid = {};
    WideView id;  // the instance id, empty: none
};

// Writes one parameter below a parameter key in the order that lets a watcher trust WriteTime: data, source, time, the component's
// stamp, the key's. The channel is dropped. `stamp` (may be null) receives the stamp. False, with the
// thread's last error (platform/last_error.h), if the key, the component or the last write failed.
bool WriteParameter(const CTraceFuncCallTarget *trace, WideView parameterKey, int32_t componentId, int32_t paramId, int32_t channel,
                    std::span<const uint8_t> data, const ParameterSource &source, bool isTransient, uint64_t *stamp);

// Reads the shared value. `size` is the buffer's before and the value's behind. `source` (16 bytes) and `stamp` (8), if given, get
// the leading bytes of the value itself, and the last read decides: kept as it is, so pass null. The registry's status.
Status ReadParameterValue(WideView parameterKey, int32_t componentId, int32_t paramId, uint8_t *buffer, uint32_t &size,
                          GUID *source, uint64_t *stamp);

// Deletes a value from Data, Time and Source of a component of a parameter key.
void deleteParameterValue(WideView parameterKey, WideView component, WideView valueName);

}  // namespace vxcomn
