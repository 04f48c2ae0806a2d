// SPDX-License-Identifier: MIT
//
// Finding and making keys by their paths. Internal to platform/posix/; only inside the store.
#pragma once

#include "platform/posix/registry_key.h"
#include "platform/posix/registry_store.h"

namespace vxcomn {

KeyChain rootChain(RegistryRoot root);

// No more than the system's registry allows, and no NUL.
bool isValueName(WideView name) noexcept;

bool keyExists(StoreConnection &store, int64_t key);
// 1018, which inside of a OneWrite may mean that the path has to be walked anew.
Status keyIsGone(StoreConnection &store);
Status absentOrGone(StoreConnection &store, int64_t key);

// What a call on an open key begins with: whether the key is of this file.
inline Status checkKey(const StoreConnection &store, int64_t identity) noexcept {
    return store.identity() == identity ? status::ok : status::keyDeleted;
}

// The key that a path leads to from the end of `start`: 0, 2 if there is none, 87 for what is no path, 1018 if the start is gone.
// `chain` is written only if that is ok.
Status findKey(StoreConnection &store, const KeyChain &start, WideView path, KeyChain &chain);
// The same, and makes what is missing.
Status makeKey(StoreConnection &store, const KeyChain &start, WideView path, KeyChain &chain, bool &created);

}  // namespace vxcomn
