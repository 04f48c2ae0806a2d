// SPDX-License-Identifier: MIT
//
// store_bench: what the parameter store, its signal, its walks and the preset readers cost beside SQLite, a bare futex, dconf,
// libzip and minizip. The machine folder and the peers' files stand in one temporary folder.
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <random>

#include "bench/store/figures.h"
#include "bench/store/sqlite_peer.h"
#include "bench/support/timing.h"

namespace vxcomn::bench {

void printWriteAndReadFigures(const std::filesystem::path &folder) {
    SqlitePeer peer(folder / "peer.db");
    const WideString key = benchParameterKey();
    const GUID source = {1, 2, 3, {4}};
    const WideString id = VX_TEXT("{00000001-0002-0003-0400-000000000000}");
    std::vector<uint8_t> value(36, 7);
    const auto write = [&] {
        uint64_t stamp = 0;
        require(WriteParameter(nullptr, key, 3, 12, -1, value, {source, id}, false, &stamp), "a write failed");
        keep(stamp);
    };
    write();
    peer.writeSix(value);
    uint8_t buffer[64];
    const std::vector<Figure> figures = timeInTurns({
        {"write",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) write();
         }},
        {"commit",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) peer.writeSix(value);
         }},
        {"read",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 uint32_t size = sizeof buffer;
                 require(ReadParameterValue(key, 3, 12, buffer, size, nullptr, nullptr) == 0, "a read failed");
                 keep(buffer);
             }
         }},
        {"select",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) keep(peer.read(3, buffer, sizeof buffer));
         }},
    });
    const auto ns = [&figures](const char *name) { return nanosecondsOf(figures, name); };
    printRatio("write a parameter, nobody listening", ns("write"), ns("write") / ns("commit"), "SQLite's commit of six", 3, true);
    printRatio("read a parameter", ns("read"), ns("read") / ns("select"), "SQLite's prepared select", 3, true);
    std::printf("\n");
}

}  // namespace vxcomn::bench

int main() {
    namespace fs = std::filesystem;
    const fs::path folder = fs::temp_directory_path() / ("vxcomn-bench-" + std::to_string(std::random_device()()));
    fs::create_directories(folder / "machine");
    setenv("VXCOMN_ROOT", (folder / "machine").c_str(), 1);
    int result = 0;
    try {
        vxcomn::bench::printHeading("store_bench");
        // Ahead of everything that starts threads: the other process is a fork.
        vxcomn::bench::printWakeFigures(folder);
        vxcomn::bench::printWriteAndReadFigures(folder);
        vxcomn::bench::printWalkFigures();
        vxcomn::bench::printPresetFigures(folder);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "store_bench: %s\n", error.what());
        result = 1;
    }
    fs::remove_all(folder);
    return result;
}
