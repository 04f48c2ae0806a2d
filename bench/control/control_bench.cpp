// SPDX-License-Identifier: MIT
//
// control_bench: what a control application waits for. The machine folder is a temporary one.
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <random>

#include "bench/control/figures.h"
#include "bench/support/timing.h"

int main() {
    namespace fs = std::filesystem;
    const fs::path folder = fs::temp_directory_path() / ("vxcomn-bench-" + std::to_string(std::random_device()()));
    fs::create_directories(folder);
    setenv("VXCOMN_ROOT", folder.c_str(), 1);
    int result = 0;
    try {
        vxcomn::bench::printHeading("control_bench");
        vxcomn::bench::printOpeningFigures();
        vxcomn::bench::printEnumerationFigures();
        vxcomn::bench::printSliderFigures();
    } catch (const std::exception &error) {
        std::fprintf(stderr, "control_bench: %s\n", error.what());
        result = 1;
    }
    fs::remove_all(folder);
    return result;
}
