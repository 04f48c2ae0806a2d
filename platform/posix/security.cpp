// SPDX-License-Identifier: MIT
//
// Keys and tokens are files of the machine folder, or lie in one; open_to_all.h gives these their permissions.
#include "platform/security.h"

namespace vxcomn {
namespace {

const SecurityRecord &none() noexcept {
    static const SecurityRecord record(nullptr);
    return record;
}

}  // namespace

const SecurityRecord &registrySecurity() noexcept {
    return none();
}
const SecurityRecord &mutexSecurity() noexcept {
    return none();
}

}  // namespace vxcomn
