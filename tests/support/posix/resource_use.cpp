// SPDX-License-Identifier: MIT
#include "tests/support/resource_use.h"

#include <filesystem>
#include <iterator>

namespace vxcomn::testing {

namespace {

uint64_t entriesOf(const char *folder) {
    const std::filesystem::directory_iterator entries(folder);
    return static_cast<uint64_t>(std::distance(begin(entries), end(entries)));
}

}  // namespace

ResourceUse resourcesInUse() {
    return {entriesOf("/proc/self/fd"), entriesOf("/proc/self/task")};
}

}  // namespace vxcomn::testing
