// SPDX-License-Identifier: MIT
//
// Status numbers. They are Windows' own (winerror.h) on both platforms, because they cross the interface; the platform's twins
// translate at the seam, by table.
#pragma once

#include <cstdint>

namespace vxcomn {

using Status = uint32_t;

namespace status {
inline constexpr Status ok = 0;
inline constexpr Status fileNotFound = 2;
inline constexpr Status pathNotFound = 3;
inline constexpr Status accessDenied = 5;
inline constexpr Status invalidHandle = 6;
inline constexpr Status notEnoughMemory = 8;
inline constexpr Status invalidData = 13;
inline constexpr Status genFailure = 31;
inline constexpr Status sharingViolation = 32;
inline constexpr Status notSupported = 50;
inline constexpr Status fileExists = 80;
inline constexpr Status invalidParameter = 87;
inline constexpr Status diskFull = 112;
inline constexpr Status insufficientBuffer = 122;
inline constexpr Status invalidName = 123;
inline constexpr Status modNotFound = 126;
inline constexpr Status procNotFound = 127;
inline constexpr Status badExeFormat = 193;
inline constexpr Status moreData = 234;
inline constexpr Status noMoreItems = 259;
inline constexpr Status notOwner = 288;
inline constexpr Status badDb = 1009;
inline constexpr Status keyDeleted = 1018;
inline constexpr Status keyHasChildren = 1020;
inline constexpr Status unsupportedType = 1630;
inline constexpr Status resourceTypeNotFound = 1813;
}  // namespace status

}  // namespace vxcomn
