// SPDX-License-Identifier: MIT
//
// The registry on the machine folder's store: what each call asks of the tables. A key handle holds the key's number and the
// identity of the file that gave it, so a call costs one statement and no walk.
#include "platform/registry.h"

#include "platform/posix/registry_store.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxKeyNameUnits = 255;
constexpr size_t kMaxValueNameUnits = 16383;

// The rights inside RegistryAccess that a call asks for.
enum Right : uint32_t { kQueryValue = 1, kSetValue = 2, kEnumerate = 8 };

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

// Walks down from `key`; `depth` tells how many parts there are.
void walk(StoreConnection &store, const std::vector<WideView> &parts, int64_t &key, size_t &depth) {
    for (depth = 0; depth < parts.size(); ++depth) {
        const WideString folded = foldCase(parts[depth]);
        Statement find = store(Query::findKey);
        if (!find.bind(1, key).bind(2, WideView(folded)).next()) return;
        key = find.number(0);
    }
}

// Finds a key from `above`.
Status findKey(StoreConnection &store, int64_t above, const std::vector<WideView> &parts, int64_t &key) {
    size_t depth = 0;
    key = above;
    walk(store, parts, key, depth);
    // A key that was reached by its name is there; whether the start is must be asked for.
    if (depth == parts.size() && depth > 0) return status::ok;
    if (!keyExists(store, above)) return status::keyDeleted;
    return depth == parts.size() ? status::ok : status::fileNotFound;
}

Status makeKey(StoreConnection &store, int64_t above, const std::vector<WideView> &parts, int64_t &key, bool &created) {
    created = false;
    if (const Status status = findKey(store, above, parts, key); status != status::fileNotFound) return status;
    StoreTransaction transaction(store);
    size_t depth = 0;
    key = above;
    walk(store, parts, key, depth);
    if (!keyExists(store, key)) return status::keyDeleted;
    for (; depth < parts.size(); ++depth, created = true) {
        const WideString folded = foldCase(parts[depth]);
        store(Query::addKey).bind(1, key).bind(2, WideView(folded)).bind(3, parts[depth]).run();
        key = store.lastKey();
    }
    transaction.commit();
    return status::ok;
}

// Deletes what is below `key`, and the key itself unless it is to be kept.
void deleteTree(StoreConnection &store, int64_t key, bool keep) {
    store(Query::deleteValuesOfTree).bind(1, key).run();
    store(Query::deleteKeysOfTree).bind(1, key).bind(2, keep ? key : int64_t{0}).run();
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

struct RegistryKey::Impl {
    int64_t store;  // identity of the file
    int64_t key;
    uint32_t access;

    bool may(Right right) const noexcept { return (access & right) != 0; }
    bool isOf(const StoreConnection &connection) const { return connection.identity() == store; }

    static void hold(const StoreConnection &store, int64_t found, RegistryAccess access, RegistryKey &key) {
        key.impl_ = std::make_unique<Impl>(Impl{store.identity(), found, static_cast<uint32_t>(access)});
    }
};

RegistryKey::RegistryKey() noexcept = default;
RegistryKey::RegistryKey(RegistryKey &&) noexcept = default;
RegistryKey &RegistryKey::operator=(RegistryKey &&) noexcept = default;
RegistryKey::~RegistryKey() = default;

Status RegistryKey::open(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key) {
    std::vector<WideView> parts;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(false, [&](StoreConnection &store) {
        int64_t found = 0;
        const Status status = findKey(store, rootKey(root), parts, found);
        if (status == status::ok) Impl::hold(store, found, access, key);
        return status;
    });
}

Status RegistryKey::create(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, bool *created) {
    std::vector<WideView> parts;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        int64_t found = 0;
        bool isNew = false;
        const Status status = makeKey(store, rootKey(root), parts, found, isNew);
        if (status != status::ok) return status;
        Impl::hold(store, found, access, key);
        if (created != nullptr) *created = isNew;
        return status;
    });
}

Status RegistryKey::openBelow(WideView path, RegistryAccess access, RegistryKey &key) const {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(false, [&, above = *impl_](StoreConnection &store) {
        if (!above.isOf(store)) return status::keyDeleted;
        int64_t found = 0;
        const Status status = findKey(store, above.key, parts, found);
        if (status == status::ok) Impl::hold(store, found, access, key);
        return status;
    });
}

Status RegistryKey::createBelow(WideView path, RegistryAccess access, RegistryKey &key, bool *created) const {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&, above = *impl_](StoreConnection &store) {
        if (!above.isOf(store)) return status::keyDeleted;
        int64_t found = 0;
        bool isNew = false;
        const Status status = makeKey(store, above.key, parts, found, isNew);
        if (status != status::ok) return status;
        Impl::hold(store, found, access, key);
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
        if (!impl_->isOf(store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        Statement read = store(Query::readValue);
        if (!read.bind(1, impl_->key).bind(2, WideView(folded)).next()) return absentOrDeleted(store, impl_->key);
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
        if (!impl_->isOf(store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        Statement write = store(Query::writeValue);
        write.bind(1, impl_->key).bind(2, WideView(folded)).bind(3, name).bind(4, static_cast<int64_t>(type)).bind(5, data).run();
        return store.changes() == 1 ? status::ok : status::keyDeleted;
    });
}

Status RegistryKey::deleteValue(WideView name) {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kSetValue)) return status::accessDenied;
    if (!isValueName(name)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!impl_->isOf(store)) return status::keyDeleted;
        const WideString folded = foldCase(name);
        store(Query::deleteValue).bind(1, impl_->key).bind(2, WideView(folded)).run();
        return store.changes() == 1 ? status::ok : absentOrDeleted(store, impl_->key);
    });
}

Status RegistryKey::deleteBelow(WideView path) {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts) || parts.empty()) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!impl_->isOf(store)) return status::keyDeleted;
        StoreTransaction transaction(store);
        int64_t key = 0;
        if (const Status status = findKey(store, impl_->key, parts, key); status != status::ok) return status;
        if (store(Query::hasKeysBelow).bind(1, key).next()) return status::accessDenied;
        deleteTree(store, key, false);
        transaction.commit();
        return status::ok;
    });
}

Status RegistryKey::deleteTreeBelow(WideView path) {
    std::vector<WideView> parts;
    if (!impl_) return status::invalidHandle;
    if (!splitPath(path, parts)) return status::invalidParameter;
    return runInStore(true, [&](StoreConnection &store) {
        if (!impl_->isOf(store)) return status::keyDeleted;
        StoreTransaction transaction(store);
        int64_t key = 0;
        if (const Status status = findKey(store, impl_->key, parts, key); status != status::ok) return status;
        deleteTree(store, key, parts.empty());
        transaction.commit();
        return status::ok;
    });
}

Status RegistryKey::subkeys(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kEnumerate)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        return impl_->isOf(store) ? listNames(store, Query::listKeys, impl_->key, names) : status::keyDeleted;
    });
}

Status RegistryKey::values(std::vector<WideString> &names) const {
    if (!impl_) return status::invalidHandle;
    if (!impl_->may(kQueryValue)) return status::accessDenied;
    return runInStore(false, [&](StoreConnection &store) {
        return impl_->isOf(store) ? listNames(store, Query::listValues, impl_->key, names) : status::keyDeleted;
    });
}

}  // namespace vxcomn
