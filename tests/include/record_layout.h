/* SPDX-License-Identifier: MIT
 *
 * The layout of the records as one language sees it: a line for each size and each offset of record_fields.inc, in its order.
 */
#ifndef TESTS_RECORD_LAYOUT_H
#define TESTS_RECORD_LAYOUT_H

#include <stddef.h>

typedef struct LayoutLine {
    const char *record;
    const char *field; /* null for the record's size */
    size_t pinned;     /* what the list says */
    size_t found;      /* what the compiler makes of it */
} LayoutLine;

#define RECORD(type, size) {#type, NULL, size, sizeof(type)},
#define FIELD(type, name, offset) {#type, #name, offset, offsetof(type, name)},

#ifdef __cplusplus
extern "C" {
#endif
extern const LayoutLine recordLayoutInC[];
extern const size_t recordLayoutLinesInC;
#ifdef __cplusplus
}
#endif

#endif
