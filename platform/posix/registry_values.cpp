// SPDX-License-Identifier: MIT
//
// The registry on the machine folder's store: values, and lists of names.
#include <algorithm>

#include "platform/posix/registry_lookup.h"
#include "platform/registry.h"

namespace vxcomn {
namespace {

int64_t sqlLimit(size_t limit) noexcept {
    return static_cast<int64_t>(std::min<size_t>(limit, INT64_MAX));
}

std::vector<uint8_t> copyOf(std::span<const uint8_t> bytes) {
    return {bytes.begin(), bytes.end()};
}

// 2 if there is no such value, be it for want of the key.
Status readValue(StoreConnection &store, int64_t key, WideView name, RegistryValue &value, size_t limit) {
    const WideString folded = foldCase(name);
    Statement read = store(Query::readValue);
    if (!read.bind(1, key).bind(2, WideView(folded)).bind(3, sqlLimit(limit)).next()) return status::fileNotFound;
    value.data = copyOf(read.bytes(1));
    value.type = static_cast<RegistryType>(read.number(0));
    return read.isNull(1) ? status::moreData : status::ok;
}

Status writeValue(StoreConnection &store, int64_t key, WideView name, RegistryType type, std::span<const uint8_t> data) {
    const WideString folded = foldCase(name);
    const auto bindAll = [&](Statement &write) {
        write.bind(1, key).bind(2, WideView(folded)).bind(4, static_cast<int64_t>(type)).bind(5, data);
    };
    // The value is there most times. Outside of a transaction the look would be a second one to make.
    if (store.oneWrite() != nullptr) {
        Statement write = store(Query::overwriteValue);
        bindAll(write);
        write.run();
        if (store.changes() == 1) return status::ok;
    }
    Statement write = store(Query::writeValue);
    bindAll(write);
    write.bind(3, name).run();
    return store.changes() == 1 ? status::ok : keyIsGone(store);
}

Status listNames(StoreConnection &store, Query query, int64_t key, std::vector<WideString> &names) {
    std::vector<WideString> found;
    Statement list = store(query);
    list.bind(1, key);
    while (list.next()) found.push_back(list.text(0));
    if (found.empty() && !keyExists(store, key)) return keyIsGone(store);
    names = std::move(found);
    return status::ok;
}

Status listEntries(StoreConnection &store, int64_t key, size_t limit, std::vector<RegistryEntry> &entries) {
    std::vector<RegistryEntry> found;
    Statement list = store(Query::listEntries);
    list.bind(1, key).bind(2, sqlLimit(limit));
    if (!list.next()) return keyIsGone(store);
    do {
        if (list.isNull(0)) break;
        found.push_back({list.text(0), {static_cast<RegistryType>(list.number(1)), copyOf(list.bytes(2))}});
    } while (list.next());
    entries = std::move(found);
    return status::ok;
}

// The key at a path for a single look that tells by itself whether the key is there, `look(chain)`: 1018 if not. A path known from
// before is tried first; only if it leads nowhere any more it is walked.
template <class Look>
Status lookAt(StoreConnection &store, RegistryRoot root, WideView path, Look look) {
    const KeyChain start = rootChain(root);
    KeyChain chain;
    if (const KeyChain *known = store.keys().find(start.back(), path)) {
        chain = *known;
        if (const Status status = look(chain); status != status::keyDeleted) return status;
        store.keys().clear();
    }
    if (const Status status = findKey(store, start, path, chain); status != status::ok) return status;
    const Status status = look(chain);
    return status == status::keyDeleted ? status::fileNotFound : status;
}

}  // namespace

Status RegistryKey::queryAt(RegistryRoot root, WideView path, WideView name, RegistryValue &value, size_t limit) {
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(false, [&](StoreConnection &store) {
        return lookAt(store, root, path, [&](const KeyChain &chain) {
            const Status status = readValue(store, chain.back(), name, value, limit);
            return status == status::fileNotFound ? absentOrGone(store, chain.back()) : status;
        });
    });
}

Status RegistryKey::openWithEntries(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, size_t limit,
                                    std::vector<RegistryEntry> &found) {
    return runInStore(false, [&](StoreConnection &store) {
        return lookAt(store, root, path, [&](const KeyChain &chain) {
            auto opened = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
            if (!opened->may(kQueryValue)) return status::accessDenied;
            const Status status = listEntries(store, chain.back(), limit, found);
            if (status == status::ok) key.impl_ = std::move(opened);
            return status;
        });
    });
}

Status RegistryKey::query(WideView name, RegistryValue &value, size_t limit) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(false, [&](StoreConnection &store) {
        if (const Status status = checkKey(store, impl_->store); status != status::ok) return status;
        const Status status = readValue(store, impl_->key(), name, value, limit);
        return status == status::fileNotFound ? absentOrGone(store, impl_->key()) : status;
    });
}

Status RegistryKey::set(WideView name, RegistryType type, std::span<const uint8_t> data) {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kSetValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        Status status = checkKey(store, impl_->store);
        if (status == status::ok) status = writeValue(store, impl_->key(), name, type, data);
        if (status == status::ok) store.noteChange(impl_->chain, ChangeKind::values);
        return status;
    });
}

Status RegistryKey::deleteValue(WideView name) {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kSetValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (const Status status = checkKey(store, impl_->store); status != status::ok) return status;
        const WideString folded = foldCase(name);
        store(Query::deleteValue).bind(1, impl_->key()).bind(2, WideView(folded)).run();
        if (store.changes() != 1) return absentOrGone(store, impl_->key());
        store.noteChange(impl_->chain, ChangeKind::values);
        return status::ok;
    });
}

Status RegistryKey::subkeys(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kEnumerate)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        const Status status = checkKey(store, impl_->store);
        return status == status::ok ? listNames(store, Query::listKeys, impl_->key(), names) : status;
    });
}

Status RegistryKey::values(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        const Status status = checkKey(store, impl_->store);
        return status == status::ok ? listNames(store, Query::listValues, impl_->key(), names) : status;
    });
}

Status RegistryKey::entries(size_t limit, std::vector<RegistryEntry> &found) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        const Status status = checkKey(store, impl_->store);
        return status == status::ok ? listEntries(store, impl_->key(), limit, found) : status;
    });
}

Status RegistryKey::openSubkeys(RegistryAccess access, WideView valueName, size_t limit, std::vector<RegistrySubkey> &found) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kEnumerate)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        if (const Status status = checkKey(store, impl_->store); status != status::ok) return status;
        const WideString folded = foldCase(valueName);
        std::vector<RegistrySubkey> opened;
        Statement list = store(Query::listSubkeys);
        list.bind(1, impl_->key()).bind(2, WideView(folded)).bind(3, sqlLimit(limit));
        while (list.next()) {
            RegistrySubkey subkey;
            subkey.name = list.text(1);
            auto below = std::make_unique<Impl>(Impl{impl_->store, impl_->chain, static_cast<uint32_t>(access)});
            below->chain.push_back(list.number(0));
            if (!list.isNull(2)) subkey.value = RegistryValue{static_cast<RegistryType>(list.number(2)), copyOf(list.bytes(3))};
            subkey.key.impl_ = std::move(below);
            opened.push_back(std::move(subkey));
        }
        if (opened.empty() && !keyExists(store, impl_->key())) return keyIsGone(store);
        found = std::move(opened);
        return status::ok;
    });
}

}  // namespace vxcomn
