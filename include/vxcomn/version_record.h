/* SPDX-License-Identifier: MIT
 *
 * The version that an ELF module bears: the fixed version record of Windows' resources, 52 bytes in the section `.vxversion`. A
 * module puts one VXCOMN_VERSION_RECORD into one of its sources; on Windows its version resource stands for it. Compiles as C11 and
 * C++17 by itself.
 */
#ifndef VXCOMN_VERSION_RECORD_H
#define VXCOMN_VERSION_RECORD_H

#include <stdint.h>

#define VXCOMN_VERSION_SECTION ".vxversion"
#define VXCOMN_VERSION_SIGNATURE 0xFEEF04BDu

typedef struct VXVersionRecord { /* 52 bytes, little-endian */
    uint32_t signature;          /* VXCOMN_VERSION_SIGNATURE */
    uint32_t structVersion;      /* 0x00010000 */
    uint32_t fileVersionHigh;    /* major in the upper half, minor in the lower */
    uint32_t fileVersionLow;     /* build in the upper half, revision in the lower */
    uint32_t productVersionHigh; /* as the file's */
    uint32_t productVersionLow;
    uint32_t fileFlagsMask; /* the rest is 0 but for the file type */
    uint32_t fileFlags;
    uint32_t fileOS;
    uint32_t fileType; /* 2: a library */
    uint32_t fileSubtype;
    uint32_t fileDateHigh;
    uint32_t fileDateLow;
} VXVersionRecord;

/* Defines the record of the module that this source is a part of. */
#define VXCOMN_VERSION_RECORD(major, minor, build, revision)                                                              \
    __attribute__((used, retain, section(VXCOMN_VERSION_SECTION))) static const VXVersionRecord vxModuleVersionRecord = { \
        VXCOMN_VERSION_SIGNATURE,                                                                                         \
        0x00010000u,                                                                                                      \
        (uint32_t)(major) << 16 | (uint32_t)(minor),                                                                      \
        (uint32_t)(build) << 16 | (uint32_t)(revision),                                                                   \
        (uint32_t)(major) << 16 | (uint32_t)(minor),                                                                      \
        (uint32_t)(build) << 16 | (uint32_t)(revision),                                                                   \
        0,                                                                                                                \
        0,                                                                                                                \
        0,                                                                                                                \
        2,                                                                                                                \
        0,                                                                                                                \
        0,                                                                                                                \
        0}

#endif
