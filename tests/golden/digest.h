// SPDX-License-Identifier: MIT
//
// FNV-1a with 64 bits over the bytes of 32-bit words, lowest byte first: what a scene's output comes down to.
#pragma once

#include <cstdint>
#include <cstring>

namespace golden {

class Digest {
  public:
    void add(uint32_t word) {
        for (int byte = 0; byte < 4; ++byte) {
            value_ ^= word >> (8 * byte) & 0xFFU;
            value_ *= 0x100000001B3U;
        }
    }
    void add(float sample) {
        uint32_t bits = 0;
        std::memcpy(&bits, &sample, sizeof bits);
        add(bits);
    }
    uint64_t value() const { return value_; }

  private:
    uint64_t value_ = 0xCBF29CE484222325U;
};

}  // namespace golden
