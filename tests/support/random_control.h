// SPDX-License-Identifier: MIT
//
// An application that works a host instance at random: every diagnostic command, every parameter of the host's own, components and
// gain, with good values and now and then bad ones. For tests that run it beside the block functions.
#pragma once

#include <array>
#include <cstdint>
#include <random>
#include <vector>

#include "VXDSPAPI.h"

namespace vxcomn::testing {

class RandomControl {
  public:
    RandomControl(VXHandle handle, uint32_t seed) : handle_(handle), random_(seed) {}
    // The rings of the instance point into this object until the next arm or stop.
    RandomControl(const RandomControl &) = delete;
    RandomControl &operator=(const RandomControl &) = delete;

    // Does one thing.
    void step();

    // Reloads of the second engine among a thousand steps; 0 for none.
    int reloads = 2;

  private:
    uint32_t below(uint32_t limit) { return static_cast<uint32_t>(random_()) % limit; }
    uint8_t onOrOff() { return static_cast<uint8_t>(below(2)); }
    void parameter(int32_t id, int32_t paramId, std::vector<uint8_t> data);
    void loadFilter(int32_t id, uint32_t channel);
    void component();
    void command(int32_t id, const std::vector<uint8_t> &input);
    void runCommand(int32_t id);
    void armCaptures();

    VXHandle handle_;
    std::mt19937 random_;
    std::array<std::array<uint32_t, 8>, 4> samples_{};
    std::array<std::array<VXAtomicByte, 8>, 4> ready_{};
};

}  // namespace vxcomn::testing
