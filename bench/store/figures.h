// SPDX-License-Identifier: MIT
//
// The parts of store_bench, each with its rows, and what they share.
#pragma once

#include <filesystem>

#include "bench/support/require.h"
#include "preset/parameter_store.h"
#include "preset/store_names.h"

namespace vxcomn::bench {

void printWriteAndReadFigures(const std::filesystem::path &folder);
void printWakeFigures(const std::filesystem::path &folder);
void printWalkFigures();
void printPresetFigures(const std::filesystem::path &folder);

// A parameter key as a host has it.
inline WideString benchParameterKey() {
    return parameterKey({configurationKey(VX_TEXT("HDAUDIO\\FUNC_01&VEN_10EC&DEV_0256\\0"), VX_TEXT("EFX")), VX_TEXT("Engine"),
                         VX_TEXT("Speakers"), kDefaultUserProfile, kDefaultContentType},
                        kEngineLevelVersion);
}

}  // namespace vxcomn::bench
