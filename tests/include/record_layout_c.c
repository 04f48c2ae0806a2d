/* SPDX-License-Identifier: MIT
 *
 * What a C compiler makes of the records.
 */
#include "tests/include/record_layout.h"

#include "VXDSPAPI.h"
#include "vxcomn/version_record.h"

const LayoutLine recordLayoutInC[] = {
#include "tests/include/record_fields.inc"
};

const size_t recordLayoutLinesInC = sizeof recordLayoutInC / sizeof recordLayoutInC[0];
