// SPDX-License-Identifier: MIT
//
// Unique: owns one raw thing (a handle, a key, a module) and closes it. `Traits` tells how:
//
//     struct KeyTraits { using Raw = HKEY; static constexpr Raw none = nullptr; static void close(Raw key) noexcept; };
//     using RegKey = Unique<KeyTraits>;
#pragma once

#include <utility>

namespace vxcomn {

template <class Traits>
class Unique {
  public:
    using Raw = typename Traits::Raw;

    Unique() noexcept = default;
    explicit Unique(Raw raw) noexcept : raw_(raw) {}
    Unique(Unique &&other) noexcept : raw_(other.release()) {}
    Unique &operator=(Unique &&other) noexcept {
        if (this != &other) reset(other.release());
        return *this;
    }
    Unique(const Unique &) = delete;
    Unique &operator=(const Unique &) = delete;
    ~Unique() { reset(); }

    Raw get() const noexcept { return raw_; }
    explicit operator bool() const noexcept { return raw_ != Traits::none; }

    void reset(Raw raw = Traits::none) noexcept {
        const Raw old = std::exchange(raw_, raw);
        if (old != Traits::none) Traits::close(old);
    }
    Raw release() noexcept { return std::exchange(raw_, Traits::none); }

    // For out-parameters: closes what is held and hands out the place.
    Raw *put() noexcept {
        reset();
        return &raw_;
    }

  private:
    Raw raw_ = Traits::none;
};

}  // namespace vxcomn
