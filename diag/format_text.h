// SPDX-License-Identifier: MIT
//
// printf-like formatting of log lines, typed and safe: every argument carries its type, a directive that has no argument left
// prints nothing, one that meets an argument of another type prints it in that type's own way. So a stray % in a text that ends up
// as a format can take no argument that isn't there. Understands flags, width, precision and the conversions d i u x X o c s S p f
// e g a and %%; length modifiers are read and ignored. Any control thread; allocates.
#pragma once

#include <concepts>
#include <cstdint>
#include <span>
#include <string>

#include "platform/text.h"

namespace vxcomn {

// One argument of a log line.
class FormatArgument {
  public:
    enum class Kind : uint8_t { integer, real, narrow, wide, pointer };

    template <std::integral T>
    FormatArgument(T value) noexcept  // NOLINT(google-explicit-constructor)
        : kind_(Kind::integer), signed_(static_cast<int64_t>(value)), unsigned_(widen(value)) {}
    FormatArgument(double value) noexcept : kind_(Kind::real), real_(value) {}          // NOLINT(google-explicit-constructor)
    FormatArgument(const char *text) noexcept : kind_(Kind::narrow), narrow_(text) {}   // NOLINT(google-explicit-constructor)
    FormatArgument(const VXWCHAR *text) noexcept : kind_(Kind::wide), wide_(text) {}    // NOLINT(google-explicit-constructor)
    FormatArgument(const std::string &text) noexcept : FormatArgument(text.c_str()) {}  // NOLINT(google-explicit-constructor)
    FormatArgument(const WideString &text) noexcept : FormatArgument(text.c_str()) {}   // NOLINT(google-explicit-constructor)
    FormatArgument(const void *address) noexcept                                        // NOLINT(google-explicit-constructor)
        : kind_(Kind::pointer), unsigned_(reinterpret_cast<uintptr_t>(address)) {}

    Kind kind() const noexcept { return kind_; }
    int64_t signedValue() const noexcept { return signed_; }
    uint64_t unsignedValue() const noexcept { return unsigned_; }
    double real() const noexcept { return real_; }
    // The text of a narrow or wide argument; "(null)" for a null pointer.
    WideString text() const;

  private:
    template <std::integral T>
    static uint64_t widen(T value) noexcept {
        if constexpr (std::same_as<T, bool>) {
            return value ? 1 : 0;
        } else {
            return static_cast<uint64_t>(static_cast<std::make_unsigned_t<T>>(value));
        }
    }

    Kind kind_;
    int64_t signed_ = 0;
    uint64_t unsigned_ = 0;
    double real_ = 0;
    const char *narrow_ = nullptr;
    const VXWCHAR *wide_ = nullptr;
};

// Formats; the result has at most `limit` units.
WideString formatText(size_t limit, WideView format, std::span<const FormatArgument> arguments);

}  // namespace vxcomn
