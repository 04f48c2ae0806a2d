// SPDX-License-Identifier: MIT
//
// The figures of measuring: the analyser's readout, sweep, tracking notch and pink noise, and both block functions with their
// measurements on. Each against packaged peers, the plain forms of the tests, or the bare chain of operations that its results
// hang on. fir_bench has the filters.
#include "bench/measure/figures.h"
#include "bench/support/timing.h"

using namespace vxcomn;
using namespace vxcomn::bench;

int main() {
    printHeading("Measuring figures");
    const InstructionSet best = bestInstructionSet();
    benchReadout(best);
    benchSweep(best);
    benchNotch(best);
    benchPink(best);
    benchProcess(best);
    benchRecord(best);
    return 0;
}
