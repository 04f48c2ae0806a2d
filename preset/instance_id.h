// SPDX-License-Identifier: MIT
//
// CInstanceIDBase: an object with an identity that other processes can see alive. Control threads.
#pragma once

#include "diag/debug_trace.h"
#include "platform/text.h"
#include "preset/global_mutex.h"
#include "vxcomn/com_types.h"

struct CInstanceIDBase : CTraceFuncCallTargetAndTypeID {
    // Draws the identity and holds its mutex for the object's life.
    CInstanceIDBase();
    ~CInstanceIDBase() override;

    GUID InstanceGuid = {};
    vxcomn::WideString InstanceId;  // the GUID as {...} text; empty if there is none
    vxcomn::GlobalMutex InstanceMutex;
};
