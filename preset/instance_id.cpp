// SPDX-License-Identifier: MIT
#include "preset/instance_id.h"

#include "platform/guid.h"

using namespace vxcomn;

CInstanceIDBase::CInstanceIDBase() : InstanceMutex(*this) {
    if (!newGuid(InstanceGuid)) {
        log(VX_TEXT("Failed to create unique ID.\n"));
        return;
    }
    InstanceId = guidText(InstanceGuid);
    InstanceMutex.create(InstanceId);
}

CInstanceIDBase::~CInstanceIDBase() = default;
