// SPDX-License-Identifier: MIT
#include "tests/platform/some_endpoint.h"

#include "tests/platform/posix/endpoint_keys.h"

namespace test {

SomeEndpoint::SomeEndpoint() {
    EndpointKeys::make("Render", "{3ad9aa5c-9c3c-4a34-9c40-5f5f0f4f8a11}", DEVICE_STATE_ACTIVE);
}

SomeEndpoint::~SomeEndpoint() {
    const EndpointKeys all;
}

}  // namespace test
