// SPDX-License-Identifier: MIT
//
// Which key a path led to, from which start, so that a path known from before costs no walk. A key's number is never given to
// another key, so a remembered one is either right or that of a key that is gone: who uses it finds out by using it. Belongs to one
// connection. Internal to platform/posix/.
#pragma once

#include <functional>
#include <new>
#include <unordered_map>

#include "platform/posix/registry_key.h"
#include "platform/text.h"

namespace vxcomn {

class KeyCache {
  public:
    // Null if it isn't known. Holds until the next change of the cache.
    const KeyChain *find(int64_t start, WideView path) const {
        const auto found = chains_.find(View{start, path});
        return found != chains_.end() ? &found->second : nullptr;
    }

    void remember(int64_t start, WideView path, const KeyChain &chain) noexcept {
        try {
            if (chains_.size() >= kMost) chains_.clear();
            chains_.insert_or_assign(Path{start, WideString(path)}, chain);
        } catch (const std::bad_alloc &) {
            chains_.clear();
        }
    }

    void clear() noexcept { chains_.clear(); }

  private:
    // Some slots' parameter keys with all that is in them; what is more, begins anew.
    static constexpr size_t kMost = 2048;

    struct View {
        int64_t start;
        WideView path;
    };
    struct Path {
        int64_t start;
        WideString path;
        operator View() const noexcept { return {start, path}; }  // NOLINT(google-explicit-constructor)
    };
    struct Hash {
        using is_transparent = void;
        size_t operator()(const View &view) const noexcept {
            return std::hash<WideView>()(view.path) + static_cast<size_t>(view.start) * 0x9E3779B97F4A7C15u;
        }
    };
    struct Equal {
        using is_transparent = void;
        bool operator()(const View &left, const View &right) const noexcept {
            return left.start == right.start && left.path == right.path;
        }
    };

    std::unordered_map<Path, KeyChain, Hash, Equal> chains_;
};

}  // namespace vxcomn
