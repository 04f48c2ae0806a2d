// SPDX-License-Identifier: MIT
//
// What each exported control function has around its body: the text of its arguments for the call trace, and a stop for exceptions.
// Control threads.
#pragma once

#include <cstdint>
#include <exception>

#include "diag/format_text.h"
#include "platform/text.h"

namespace vxcomn {

// The argument text of a trace scope: labels with numbers, addresses in hexadecimal. Put together whether logging is on or not.
class CallArguments {
  public:
    CallArguments &address(const VXWCHAR *label, const void *value) {
        return add(label, VX_TEXT("%llx"), reinterpret_cast<uintptr_t>(value));
    }
    CallArguments &number(const VXWCHAR *label, int64_t value) { return add(label, VX_TEXT("%lli"), value); }
    CallArguments &real(const VXWCHAR *label, double value) { return add(label, VX_TEXT("%g"), value); }

    operator WideString() const { return text_; }  // NOLINT(google-explicit-constructor)

  private:
    CallArguments &add(const VXWCHAR *label, WideView format, const FormatArgument &value) {
        constexpr size_t kNumberUnits = 64;
        text_ += label;
        text_ += formatText(kNumberUnits, format, {&value, 1});
        return *this;
    }

    WideString text_;
};

// Runs the body of an export. Nothing raises across the interface: what memory doesn't suffice for fails.
template <class Result, class Body>
Result guarded(Result onFailure, Body &&body) noexcept {
    try {
        return body();
    } catch (const std::exception &) {
        return onFailure;
    }
}

}  // namespace vxcomn
