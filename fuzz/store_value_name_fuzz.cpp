// SPDX-License-Identifier: MIT
//
// The names that stand below a parameter key, on any text: what counts as a number or a client is exactly what the library writes.
#include <cstdlib>

#include "platform/guid.h"
#include "preset/store_names.h"
#include "preset/store_value_name.h"

using namespace vxcomn;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    const WideString name = toWide({reinterpret_cast<const char *>(data), size});
    const auto number = parseDecimal(name);
    if (number && decimalName(*number) != name) std::abort();
    const StoreValueName parsed = parseValueName(name);
    if (parsed.isPrivate != (name.find(VX_TEXT(',')) != WideString::npos)) std::abort();
    if (parsed.client && !parsed.isPrivate) std::abort();
    if (!parsed.isPrivate && parsed.paramId != number) std::abort();
    if (parsed.paramId && parsed.client &&
        !equalIgnoringCase(parameterValueName(*parsed.paramId, guidText(*parsed.client)), name)) {
        std::abort();
    }
    return 0;
}
