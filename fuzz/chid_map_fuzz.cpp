// SPDX-License-Identifier: MIT
//
// The hardware-id map on any bytes. What is read must write to the bytes that were read.
#include <algorithm>
#include <cstdlib>

#include "preset/package_maps.h"

using namespace vxcomn;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    MemorySource source({data, size});
    ByteCursor stream(source);
    ChidMap map;
    if (!readChidMap(stream, map)) return 0;
    const std::vector<uint8_t> written = writeChidMap(map);
    if (written.size() != stream.position() || !std::equal(written.begin(), written.end(), data)) std::abort();
    return 0;
}
