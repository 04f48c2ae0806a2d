// SPDX-License-Identifier: MIT
//
// The registry on the machine folder's store: opening, making and deleting keys.
#include "platform/registry.h"
#include "platform/posix/registry_lookup.h"

namespace vxcomn {
namespace {

// Deletes what is below the chain's end, and that key itself unless it is to be kept, and ends the transaction.
void deleteTree(StoreConnection &store, StoreTransaction &transaction, const KeyChain &chain, bool keep) {
    const int64_t key = chain.back();
    KeyChain gone;
    {
        Statement list = store(Query::listTree);
        for (list.bind(1, key); list.next();) gone.push_back(list.number(0));
    }
    if (keep) std::erase(gone, key);
    store(Query::deleteValuesOfTree).bind(1, key).run();
    store(Query::deleteKeysOfTree).bind(1, key).bind(2, keep ? key : int64_t{0}).run();
    store.keys().clear();
    // Who watches a key that is gone learns it, whatever it watches for; above it a key is missing now, and in one that was kept
    // the values are.
    store.noteChange(gone, ChangeKind::gone);
    store.noteChange(chain, keep ? ChangeKind::values : ChangeKind::keys);
    transaction.commit();
}

}  // namespace

RegistryKey::RegistryKey() noexcept = default;
RegistryKey::RegistryKey(RegistryKey &&) noexcept = default;
RegistryKey &RegistryKey::operator=(RegistryKey &&) noexcept = default;
RegistryKey::~RegistryKey() = default;

Status RegistryKey::open(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key) {
    return runInStore(false, [&](StoreConnection &store) {
        KeyChain chain;
        const Status status = findKey(store, rootChain(root), path, chain);
        if (status == status::ok) key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        return status;
    });
}

Status RegistryKey::create(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                           const SecurityRecord *) {
    return runInStore(true, [&](StoreConnection &store) {
        KeyChain chain;
        bool isNew = false;
        const Status status = makeKey(store, rootChain(root), path, chain, isNew);
        if (status != status::ok) return status;
        key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        if (created != nullptr) *created = isNew;
        return status;
    });
}

Status RegistryKey::openBelow(WideView path, RegistryAccess access, RegistryKey &key) const {
    if (!impl_) return status::invalidHandle;
    return runInStore(false, [&, above = *impl_](StoreConnection &store) {
        KeyChain chain;
        Status status = checkKey(store, above.store);
        if (status == status::ok) status = findKey(store, above.chain, path, chain);
        if (status == status::ok) key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        return status;
    });
}

Status RegistryKey::createBelow(WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                                const SecurityRecord *) const {
    if (!impl_) return status::invalidHandle;
    return runInStore(true, [&, above = *impl_](StoreConnection &store) {
        KeyChain chain;
        bool isNew = false;
        Status status = checkKey(store, above.store);
        if (status == status::ok) status = makeKey(store, above.chain, path, chain, isNew);
        if (status != status::ok) return status;
        key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        if (created != nullptr) *created = isNew;
        return status;
    });
}

RegistryKey::operator bool() const noexcept {
    return impl_ != nullptr;
}
void RegistryKey::close() noexcept {
    impl_.reset();
}

Status RegistryKey::deleteBelow(WideView path) {
    if (!impl_) return status::invalidHandle;
    return runInStore(true, [&](StoreConnection &store) {
        if (const Status status = checkKey(store, impl_->store); status != status::ok) return status;
        StoreTransaction transaction(store);
        KeyChain chain;
        if (const Status status = findKey(store, impl_->chain, path, chain); status != status::ok) return status;
        if (chain.size() == impl_->chain.size()) return status::invalidParameter;
        if (store(Query::hasKeysBelow).bind(1, chain.back()).next()) return status::accessDenied;
        deleteTree(store, transaction, chain, false);
        return status::ok;
    });
}

Status RegistryKey::deleteTreeBelow(WideView path) {
    if (!impl_) return status::invalidHandle;
    return runInStore(true, [&](StoreConnection &store) {
        if (const Status status = checkKey(store, impl_->store); status != status::ok) return status;
        StoreTransaction transaction(store);
        KeyChain chain;
        if (const Status status = findKey(store, impl_->chain, path, chain); status != status::ok) return status;
        deleteTree(store, transaction, chain, chain.size() == impl_->chain.size());
        return status::ok;
    });
}

}  // namespace vxcomn
