// SPDX-License-Identifier: MIT
//
// A client of the control functions that does anything at all, from a seed.
#pragma once

#include <array>
#include <cstdint>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "VXAPOCOMAPI.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::testing {

class RandomCaller {
  public:
    RandomCaller(const SampleMachine &machine, uint32_t seed);
    ~RandomCaller();
    RandomCaller(const RandomCaller &) = delete;
    RandomCaller &operator=(const RandomCaller &) = delete;

    // Makes one call.
    void step();

    // The codes that calls have left behind.
    const std::set<int32_t> &codes() const noexcept { return codes_; }
    // Results that no call may give.
    const std::vector<std::string> &complaints() const noexcept { return complaints_; }

  private:
    using Action = void (RandomCaller::*)();
    struct Weighted {
        int weight;
        Action action;
    };
    static const std::vector<Weighted> &actions();

    uint32_t below(uint32_t limit) { return static_cast<uint32_t>(random_()) % limit; }
    bool oneIn(uint32_t n) { return below(n) == 0; }
    int32_t flag() { return oneIn(3) ? static_cast<int32_t>(random_()) : static_cast<int32_t>(below(2)); }
    int32_t someNumber();
    float someValue();
    const char *someName();
    VXAPOHandle someHandle();
    VXAPOHandle someApi();
    VXAPOHandle someEndpoint();
    template <class T>
    T *orNull(T &object) {
        return oneIn(8) ? nullptr : &object;
    }
    void expect(bool right, const char *what);
    void forget(VXAPOHandle handle);

    // Life.
    void initializeApi();
    void freeApi();
    void openEndpoint();
    void freeEndpoint();
    void initializeByIndex();
    void initializeByGuid();
    void freeBoth();
    void setSlot();
    void listEndpoints();
    void getProperty();
    // Errors.
    void getErrors();
    void setError();
    // Selections.
    void select();
    void tellSelection();
    void defaultConfig();
    // Parameters.
    void setUser();
    void getUser();
    void setRaw();
    void getRaw();
    void reset();
    // Audio and changes.
    void activate();
    void receive();
    void cancel();

    const SampleMachine &machine_;
    std::mt19937 random_;
    std::vector<VXAPOHandle> apis_, endpoints_, freed_;
    std::vector<std::string> names_;
    std::vector<uint8_t> data_;
    std::set<int32_t> codes_;
    bool indexFailureSeen_ = false;
    std::vector<std::string> complaints_;
    std::array<uint64_t, 64> foreign_{};  // no handle, although it looks like the inside of one
};

}  // namespace vxcomn::testing
