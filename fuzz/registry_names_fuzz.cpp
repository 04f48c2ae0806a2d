// SPDX-License-Identifier: MIT
//
// The names below a parameter key, as the walk reads them: component keys and values of any spelling. What is taken has to be what
// this library would have written.
#include <cstdlib>

#include "platform/guid.h"
#include "preset/store_names.h"
#include "preset/store_value_name.h"

using namespace vxcomn;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    const WideString name = toWide({reinterpret_cast<const char *>(data), size});
    if (const std::optional<int32_t> component = parseDecimal(name); component && decimalName(*component) != name) std::abort();
    const StoreValueName value = parseValueName(name);
    if (!value.paramId) return 0;
    const WideString number = decimalName(*value.paramId);
    if (!name.starts_with(number)) std::abort();
    if (!value.isPrivate) {
        if (name != parameterValueName(*value.paramId)) std::abort();
        return 0;
    }
    if (name.size() <= number.size() || name[number.size()] != VXWCHAR{','}) std::abort();
    // A GUID's text may be in either case, so the spelling may differ, and nothing else.
    if (value.client != GUID{} && !equalIgnoringCase(name, parameterValueName(*value.paramId, guidText(value.client))))
        std::abort();
    return 0;
}
