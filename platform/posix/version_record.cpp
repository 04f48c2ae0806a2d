// SPDX-License-Identifier: MIT
//
// The version of the library's own file.
#include "vxcomn/version_record.h"

static_assert(sizeof(VXVersionRecord) == 52);

VXCOMN_VERSION_RECORD(2, 1, 0, 0);
