// SPDX-License-Identifier: MIT
#include "platform/endpoints.h"

namespace vxcomn {
namespace {

constexpr GUID kEnumeratorClass = {0xBCDE0395, 0xE52F, 0x467C, {0x8E, 0x3D, 0xC4, 0x57, 0x92, 0x91, 0x69, 0x2E}};

}  // namespace

HRESULT initializeCom() noexcept {
    return CoInitialize(nullptr);
}

HRESULT createDeviceEnumerator(ComPtr<IMMDeviceEnumerator> &enumerator) noexcept {
    return CoCreateInstance(kEnumeratorClass, nullptr, CLSCTX_INPROC_SERVER, kIidDeviceEnumerator,
                            reinterpret_cast<void **>(enumerator.put()));
}

}  // namespace vxcomn
