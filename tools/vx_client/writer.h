// SPDX-License-Identifier: MIT
//
// Who wrote something: the identity that stands beside it, and whether that client still lives.
#pragma once

#include <string>

#include "platform/text.h"
#include "tools/vx_client/endpoint_json.h"
#include "vxcomn/com_types.h"

namespace vx::client {

enum class WriterKind : uint8_t { unknown, preset, self, client, gone };

struct Writer {
    WriterKind kind = WriterKind::unknown;
    std::string id;  // "{...}"; empty for the first two
};

std::string guidText(const GUID &guid);

// Of a parameter. All zeros: what the library takes from a preset has no writer.
Writer writerOf(const GUID &source, const GUID &self);
// Of a selection, by the name of its setter's mutex; empty: it keeps no writer.
Writer setterOf(const std::string &setter);

std::string writerText(const Writer &writer);
Json writerJson(const Writer &writer);

}  // namespace vx::client
