// SPDX-License-Identifier: MIT
//
// The typed readers and writers: what a value must look like is the same for both stores.
#include "platform/registry.h"

#include <cstring>

namespace vxcomn {
namespace {

// A number of the width of `Number`, under its own type or as bytes.
template <class Number>
RegistryRead readNumber(const RegistryKey &key, WideView name, RegistryType type, Number &number) {
    RegistryValue found;
    const Status status = key.query(name, found, sizeof number);
    if (status != status::ok && status != status::moreData) return RegistryRead::absent;
    if ((found.type != type && found.type != RegistryType::binary) || found.data.size() != sizeof number) {
        return RegistryRead::wrongType;
    }
    std::memcpy(&number, found.data.data(), sizeof number);
    return RegistryRead::value;
}

template <class Value>
std::span<const uint8_t> bytesOf(const Value &value) {
    return {reinterpret_cast<const uint8_t *>(&value), sizeof value};
}

}  // namespace

RegistryRead RegistryKey::readU32(WideView name, uint32_t &value) const {
    return readNumber(*this, name, RegistryType::dword, value);
}

RegistryRead RegistryKey::readU64(WideView name, uint64_t &value) const {
    return readNumber(*this, name, RegistryType::qword, value);
}

RegistryRead RegistryKey::readText(WideView name, WideString &value) const {
    RegistryValue found;
    if (query(name, found) != status::ok) return RegistryRead::absent;
    if (found.type != RegistryType::sz) return RegistryRead::wrongType;
    WideString text(found.data.size() / sizeof(VXWCHAR), VXWCHAR{0});  // an odd byte at the end is no unit
    if (!text.empty()) std::memcpy(text.data(), found.data.data(), text.size() * sizeof(VXWCHAR));
    value = text.substr(0, text.find(VXWCHAR{0}));
    return RegistryRead::value;
}

RegistryRead RegistryKey::readBytes(WideView name, std::vector<uint8_t> &value, size_t limit) const {
    RegistryValue found;
    const Status status = query(name, found, limit);
    if (status != status::ok && status != status::moreData) return RegistryRead::absent;
    if (found.type != RegistryType::binary || status != status::ok) return RegistryRead::wrongType;
    value = std::move(found.data);
    return RegistryRead::value;
}

Status RegistryKey::setU32(WideView name, uint32_t value) {
    return set(name, RegistryType::dword, bytesOf(value));
}

Status RegistryKey::setU64(WideView name, uint64_t value) {
    return set(name, RegistryType::qword, bytesOf(value));
}

Status RegistryKey::setText(WideView name, WideView value) {
    const WideString ended(value);  // its end stands behind it and belongs to the data
    return set(name, RegistryType::sz, {reinterpret_cast<const uint8_t *>(ended.c_str()), (ended.size() + 1) * sizeof(VXWCHAR)});
}

Status RegistryKey::setBytes(WideView name, std::span<const uint8_t> data) {
    return set(name, RegistryType::binary, data);
}

}  // namespace vxcomn
