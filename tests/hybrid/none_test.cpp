// SPDX-License-Identifier: MIT
//
// No file of the hybrid module beside the program.
#include <doctest/doctest.h>

#include "tests/hybrid/hybrid_host.h"
#include "tests/support/data_command.h"
#include "tests/support/host_log.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE("without either file the main engine goes on alone, the mode keeps its value and the log tells why") {
    const HostLog log;
    HostInstance host(hostType(3));
    host.setFormat(formatOf(0x3));
    const size_t before = log.texts().size();
    CHECK_EQ(setHardwareMode(host, 3), 4);
    const LibraryContext &context = host.context();
    CHECK_EQ(context.hardwareMode, 3);
    CHECK_EQ(context.isstLoaded, 0);
    CHECK_EQ(context.isstModule, nullptr);
    CHECK_EQ(context.isstHandle, nullptr);
    CHECK_EQ(context.processStop, 0);
    CHECK_EQ(log.texts(before), std::vector<std::string>{
                                    "{ VXDSPAPI_SetParameter()",
                                    "ComponentId = 0, ParamId = -25, Channel = 0, Data[0] = 0x03, DataSize = 4",
                                    "{ LoadISSTModule()",
                                    "Loading Tarnlight.Orlo.DSP.HiFi2.dll module.",
                                    "Failed to load, loading VXORHF64U.dll module instead.",
                                    "Failed to load iSST module!",
                                    "} LoadISSTModule()",
                                    "} VXDSPAPI_SetParameter()",
                                });
    host.engine().calls.clear();
    CHECK_EQ(setByte(host, 2, -6, 1), 1);
    CHECK_EQ(host.engine().calls,
             Calls{"SetParameter(2, -6, 0, [01])", "SetParameter(-1, -29, 0, [00])", "SetParameter(-1, -30, 0, [00])"});
    CHECK_EQ(command(host, VXDSP_DATA_ISST_LOADED).bytes[0], 0);
    CHECK_EQ(command(host, VXDSP_DATA_ISST_STATE).bytes[0], 0);
    Block block;
    host.process(block, formatOf(0x3), formatOf(0x3));
    CHECK_EQ(context.totalFrames, 480);
}
