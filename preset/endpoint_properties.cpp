// SPDX-License-Identifier: MIT
#include "preset/endpoint_properties.h"

#include "VXDSPAPI.h"
#include "platform/variant.h"
#include "preset/trace_read_log.h"

namespace vxcomn {

PropertyAnswer StorePropertyReader::read(const PROPERTYKEY &key) {
    PropertyAnswer answer;
    OwnedPropVariant value;
    answer.result = store_ != nullptr ? store_->GetValue(key, value.put()) : E_POINTER;
    answer.type = value->vt;
    if (answer.type == kPropertyUi4) answer.number = value->ulVal;
    if (answer.type == kPropertyText && value->pwszVal != nullptr) answer.text = value->pwszVal;
    return answer;
}

}  // namespace vxcomn

using namespace vxcomn;

const VXWCHAR *VXDSPAPI_DevicePropsToIOConfig(CTraceFuncCallTarget *trace, IPropertyStore *properties) {
    try {
        StorePropertyReader reader(properties);
        TraceReadLog log(trace);
        return devicePropsToIOConfig(reader, &log);
    } catch (...) {
        return nullptr;
    }
}

const VXWCHAR *VXDSPAPI_DevicePropsToEndpointIndex(CTraceFuncCallTarget *trace, IPropertyStore *properties, uint32_t *index) {
    uint32_t found = UINT32_MAX;
    const VXWCHAR *name = VX_TEXT("KSNODETYPE_UNKNOWN");
    try {
        StorePropertyReader reader(properties);
        TraceReadLog log(trace);
        name = devicePropsToEndpointIndex(reader, found, &log);
    } catch (...) {
        found = UINT32_MAX;
    }
    if (index != nullptr) *index = found;
    return name;
}
