// SPDX-License-Identifier: MIT
#include "platform/unique.h"

#include <doctest/doctest.h>

#include <vector>

namespace {

std::vector<int> closed;

struct NumberTraits {
    using Raw = int;
    static constexpr Raw none = -1;
    static void close(Raw number) noexcept { closed.push_back(number); }
};
using Number = vxcomn::Unique<NumberTraits>;
using Closed = std::vector<int>;

}  // namespace

TEST_CASE("an owner closes what it holds exactly once, wherever it was moved to") {
    closed.clear();
    {
        Number first(1);
        Number second(std::move(first));
        CHECK_FALSE(first);
        CHECK(second.get() == 1);
        Number third(3);
        third = std::move(second);
        CHECK(closed == Closed{3});
        Number &self = third;
        third = std::move(self);
        CHECK(third.get() == 1);
        CHECK(closed == Closed{3});
    }
    CHECK(closed == Closed{3, 1});
}

TEST_CASE("resetting closes the old one, releasing does not, and an out-parameter begins empty") {
    closed.clear();
    Number number(5);
    number.reset(6);
    CHECK(closed == Closed{5});
    CHECK(number.release() == 6);
    CHECK_FALSE(number);
    number.reset();
    CHECK(closed == Closed{5});
    number.reset(7);
    int *place = number.put();
    CHECK(*place == -1);
    CHECK(closed == Closed{5, 7});
    *place = 8;
    CHECK(number.get() == 8);
    number.reset();
    CHECK(closed == Closed{5, 7, 8});
}
