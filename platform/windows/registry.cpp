// SPDX-License-Identifier: MIT
//
// The system's own registry.
#include "platform/registry.h"

#include <algorithm>

#include "platform/security.h"
#include "platform/windows/registry_key.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxKeyNameUnits = 255;
constexpr size_t kMaxValueNameUnits = 16383;

HKEY rootKey(RegistryRoot root) noexcept {
    switch (root) {
        case RegistryRoot::currentUser:
            return HKEY_CURRENT_USER;
        case RegistryRoot::users:
            return HKEY_USERS;
        case RegistryRoot::classesRoot:
            return HKEY_CLASSES_ROOT;
        case RegistryRoot::localMachine:
            break;
    }
    return HKEY_LOCAL_MACHINE;
}

// The system would read a name only up to a NUL in it, and so take one key for another.
bool isName(WideView name) noexcept {
    return name.find(VXWCHAR{0}) == WideView::npos;
}

// Names by index, `next(index, buffer, length)` filling a buffer of `maxUnits` and an end. A name that another process makes or
// takes away meanwhile may be missed or seen twice, as with every walk of the system's registry.
template <class Next>
Status collectNames(size_t maxUnits, Next next, std::vector<WideString> &names) {
    WideString buffer(maxUnits + 1, L'\0');
    std::vector<WideString> found;
    for (DWORD index = 0;; ++index) {
        auto length = static_cast<DWORD>(buffer.size());
        const LSTATUS status = next(index, buffer.data(), &length);
        if (status == ERROR_NO_MORE_ITEMS) break;
        if (status != ERROR_SUCCESS) return static_cast<Status>(status);
        found.emplace_back(buffer.data(), length);
    }
    names = std::move(found);
    return status::ok;
}

}  // namespace

Status RegistryKey::Impl::open(HKEY above, WideView path, RegistryAccess access, RegistryKey &key) {
    if (!isName(path)) return status::invalidParameter;
    SystemKey opened;
    const LSTATUS status = RegOpenKeyExW(above, WideString(path).c_str(), 0, static_cast<REGSAM>(access), opened.put());
    return take(status, opened, key);
}

Status RegistryKey::Impl::create(HKEY above, WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                                 const SecurityRecord *security) {
    if (!isName(path)) return status::invalidParameter;
    auto *attributes = security != nullptr ? static_cast<SECURITY_ATTRIBUTES *>(security->attributes()) : nullptr;
    SystemKey opened;
    DWORD disposition = 0;
    const LSTATUS status = RegCreateKeyExW(above, WideString(path).c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                                           static_cast<REGSAM>(access), attributes, opened.put(), &disposition);
    if (status == ERROR_SUCCESS && created != nullptr) *created = disposition == REG_CREATED_NEW_KEY;
    return take(status, opened, key);
}

Status RegistryKey::Impl::take(LSTATUS status, SystemKey &opened, RegistryKey &key) {
    if (status != ERROR_SUCCESS) return static_cast<Status>(status);
    auto impl = std::make_unique<Impl>();
    impl->key = std::move(opened);
    key.impl_ = std::move(impl);
    return vxcomn::status::ok;
}

RegistryKey::RegistryKey() noexcept = default;
RegistryKey::RegistryKey(RegistryKey &&) noexcept = default;
RegistryKey &RegistryKey::operator=(RegistryKey &&) noexcept = default;
RegistryKey::~RegistryKey() = default;

Status RegistryKey::open(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key) {
    return Impl::open(rootKey(root), path, access, key);
}

Status RegistryKey::create(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                           const SecurityRecord *security) {
    return Impl::create(rootKey(root), path, access, key, created, security);
}

Status RegistryKey::openBelow(WideView path, RegistryAccess access, RegistryKey &key) const {
    return impl_ ? Impl::open(impl_->key.get(), path, access, key) : status::invalidHandle;
}

Status RegistryKey::createBelow(WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                                const SecurityRecord *security) const {
    return impl_ ? Impl::create(impl_->key.get(), path, access, key, created, security) : status::invalidHandle;
}

RegistryKey::operator bool() const noexcept {
    return impl_ != nullptr;
}
void RegistryKey::close() noexcept {
    impl_.reset();
}

Status RegistryKey::query(WideView name, RegistryValue &value, size_t limit) const {
    if (!impl_) return status::invalidHandle;
    if (!isName(name)) return status::invalidParameter;
    const WideString ended(name);
    std::vector<uint8_t> data(std::min<size_t>(limit, 256));
    for (;;) {  // the size may change between two calls
        DWORD type = 0;
        auto size = static_cast<DWORD>(data.size());
        const LSTATUS status = RegQueryValueExW(impl_->key.get(), ended.c_str(), nullptr, &type, data.data(), &size);
        if (status != ERROR_SUCCESS && status != ERROR_MORE_DATA) return static_cast<Status>(status);
        value.type = static_cast<RegistryType>(type);
        if (size > limit) {
            value.data.clear();
            return status::moreData;
        }
        data.resize(size);
        if (status == ERROR_MORE_DATA) continue;
        value.data = std::move(data);
        return status::ok;
    }
}

Status RegistryKey::set(WideView name, RegistryType type, std::span<const uint8_t> data) {
    if (!impl_) return status::invalidHandle;
    if (!isName(name)) return status::invalidParameter;
    // The system looks behind a text that has no end and takes the zeros that happen to stand there for it.
    std::vector<uint8_t> bytes(data.begin(), data.end());
    bytes.insert(bytes.end(), {0xFF, 0xFF, 0xFF, 0xFF});
    return static_cast<Status>(RegSetValueExW(impl_->key.get(), WideString(name).c_str(), 0, static_cast<DWORD>(type), bytes.data(),
                                              static_cast<DWORD>(data.size())));
}

Status RegistryKey::deleteValue(WideView name) {
    if (!impl_) return status::invalidHandle;
    if (!isName(name)) return status::invalidParameter;
    return static_cast<Status>(RegDeleteValueW(impl_->key.get(), WideString(name).c_str()));
}

Status RegistryKey::deleteBelow(WideView path) {
    if (!impl_) return status::invalidHandle;
    if (path.empty() || !isName(path)) return status::invalidParameter;
    const LSTATUS status = RegDeleteKeyExW(impl_->key.get(), WideString(path).c_str(), KEY_WOW64_64KEY, 0);
    return status == ERROR_KEY_HAS_CHILDREN ? status::accessDenied : static_cast<Status>(status);
}

Status RegistryKey::deleteTreeBelow(WideView path) {
    if (!impl_) return status::invalidHandle;
    if (!isName(path)) return status::invalidParameter;
    return static_cast<Status>(RegDeleteTreeW(impl_->key.get(), path.empty() ? nullptr : WideString(path).c_str()));
}

Status RegistryKey::subkeys(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    return collectNames(
        kMaxKeyNameUnits,
        [this](DWORD index, wchar_t *buffer, DWORD *length) {
            return RegEnumKeyExW(impl_->key.get(), index, buffer, length, nullptr, nullptr, nullptr, nullptr);
        },
        names);
}

Status RegistryKey::values(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    return collectNames(
        kMaxValueNameUnits,
        [this](DWORD index, wchar_t *buffer, DWORD *length) {
            return RegEnumValueW(impl_->key.get(), index, buffer, length, nullptr, nullptr, nullptr, nullptr);
        },
        names);
}

Status RegistryKey::queryAt(RegistryRoot root, WideView path, WideView name, RegistryValue &value, size_t limit) {
    RegistryKey key;
    const Status status = open(root, path, RegistryAccess::read, key);
    return status == status::ok ? key.query(name, value, limit) : status;
}

Status RegistryKey::openWithEntries(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, size_t limit,
                                    std::vector<RegistryEntry> &found) {
    RegistryKey opened;
    if (const Status status = open(root, path, access, opened); status != status::ok) return status;
    const Status status = opened.entries(limit, found);
    if (status == status::ok) key = std::move(opened);
    return status;
}

Status RegistryKey::entries(size_t limit, std::vector<RegistryEntry> &found) const {
    std::vector<WideString> names;
    if (const Status status = values(names); status != status::ok) return status;
    std::vector<RegistryEntry> read;
    for (WideString &name : names) {
        RegistryValue value;
        const Status status = query(name, value, limit);
        if (status == status::fileNotFound) continue;  // deleted meanwhile
        if (status != status::ok && status != status::moreData) return status;
        read.push_back({std::move(name), std::move(value)});
    }
    found = std::move(read);
    return status::ok;
}

Status RegistryKey::openSubkeys(RegistryAccess access, WideView valueName, size_t limit, std::vector<RegistrySubkey> &found) const {
    std::vector<WideString> names;
    if (const Status status = subkeys(names); status != status::ok) return status;
    std::vector<RegistrySubkey> opened;
    for (WideString &name : names) {
        RegistrySubkey subkey;
        const Status status = openBelow(name, access, subkey.key);
        if (status == status::fileNotFound) continue;  // deleted meanwhile
        RegistryValue value;
        if (status == status::ok && subkey.key.query(valueName, value, limit) == status::ok) subkey.value = std::move(value);
        subkey.name = std::move(name);
        opened.push_back(std::move(subkey));
    }
    found = std::move(opened);
    return status::ok;
}

Status inOneWrite(const std::function<Status()> &work) {
    return work();
}

}  // namespace vxcomn
