// SPDX-License-Identifier: MIT
//
// The second file of the hybrid module alone beside the program.
#include <doctest/doctest.h>

#include "tests/hybrid/hybrid_host.h"
#include "tests/support/host_log.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE("without the first file the second is loaded") {
    const HostLog log;
    HostInstance host(hostType(4));
    host.setFormat(formatOf(0x3));
    const size_t before = log.texts().size();
    CHECK_EQ(setHardwareMode(host, 1), 4);
    CHECK_EQ(host.context().isstLoaded, 1);
    REQUIRE(host.context().isstModule != nullptr);
    CHECK_EQ(std::string(host.context().isstModule->engineFileName), "VXORHF64U.dll");
    CHECK_EQ(log.texts(before + 2), std::vector<std::string>{
                                        "{ LoadISSTModule()",
                                        "Loading Tarnlight.Orlo.DSP.HiFi2.dll module.",
                                        "Failed to load, loading VXORHF64U.dll module instead.",
                                        "Initializing library...",
                                        "Done.",
                                        "} LoadISSTModule()",
                                        "} VXDSPAPI_SetParameter()",
                                    });
}
