// SPDX-License-Identifier: MIT
//
// Sees to it that there is an active endpoint for rendering, where a test can: on Linux it is made in the test's own registry and
// taken away again. On Windows endpoints are the machine's.
#pragma once

namespace test {

struct SomeEndpoint {
    SomeEndpoint();
    ~SomeEndpoint();
    SomeEndpoint(const SomeEndpoint &) = delete;
    SomeEndpoint &operator=(const SomeEndpoint &) = delete;
};

}  // namespace test
