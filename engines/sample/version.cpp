// SPDX-License-Identifier: MIT
//
// The version of the module on Linux, read from the file by whoever asks. On Windows sample_engine.rc tells the same.
#include <vxcomn/version_record.h>

VXCOMN_VERSION_RECORD(2, 1, 0, 0);
