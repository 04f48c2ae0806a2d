// SPDX-License-Identifier: MIT
//
// The property store of an endpoint over the values of its key's Properties. REG_SZ reads as VT_LPWSTR, REG_DWORD as VT_UI4,
// REG_BINARY as VT_BLOB, anything else and what is not there as VT_EMPTY. Control threads.
#pragma once

#include "platform/posix/endpoint_keys.h"

namespace vxcomn {

// `access` is STGM_READ, STGM_WRITE or STGM_READWRITE.
HRESULT openPropertyStore(const Endpoint &endpoint, DWORD access, IPropertyStore **store) noexcept;

}  // namespace vxcomn
