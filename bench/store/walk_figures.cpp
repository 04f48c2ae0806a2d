// SPDX-License-Identifier: MIT
//
// The parameter walk over a key of 1,000 parameters: how often it asks the store, and how long it takes.
#include <cstdio>

#include "bench/store/figures.h"
#include "bench/support/timing.h"
#include "platform/posix/registry_store.h"
#include "preset/apo_preset_file.h"

namespace vxcomn::bench {
namespace {

struct Host : CAPOPresetFile {
    explicit Host(const WideString &key) {
        APOTypeRegKeyName.set(configurationKey(VX_TEXT("HDAUDIO\\FUNC_01&VEN_10EC&DEV_0256\\0"), VX_TEXT("EFX")));
        ParamRegKeyName.set(key);
    }
    uint64_t queriesOfWalk() {
        const uint64_t before = storeCounts().statements;
        UpdateParametersFromRegistry(true, false);
        return storeCounts().statements - before;
    }
};

void printQueries(const char *what, uint64_t queries, uint64_t aim) {
    std::printf("  %-44s %9llu queries%38s aim at most %5llu  %s\n", what, static_cast<unsigned long long>(queries), "",
                static_cast<unsigned long long>(aim), queries <= aim ? "reached" : "MISSED");
}

}  // namespace

void printWalkFigures() {
    const WideString key = benchParameterKey();
    const std::vector<uint8_t> value(12, 1);
    const auto write = [&](int32_t component, int32_t param) {
        require(WriteParameter(nullptr, key, component, param, -1, value, {}, false, nullptr), "a write failed");
    };
    require(inOneWrite([&] {
                for (int32_t component = 0; component < 20; ++component) {
                    for (int32_t param = 1; param <= 50; ++param) write(component, param);
                }
                return status::ok;
            }) == status::ok,
            "the parameters could not be written");
    Host host(key);
    const WideString nothing;
    require(SetRegString(host.APOTypeRegKeyName.get() + VX_TEXT("\\Clients"), host.InstanceId, &nothing) == status::ok,
            "the client could not be marked");
    host.queriesOfWalk();
    require(host.ParamChanges.size() >= 1000, "the first walk did not find all parameters");
    host.queriesOfWalk();
    printQueries("walk, nothing changed", host.queriesOfWalk(), 2);
    write(9, 25);
    const uint64_t queries = host.queriesOfWalk();
    require(host.ParamChanges.size() == 1, "the walk did not find the change");
    printQueries("walk, one of 1,000 parameters changed", queries, 8);

    const std::vector<Figure> figures = timeInTurns({
        {"unchanged",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) host.UpdateParametersFromRegistry(true, false);
         }},
        {"changed",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) {
                 write(9, 25);
                 host.UpdateParametersFromRegistry(true, false);
             }
         }},
    });
    const double unchanged = nanosecondsOf(figures, "unchanged"), changed = nanosecondsOf(figures, "changed");
    printRatio("walk, nothing changed", unchanged, 1, "itself");
    printRatio("write and walk, one of 1,000 changed", changed, changed / unchanged, "a walk with nothing changed");
    std::printf("\n");
}

}  // namespace vxcomn::bench
