/* SPDX-License-Identifier: MIT
 *
 * Who frees what crosses the interface in COM-shaped records. On Windows these are the system's functions. Elsewhere they stand
 * here, under the same names, on the C library's allocator: a customer and the library may free each other's memory. Compiles as
 * C11 and C++17. Any thread.
 */
#ifndef VXCOMN_COM_MEMORY_H
#define VXCOMN_COM_MEMORY_H

#include "vxcomn/com_types.h"

#if !VXCOMN_SYSTEM_HAS_COM

#include <stdlib.h>
#include <string.h>

/* NOLINTBEGIN(modernize-use-nullptr): C has none. */

static inline void *CoTaskMemAlloc(size_t size) {
    return malloc(size != 0 ? size : 1);
}
static inline void CoTaskMemFree(void *memory) {
    free(memory);
}

/* A copy of the text with its length in front; null for null, and when memory runs out. */
static inline BSTR SysAllocString(const VXWCHAR *text) {
    size_t units = 0;
    if (text == NULL) return NULL;
    while (text[units] != 0) ++units;
    const uint32_t bytes = (uint32_t)(units * sizeof(VXWCHAR));
    char *memory = (char *)malloc(sizeof(uint64_t) + bytes + sizeof(VXWCHAR));
    if (memory == NULL) return NULL;
    memcpy(memory + sizeof(uint32_t), &bytes, sizeof bytes);
    memcpy(memory + sizeof(uint64_t), text, bytes + sizeof(VXWCHAR));
    return (BSTR)(void *)(memory + sizeof(uint64_t));
}
static inline void SysFreeString(BSTR text) {
    if (text != NULL) free((char *)(void *)text - sizeof(uint64_t));
}
/* In units, without the end. */
static inline UINT SysStringLen(BSTR text) {
    uint32_t bytes = 0;
    if (text != NULL) memcpy(&bytes, (const char *)(const void *)text - sizeof bytes, sizeof bytes);
    return bytes / (UINT)sizeof(VXWCHAR);
}

static inline void VariantInit(VARIANT *value) {
    memset(value, 0, sizeof *value);
}
static inline HRESULT VariantClear(VARIANT *value) {
    if (value->vt == VT_BSTR) SysFreeString(value->bstrVal);
    VariantInit(value);
    return S_OK;
}

static inline void PropVariantInit(PROPVARIANT *value) {
    memset(value, 0, sizeof *value);
}
static inline HRESULT PropVariantClear(PROPVARIANT *value) {
    if (value == NULL) return S_OK;
    if (value->vt == VT_LPWSTR) CoTaskMemFree(value->pwszVal);
    if (value->vt == VT_LPSTR) CoTaskMemFree(value->pszVal);
    if (value->vt == VT_CLSID) CoTaskMemFree(value->puuid);
    if (value->vt == VT_BLOB) CoTaskMemFree(value->blob.pBlobData);
    if (value->vt == VT_BSTR) SysFreeString(value->bstrVal);
    PropVariantInit(value);
    return S_OK;
}

/* NOLINTEND(modernize-use-nullptr) */

#endif
#endif
