// SPDX-License-Identifier: MIT
#include "preset/engine_table.h"

namespace vxcomn {

namespace {

constexpr uint32_t kTableSize = 8;

constexpr EngineConfig kOrlo = {kTableSize, 0, 6, {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}}};
constexpr EngineConfig kNovara = {kTableSize, 0, 1, {{0, 0}}};

constexpr const EngineConfig *kRecords[] = {&kNovara, &kNovara, &kOrlo, &kOrlo};  // in the order of kEngineNames
static_assert(std::size(kRecords) == std::size(kEngineNames));

}  // namespace

std::string_view engineShortNameOf(std::string_view engineName) {
    return engineName.starts_with("KZNOVA") || engineName.starts_with("KZ.Novara") ? "KZNOVA" : "VXORLO";
}

const EngineConfig &engineDescription(std::string_view name) {
    for (size_t i = 0; i < std::size(kEngineNames); ++i) {
        if (kEngineNames[i] == name) return *kRecords[i];
    }
    return kOrlo;
}

}  // namespace vxcomn
