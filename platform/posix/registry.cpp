// SPDX-License-Identifier: MIT
//
// The registry on the machine folder's store: what each call asks of the tables.
#include "platform/registry.h"

#include "platform/posix/registry_key.h"
#include "platform/posix/registry_store.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxKeyNameUnits = 255;
constexpr size_t kMaxValueNameUnits = 16383;

int64_t rootKey(RegistryRoot root) noexcept {
    return static_cast<int64_t>(root) + 1;
}

// The parts of a path. False if one is too long or holds a NUL, as no key's name does.
bool splitPath(WideView path, std::vector<WideView> &parts) {
    while (!path.empty()) {
        const size_t end = path.find(VXWCHAR{'\\'});
        const WideView part = path.substr(0, end);
        path.remove_prefix(end == WideView::npos ? path.size() : end + 1);
        if (part.empty()) continue;
        if (part.size() > kMaxKeyNameUnits || part.find(VXWCHAR{0}) != WideView::npos) return false;
        parts.push_back(part);
    }
    return true;
}

bool isValueName(WideView name) noexcept {
    return name.size() <= kMaxValueNameUnits && name.find(VXWCHAR{0}) == WideView::npos;
}

bool keyExists(StoreConnection &store, int64_t key) {
    return store(Query::keyExists).bind(1, key).next();
}

Status absentOrDeleted(StoreConnection &store, int64_t key) {
    return keyExists(store, key) ? status::fileNotFound : status::keyDeleted;
}

// Walks down from the chain's end, as far as there are keys, and lengthens the chain by them. Returns how many parts that were.
size_t walk(StoreConnection &store, const std::vector<WideView> &parts, KeyChain &chain) {
    for (size_t depth = 0; depth < parts.size(); ++depth) {
        const WideString folded = foldCase(parts[depth]);
        Statement find = store(Query::findKey);
        if (!find.bind(1, chain.back()).bind(2, WideView(folded)).next()) return depth;
        chain.push_back(find.number(0));
    }
    return parts.size();
}

// Finds a key from the chain's end. The chain is its own only if that is ok.
Status findKey(StoreConnection &store, const std::vector<WideView> &parts, KeyChain &chain) {
    const int64_t above = chain.back();
    const bool found = walk(store, parts, chain) == parts.size();
    // A key that was reached by its name is there; whether the start is must be asked for.
    if (found && !parts.empty()) return status::ok;
    if (!keyExists(store, above)) return status::keyDeleted;
    return found ? status::ok : status::fileNotFound;
}

Status makeKey(StoreConnection &store, const std::vector<WideView> &parts, KeyChain &chain, bool &created) {
    created = false;
    KeyChain found = chain;
    if (const Status status = findKey(store, parts, found); status != status::fileNotFound) {
        chain = std::move(found);
        return status;
    }
    StoreTransaction transaction(store);
    size_t depth = walk(store, parts, chain);
    if (!keyExists(store, chain.back())) return status::keyDeleted;
    const KeyChain above = chain;
    for (; depth < parts.size(); ++depth, created = true) {
        const WideString folded = foldCase(parts[depth]);
        store(Query::addKey).bind(1, chain.back()).bind(2, WideView(folded)).bind(3, parts[depth]).run();
        chain.push_back(store.lastKey());
    }
    transaction.commit();
    if (created) store.noteChange(above, ChangeKind::keys);
    return status::ok;
}

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
    transaction.commit();
    // Who watches a key that is gone learns it, whatever it watches for; above it a key is missing now, and in one that was kept
    // the values are.
    store.noteChange(gone, ChangeKind::gone);
    store.noteChange(chain, keep ? ChangeKind::values : ChangeKind::keys);
}

Status listNames(StoreConnection &store, Query query, int64_t key, std::vector<WideString> &names) {
    std::vector<WideString> found;
    Statement list = store(query);
    list.bind(1, key);
    while (list.next()) found.push_back(list.text(0));
    if (found.empty() && !keyExists(store, key)) return status::keyDeleted;
    names = std::move(found);
    return status::ok;
}

}  // namespace

namespace {

bool isOf(int64_t identity, const StoreConnection &store) {
    return store.identity() == identity;
}

}  // namespace

RegistryKey::RegistryKey() noexcept = default;
RegistryKey::RegistryKey(RegistryKey &&) noexcept = default;
RegistryKey &RegistryKey::operator=(RegistryKey &&) noexcept = default;
RegistryKey::~RegistryKey() = default;

Status RegistryKey::open(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key) {
    std::vector<WideView> parts;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(false, [&](StoreConnection &store) {
        KeyChain chain = {rootKey(root)};
        const Status status = findKey(store, parts, chain);
        if (status == status::ok) key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        return status;
    });
}

Status RegistryKey::create(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                           const SecurityRecord *) {
    std::vector<WideView> parts;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        KeyChain chain = {rootKey(root)};
        bool isNew = false;
        const Status status = makeKey(store, parts, chain, isNew);
        if (status != status::ok) return status;
        key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        if (created != nullptr) *created = isNew;
        return status;
    });
}

Status RegistryKey::openBelow(WideView path, RegistryAccess access, RegistryKey &key) const {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(false, [&, above = *impl_](StoreConnection &store) {
        if (!isOf(above.store, store)) return status::keyDeleted;
        KeyChain chain = above.chain;
        const Status status = findKey(store, parts, chain);
        if (status == status::ok) key.impl_ = std::make_unique<Impl>(Impl{store.identity(), chain, static_cast<uint32_t>(access)});
        return status;
    });
}

Status RegistryKey::createBelow(WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                                const SecurityRecord *) const {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&, above = *impl_](StoreConnection &store) {
        if (!isOf(above.store, store)) return status::keyDeleted;
        KeyChain chain = above.chain;
        bool isNew = false;
        const Status status = makeKey(store, parts, chain, isNew);
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

Status RegistryKey::query(WideView name, RegistryValue &value) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(false, [&](StoreConnection &store) {
        if (!isOf(impl_->store, store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        Statement read = store(Query::readValue);
        if (!read.bind(1, impl_->key()).bind(2, WideView(folded)).next()) return absentOrDeleted(store, impl_->key());
        const std::span<const uint8_t> data = read.bytes(1);
        value.data.assign(data.begin(), data.end());
        value.type = static_cast<RegistryType>(read.number(0));
        return status::ok;
    });
}

Status RegistryKey::set(WideView name, RegistryType type, std::span<const uint8_t> data) {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kSetValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!isOf(impl_->store, store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        Statement write = store(Query::writeValue);
        write.bind(1, impl_->key()).bind(2, WideView(folded)).bind(3, name).bind(4, static_cast<int64_t>(type)).bind(5, data).run();
        if (store.changes() != 1) return status::keyDeleted;
        store.noteChange(impl_->chain, ChangeKind::values);
        return status::ok;
    });
}

Status RegistryKey::deleteValue(WideView name) {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kSetValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!isOf(impl_->store, store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        store(Query::deleteValue).bind(1, impl_->key()).bind(2, WideView(folded)).run();
        if (store.changes() != 1) return absentOrDeleted(store, impl_->key());
        store.noteChange(impl_->chain, ChangeKind::values);
        return status::ok;
    });
}

Status RegistryKey::deleteBelow(WideView path) {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts) || parts.empty()) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!isOf(impl_->store, store)) return status::keyDeleted;
        StoreTransaction transaction(store);
        KeyChain chain = impl_->chain;
        if (const Status status = findKey(store, parts, chain); status != status::ok) return status;
        if (store(Query::hasKeysBelow).bind(1, chain.back()).next()) return status::accessDenied;
        deleteTree(store, transaction, chain, false);
        return status::ok;
    });
}

Status RegistryKey::deleteTreeBelow(WideView path) {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!isOf(impl_->store, store)) return status::keyDeleted;
        StoreTransaction transaction(store);
        KeyChain chain = impl_->chain;
        if (const Status status = findKey(store, parts, chain); status != status::ok) return status;
        deleteTree(store, transaction, chain, parts.empty());
        return status::ok;
    });
}

Status RegistryKey::subkeys(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kEnumerate)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        return isOf(impl_->store, store) ? listNames(store, Query::listKeys, impl_->key(), names) : status::keyDeleted;
    });
}

Status RegistryKey::values(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        return isOf(impl_->store, store) ? listNames(store, Query::listValues, impl_->key(), names) : status::keyDeleted;
    });
}

}  // namespace vxcomn
