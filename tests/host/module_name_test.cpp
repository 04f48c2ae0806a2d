// SPDX-License-Identifier: MIT
#include "host/module_name.h"

#include <doctest/doctest.h>

#include "preset/engine_table.h"

using namespace vxcomn;

TEST_CASE("module names by engine, platform and host type") {
    CHECK_EQ(composeModuleName("X", nullptr, 0), "X.dll");
    CHECK_EQ(composeModuleName("X", nullptr, 3), "X.dll");
    CHECK_EQ(composeModuleName("X", "HiFi2", 3), "X.dll");
    CHECK_EQ(composeModuleName("X", "Float", 0), "X.DSP.dll");
    CHECK_EQ(composeModuleName("X", "HiFi2", 1), "X.DSP.HiFi2.dll");
    CHECK_EQ(composeModuleName("X", "iSST", 2), "X.DSP.HiFi2.dll");
    CHECK_EQ(composeModuleName("X", "AIC326x", 4), "X.DSP.AIC326x.dll");
    CHECK_EQ(composeModuleName("X", "Other", 0), "X.DSP.dll");
    CHECK_EQ(composeModuleName("X", "hifi2", 0), "X.DSP.dll");
    CHECK_EQ(composeModuleName("X", "", 0), "X.DSP.dll");
    CHECK_EQ(composeModuleName(nullptr, nullptr, 0), ".dll");
}

TEST_CASE("an engine's short name goes by how its name begins") {
    CHECK_EQ(engineShortNameOf("KZ.Novara.Extra"), "KZNOVA");
    CHECK_EQ(engineShortNameOf("KZNOVA"), "KZNOVA");
    CHECK_EQ(engineShortNameOf("MyKZNOVA"), "VXORLO");
    CHECK_EQ(engineShortNameOf("kznova"), "VXORLO");
    CHECK_EQ(engineShortNameOf(""), "VXORLO");
}

TEST_CASE("the built-in engine table stands in byte order, and its records say 8 bytes although they hold more") {
    for (size_t i = 1; i < std::size(kEngineNames); ++i) CHECK(kEngineNames[i - 1] < kEngineNames[i]);
    for (const char *name : {"VXORLO", "Tarnlight.Orlo", "unknown"}) {
        const EngineConfig &record = engineDescription(name);
        CHECK_EQ(record.Size, 8);
        CHECK_EQ(record.Reserved, 0);
        REQUIRE_EQ(record.ComponentCount, 6);
        const int expected[6][2] = {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}};
        for (int i = 0; i < 6; ++i) {
            CHECK_EQ(record.Components[i].ComponentId, expected[i][0]);
            CHECK_EQ(record.Components[i].Position, expected[i][1]);
        }
        CHECK_EQ(record.Components[6].ComponentId, 0);
    }
    for (const char *name : {"KZNOVA", "KZ.Novara"}) {
        const EngineConfig &record = engineDescription(name);
        CHECK_EQ(record.Size, 8);
        CHECK_EQ(record.ComponentCount, 1);
        CHECK_EQ(record.Components[0].ComponentId, 0);
        CHECK_EQ(record.Components[0].Position, 0);
    }
}
