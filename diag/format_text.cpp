// SPDX-License-Identifier: MIT
#include "diag/format_text.h"

#include <algorithm>
#include <cstdio>

namespace vxcomn {

namespace {

struct Directive {
    std::string flags;
    int width = 0;
    int precision = -1;
    char conversion = 0;
};

constexpr int kMaxWidth = 4096;  // the length of a log line's buffer

bool isOneOf(VXWCHAR unit, const char *set) {
    for (; *set != 0; ++set) {
        if (unit == static_cast<VXWCHAR>(*set)) return true;
    }
    return false;
}

// Walks the format text and the arguments side by side.
class Formatter {
  public:
    Formatter(WideView format, std::span<const FormatArgument> arguments) : rest_(format), arguments_(arguments) {}

    WideString run(size_t limit) {
        while (!rest_.empty() && out_.size() < limit) {
            const size_t percent = rest_.find(VX_TEXT('%'));
            out_.append(rest_.substr(0, percent));
            if (percent == WideView::npos) break;
            rest_.remove_prefix(percent + 1);
            directive();
        }
        if (out_.size() > limit) out_.resize(limit);
        return std::move(out_);
    }

  private:
    VXWCHAR peek() const { return rest_.empty() ? VX_TEXT('\0') : rest_.front(); }

    const FormatArgument *next() { return used_ < arguments_.size() ? &arguments_[used_++] : nullptr; }

    int number() {
        if (peek() == VX_TEXT('*')) {
            rest_.remove_prefix(1);
            const FormatArgument *argument = next();
            return argument == nullptr ? 0 : static_cast<int>(std::clamp<int64_t>(argument->signedValue(), -kMaxWidth, kMaxWidth));
        }
        int value = 0;
        while (!rest_.empty() && peek() >= VX_TEXT('0') && peek() <= VX_TEXT('9')) {
            value = std::min(kMaxWidth, value * 10 + static_cast<int>(peek() - VX_TEXT('0')));
            rest_.remove_prefix(1);
        }
        return value;
    }

    void directive() {
        Directive d;
        while (!rest_.empty() && isOneOf(peek(), "-+ #0")) {
            d.flags.push_back(static_cast<char>(peek()));
            rest_.remove_prefix(1);
        }
        d.width = number();
        if (d.width < 0) {
            d.flags.push_back('-');
            d.width = -d.width;
        }
        if (peek() == VX_TEXT('.')) {
            rest_.remove_prefix(1);
            d.precision = number();
        }
        while (!rest_.empty() && isOneOf(peek(), "hlLjztwqI")) rest_.remove_prefix(1);
        if (rest_.empty()) return;
        const VXWCHAR conversion = peek();
        rest_.remove_prefix(1);
        if (conversion == VX_TEXT('%')) {
            out_.push_back(conversion);
            return;
        }
        if (!isOneOf(conversion, "diuxXocsSpfFeEgGaA")) return;
        d.conversion = static_cast<char>(conversion);
        if (const FormatArgument *argument = next()) print(d, *argument);
    }

    // The argument's type decides; the conversion only chooses among the ways to print that type.
    void print(const Directive &d, const FormatArgument &argument) {
        switch (argument.kind()) {
            case FormatArgument::Kind::narrow:
            case FormatArgument::Kind::wide: {
                WideString text = argument.text();
                if (d.precision >= 0 && text.size() > static_cast<size_t>(d.precision))
                    text.resize(static_cast<size_t>(d.precision));
                pad(d, text);
                break;
            }
            case FormatArgument::Kind::real:
                printReal(d, argument.real());
                break;
            case FormatArgument::Kind::integer:
                printInteger(d, argument);
                break;
            case FormatArgument::Kind::pointer:
                printNumber(d, isOneOf(static_cast<VXWCHAR>(d.conversion), "xX") ? d.conversion : 'X', argument.unsignedValue());
                break;
        }
    }

    void pad(const Directive &d, const WideString &text) {
        const auto width = static_cast<size_t>(d.width);
        const size_t blanks = text.size() < width ? width - text.size() : 0;
        const bool left = d.flags.find('-') != std::string::npos;
        if (!left) out_.append(blanks, VX_TEXT(' '));
        out_ += text;
        if (left) out_.append(blanks, VX_TEXT(' '));
    }

    void printInteger(const Directive &d, const FormatArgument &argument) {
        switch (d.conversion) {
            case 'c':
                pad(d, WideString(1, static_cast<VXWCHAR>(argument.unsignedValue())));
                break;
            case 'u':
            case 'x':
            case 'X':
            case 'o':
                printNumber(d, d.conversion, argument.unsignedValue());
                break;
            default:
                printNumber(d, 'd', static_cast<uint64_t>(argument.signedValue()));
                break;
        }
    }

    void printNumber(const Directive &d, char conversion, uint64_t value) {
        const std::string format = "%" + d.flags + "*.*ll" + conversion;
        char text[2 * kMaxWidth + 64];
        std::snprintf(text, sizeof text, format.c_str(), d.width, d.precision, static_cast<unsigned long long>(value));
        out_ += toWide(text);
    }

    void printReal(const Directive &d, double value) {
        const char conversion = isOneOf(static_cast<VXWCHAR>(d.conversion), "fFeEgGaA") ? d.conversion : 'f';
        const std::string format = "%" + d.flags + "*.*" + conversion;
        char text[2 * kMaxWidth + 512];
        std::snprintf(text, sizeof text, format.c_str(), d.width, d.precision, value);
        out_ += toWide(text);
    }

    WideView rest_;
    std::span<const FormatArgument> arguments_;
    size_t used_ = 0;
    WideString out_;
};

}  // namespace

WideString FormatArgument::text() const {
    if (kind_ == Kind::narrow) return toWide(narrow_ == nullptr ? "(null)" : narrow_);
    return wide_ == nullptr ? WideString(VX_TEXT("(null)")) : WideString(wide_);
}

WideString formatText(size_t limit, WideView format, std::span<const FormatArgument> arguments) {
    return Formatter(format, arguments).run(limit);
}

}  // namespace vxcomn
