// SPDX-License-Identifier: MIT
//
// What it takes to open an endpoint and choose a slot whose preset is one of a thousand in its package, and where the time goes.
// The parameters in the store are consistent; that they are is part of what is found out.
#include <cstdio>
#include <fstream>
#include <functional>

#include "VXAPOCOMAPI.h"
#include "bench/control/figures.h"
#include "bench/support/timing.h"
#include "control/endpoint_context.h"
#include "platform/clock.h"
#include "preset/package_discovery.h"
#include "preset/package_maps.h"
#include "preset/package_writer.h"
#include "preset/preset_names.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::bench {

namespace {

constexpr int kRounds = 101;  // the first, which fill the store and the caches, don't move a median
constexpr int kEntries = 1000;
constexpr double kAim = 5e6;  // ns

// A package for the sample machine's device, in which the wanted entry stands last.
void installPackage(const WideString &deviceId) {
    std::string subsystem = "SUBSYS_1234ABCD";
    subsystem.resize(32);
    const SsidMap ssids = {36, {{7, subsystem}}};
    std::vector<PackageEntry> entries = {{"SSIDMAP.bin", writeSsidMap({}, ssids)}, {"CHIDMAP.bin", writeChidMap({})}};
    const std::vector<uint8_t> preset = writePreset(testing::orloPreset());
    for (int i = 1; i < kEntries; ++i)
        entries.push_back({std::to_string(100 + i) + "/7/EFX/AnyOutput/AnyContent/Preset.bin", preset});
    entries.push_back({"7/7/EFX/AnyOutput/AnyContent/Preset.bin", preset});
    const std::vector<uint8_t> archive = writePackage(entries).value();
    const auto path = testing::hostPath(packageFolder(systemFacts()) + VX_TEXT("\\") + presetPackageName(deviceId));
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char *>(archive.data()), static_cast<std::streamsize>(archive.size()));
}

class Phase {
  public:
    explicit Phase(const char *name) : name_(name) {}
    void run(const std::function<void()> &work) {
        const int64_t began = performanceNanoseconds();
        work();
        times_.push_back(static_cast<double>(performanceNanoseconds() - began));
    }
    double median() const { return medianOf(times_); }
    void print() const { std::printf("  %-60s %8.3f ms\n", name_, median() / 1e6); }

  private:
    const char *name_;
    std::vector<double> times_;
};

struct NoParameters final : PresetParameters {
    bool parameter(int32_t, int32_t, int32_t, std::span<const uint8_t>) override { return true; }
};

}  // namespace

void printOpeningFigures() {
    const testing::SampleMachine machine;
    installPackage(VX_TEXT("VXTEST\\CONTROL"));
    Phase initialize("begin the use of the library"), open("open the endpoint"), choose("choose its slot"),
        load("  of which: find the entry and load the preset, once"), check("  of which: see that the store fits the preset, once"),
        close("close the endpoint"), end("end the use");
    std::vector<double> wholes;
    for (int round = 0; round < kRounds; ++round) {
        VXAPOHandle api = nullptr, endpoint = nullptr;
        initialize.run([&] { api = VXAPOCOMAPI_InitializeAPI(); });
        const int64_t began = performanceNanoseconds();
        open.run([&] { endpoint = VXAPOCOMAPI_GetEndpoint(api, machine.endpointId().c_str(), 0); });
        choose.run([&] { require(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1, "the slot isn't chosen"); });
        wholes.push_back(static_cast<double>(performanceNanoseconds() - began));
        auto &context = *static_cast<VXAPOCOMAPI_EndpointContext *>(endpoint);
        require(!context.PresetZipPath.get().empty() && !context.ParamRegKeyName.get().empty(), "the preset isn't found");
        NoParameters nothing;
        load.run([&] { require(context.LoadPreset(LOAD_PRESET_PARAMETERS, &nothing), "the preset isn't loaded"); });
        check.run([&] { require(!context.EnsureParametersAreInRegistry(), "the store doesn't fit"); });
        close.run([&] { VXAPOCOMAPI_FreeEndpoint(endpoint); });
        end.run([&] { VXAPOCOMAPI_FreeAPI(api); });
    }
    std::printf("open an endpoint and choose a slot, with a package of %d entries, parameters consistent\n", kEntries);
    for (const Phase *phase : {&initialize, &open, &choose, &load, &check, &close, &end}) phase->print();
    const double whole = medianOf(wholes);
    std::printf("  %-60s %8.3f ms  aim at most %.1f ms  %s\n\n", "open and choose", whole / 1e6, kAim / 1e6,
                whole <= kAim ? "reached" : "MISSED");
}

}  // namespace vxcomn::bench
