// SPDX-License-Identifier: MIT
#include "platform/posix/registry_lookup.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxKeyNameUnits = 255;
constexpr size_t kMaxValueNameUnits = 16383;

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

bool findKnown(StoreConnection &store, const KeyChain &start, WideView path, KeyChain &chain) {
    const KeyChain *known = store.keys().find(start.back(), path);
    if (known == nullptr) return false;
    const bool trust = store.oneWrite() != nullptr && store.oneWrite()->trust;
    if (!trust && !keyExists(store, known->back())) {
        store.keys().clear();
        return false;
    }
    chain = *known;
    return true;
}

Status findByWalk(StoreConnection &store, const KeyChain &start, const std::vector<WideView> &parts, KeyChain &chain) {
    KeyChain found = start;
    const bool whole = walk(store, parts, found) == parts.size();
    // A key that was reached by its name is there; whether the start is must be asked for.
    if ((!whole || parts.empty()) && !keyExists(store, start.back())) return keyIsGone(store);
    if (!whole) return status::fileNotFound;
    chain = std::move(found);
    return status::ok;
}

}  // namespace

KeyChain rootChain(RegistryRoot root) {
    return {static_cast<int64_t>(root) + 1};
}

bool isValueName(WideView name) noexcept {
    return name.size() <= kMaxValueNameUnits && name.find(VXWCHAR{0}) == WideView::npos;
}

bool keyExists(StoreConnection &store, int64_t key) {
    return store(Query::keyExists).bind(1, key).next();
}

Status keyIsGone(StoreConnection &store) {
    if (OneWrite *const write = store.oneWrite(); write != nullptr && write->trust) write->stale = true;
    return status::keyDeleted;
}

Status absentOrGone(StoreConnection &store, int64_t key) {
    return keyExists(store, key) ? status::fileNotFound : keyIsGone(store);
}

Status findKey(StoreConnection &store, const KeyChain &start, WideView path, KeyChain &chain) {
    if (findKnown(store, start, path, chain)) return status::ok;
    std::vector<WideView> parts;
    if (!splitPath(path, parts)) return status::invalidParameter;
    const Status status = findByWalk(store, start, parts, chain);
    if (status == status::ok) store.keys().remember(start.back(), path, chain);
    return status;
}

Status makeKey(StoreConnection &store, const KeyChain &start, WideView path, KeyChain &chain, bool &created) {
    created = false;
    if (const Status status = findKey(store, start, path, chain); status != status::fileNotFound) return status;
    std::vector<WideView> parts;
    splitPath(path, parts);
    StoreTransaction transaction(store);
    KeyChain made = start;
    size_t depth = walk(store, parts, made);
    if (!keyExists(store, made.back())) return keyIsGone(store);
    const size_t above = made.size();
    for (; depth < parts.size(); ++depth, created = true) {
        const WideString folded = foldCase(parts[depth]);
        store(Query::addKey).bind(1, made.back()).bind(2, WideView(folded)).bind(3, parts[depth]).run();
        made.push_back(store.lastKey());
    }
    if (created) store.noteChange(std::span(made).first(above), ChangeKind::keys);
    chain = made;
    transaction.commit();
    store.keys().remember(start.back(), path, chain);
    return status::ok;
}

}  // namespace vxcomn
