// SPDX-License-Identifier: MIT
#include "tests/platform/some_endpoint.h"

namespace test {

SomeEndpoint::SomeEndpoint() = default;
SomeEndpoint::~SomeEndpoint() = default;

}  // namespace test
