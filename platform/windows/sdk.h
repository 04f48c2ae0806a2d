// SPDX-License-Identifier: MIT
//
// The SDK headers, for the files of platform/windows/ only: one way in, spelled in lower case (the cross compiler's disk minds
// case), with the macros that take over ordinary names undone.
#pragma once

// clang-format off: windows.h comes first, the others lean on it
#include <windows.h>
#include <winver.h>
// clang-format on

#undef far
#undef near
#undef interface
#undef small
