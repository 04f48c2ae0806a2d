// SPDX-License-Identifier: MIT
//
// Random sequences of control calls: any order, null and wild arguments, handles that are stale, freed, somebody else's or no
// handles at all. Nothing crashes, nothing hangs, every error code comes up. VXCOMN_RANDOM_CALLS tells how many calls,
// VXCOMN_RANDOM_SEED repeats a run.
#include <doctest/doctest.h>

#include <chrono>
#include <cstdlib>
#include <iostream>
#include <random>
#include <set>

#include "tests/random_calls/caller.h"

using namespace vxcomn::testing;

namespace {

uint64_t numberOf(const char *variable, uint64_t otherwise) {
    const char *const text = std::getenv(variable);
    return text != nullptr ? std::strtoull(text, nullptr, 10) : otherwise;
}

}  // namespace

TEST_CASE("random control calls neither crash nor hang, and every error code comes up") {
    const uint64_t calls = numberOf("VXCOMN_RANDOM_CALLS", 20000);
    const auto seed = static_cast<uint32_t>(numberOf("VXCOMN_RANDOM_SEED", std::random_device()()));
    std::cout << "seed " << seed << ", " << calls << " calls" << std::endl;
    const SampleMachine machine;
    const auto began = std::chrono::steady_clock::now();
    std::set<int32_t> codes;
    {
        RandomCaller caller(machine, seed);
        for (uint64_t call = 0; call < calls; ++call) caller.step();
        codes = caller.codes();
        CHECK(caller.complaints() == std::vector<std::string>());
    }
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - began;
    std::cout << calls << " calls in " << took.count() << " s; codes seen:";
    for (const int32_t code : codes) std::cout << " " << code;
    std::cout << std::endl;
    // A few calls need not meet everything.
    std::set<int32_t> all = {-256, -16, -15, -11, -10, -9, -4, -3, -2, 0};
    if (!FlickeringEndpoint::possible()) all.erase(VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND);
    if (calls >= 200000) CHECK(codes == all);
}
