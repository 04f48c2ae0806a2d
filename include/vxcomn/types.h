/* SPDX-License-Identifier: MIT
 *
 * The platform types that cross the library's interface, and the only header outside platform/ that asks which platform it is
 * compiled for. Compiles as C11 and C++17 by itself.
 *
 * Wide text is made of 16-bit units on every platform: wchar_t on Windows, char16_t elsewhere. Write literals as VX_TEXT("...").
 */
#ifndef VXCOMN_TYPES_H
#define VXCOMN_TYPES_H

#include <stddef.h>
#include <stdint.h>

#if !defined(__cplusplus) && !defined(_WIN32)
#include <uchar.h>
#endif

#ifdef _WIN32
typedef wchar_t VXWCHAR;
#define VX_TEXT_JOIN(text) L##text
#define VXCOMN_EXPORT __declspec(dllexport)
#define VXCOMN_IMPORT __declspec(dllimport)
#define VXCOMN_SYSTEM_HAS_COM 1 /* the system's headers declare what com_types.h declares elsewhere */
#else
typedef char16_t VXWCHAR;
#define VX_TEXT_JOIN(text) u##text
#define VXCOMN_EXPORT __attribute__((visibility("default")))
#define VXCOMN_IMPORT
#define VXCOMN_SYSTEM_HAS_COM 0
#endif

/* A literal of 16-bit text. */
#define VX_TEXT(text) VX_TEXT_JOIN(text)

/* The library defines VXCOMN_BUILD while it is built; its customers import. */
#ifdef VXCOMN_BUILD
#define VXCOMN_API VXCOMN_EXPORT
#else
#define VXCOMN_API VXCOMN_IMPORT
#endif

/* What an engine module puts in front of each of its exports. */
#define VXCOMN_ENGINE_API VXCOMN_EXPORT

#ifdef __cplusplus
#define VXCOMN_EXTERN_C_BEGIN extern "C" {
#define VXCOMN_EXTERN_C_END }
#else
#define VXCOMN_EXTERN_C_BEGIN
#define VXCOMN_EXTERN_C_END
#endif

/*
 * A byte that one thread writes while another reads it. One byte wide and one byte aligned in every language, so that it can stand
 * in a record that crosses the interface.
 */
#ifdef __cplusplus
#include <atomic>
typedef std::atomic<uint8_t> VXAtomicByte;
static_assert(sizeof(VXAtomicByte) == 1 && alignof(VXAtomicByte) == 1, "an atomic byte is one byte");
#elif !defined(__STDC_NO_ATOMICS__)
typedef _Atomic(uint8_t) VXAtomicByte;
#else
typedef volatile uint8_t VXAtomicByte;
#endif

#endif
