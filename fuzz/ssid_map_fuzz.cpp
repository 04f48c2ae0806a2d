// SPDX-License-Identifier: MIT
//
// The subsystem-id map on any bytes. What is read must write to the bytes that were read.
#include <algorithm>
#include <cstdlib>

#include "preset/package_maps.h"

using namespace vxcomn;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    MemorySource source({data, size});
    ByteCursor stream(source);
    MapHeader header{};
    SsidMap map;
    if (!readSsidMap(stream, header, map)) return 0;
    const std::vector<uint8_t> written = writeSsidMap(header, map);
    if (written.size() != stream.position() || !std::equal(written.begin(), written.end(), data)) std::abort();
    for (const SsidRecord &record : map.records) {
        const std::string_view half = std::string_view(record.text).substr(0, record.text.size() / 2);
        if (!record.text.empty() && map.find(half) == -1 && record.packageIndex != UINT32_MAX && map.records.size() == 1)
            std::abort();
        if (map.find(record.text) != -1) std::abort();  // as long as the field
    }
    return 0;
}
