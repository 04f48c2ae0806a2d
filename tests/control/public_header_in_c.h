/* SPDX-License-Identifier: MIT
 *
 * What the C half of the public header's test offers to the other half.
 */
#ifndef VXCOMN_TESTS_CONTROL_PUBLIC_HEADER_IN_C_H
#define VXCOMN_TESTS_CONTROL_PUBLIC_HEADER_IN_C_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Calls all that take a handle; the sum of their results, counting successes. */
int32_t controlCallsInC(void *handle);
/* Two writes by the functions with C++ names; how many succeed. */
int32_t setParameterInC(void *handle, int32_t componentId, int32_t paramId, uint8_t value, uint64_t *time);

#ifdef __cplusplus
}
#endif

#endif
