// SPDX-License-Identifier: MIT
#include <algorithm>
#include <cstring>

#include "tools/vxreg/reg_file.h"

namespace vxreg {
namespace {

using vxcomn::RegistryType;
using vxcomn::RegistryValue;
using vxcomn::toUtf8;
using vxcomn::toWide;
using vxcomn::WideString;
using vxcomn::WideView;

constexpr size_t kMaxValueNameUnits = 16383;
constexpr size_t kMaxKeyNameUnits = 255;

bool isBlank(VXWCHAR unit) {
    return unit == ' ' || unit == '\t';
}

int digitOf(VXWCHAR unit) {
    if (unit >= '0' && unit <= '9') return unit - '0';
    if (unit >= 'a' && unit <= 'f') return unit - 'a' + 10;
    if (unit >= 'A' && unit <= 'F') return unit - 'A' + 10;
    return -1;
}

// The file's text; either encoding has to be whole.
WideString decode(const std::string &bytes) {
    if (bytes.starts_with("\xFF\xFE")) {
        if (bytes.size() % 2 != 0) throw RegFileError{1, "the text ends in half a character"};
        WideString text(bytes.size() / 2 - 1, VXWCHAR{0});
        if (!text.empty()) std::memcpy(text.data(), bytes.data() + 2, text.size() * 2);
        return text;
    }
    const std::string utf8 = bytes.substr(bytes.starts_with("\xEF\xBB\xBF") ? 3 : 0);
    WideString text = toWide(utf8);
    const std::string back = toUtf8(text);
    if (back != utf8) {
        const auto at = std::mismatch(utf8.begin(), utf8.end(), back.begin(), back.end()).first;
        throw RegFileError{1 + static_cast<int>(std::count(utf8.begin(), at, '\n')), "this is neither UTF-16 nor UTF-8"};
    }
    return text;
}

class Parser {
  public:
    explicit Parser(WideString text) : text_(std::move(text)) {}

    std::vector<RegFileKey> parse() {
        skipBlanks();
        const WideView heading = restOfLine();
        if (heading != VX_TEXT("Windows Registry Editor Version 5.00")) {
            fail("the first line is not 'Windows Registry Editor Version 5.00'");
        }
        at_ += heading.size();
        endLine();
        while (at_ < text_.size()) {
            skipBlanks();
            if (peek() == ';') {
                at_ += restOfLine().size();
            } else if (peek() == '[') {
                keyLine();
            } else if (peek() == '@' || peek() == '"') {
                valueLine();
            } else if (!atLineEnd()) {
                fail("this is no key, value or comment");
            }
            endLine();
        }
        return std::move(keys_);
    }

  private:
    [[noreturn]] void fail(const std::string &what) const { throw RegFileError{line_, what}; }

    VXWCHAR peek() const { return at_ < text_.size() ? text_[at_] : VXWCHAR{0}; }
    bool atLineEnd() const {
        return at_ == text_.size() || peek() == '\n' || (peek() == '\r' && text_.substr(at_, 2) == VX_TEXT("\r\n"));
    }
    bool take(VXWCHAR unit) {
        if (at_ == text_.size() || text_[at_] != unit) return false;
        ++at_;
        return true;
    }
    bool takeWord(WideView word) {
        if (!vxcomn::equalIgnoringCase(WideView(text_).substr(at_, word.size()), word)) return false;
        at_ += word.size();
        return true;
    }
    void skipBlanks() {
        while (isBlank(peek())) ++at_;
    }
    // Without the blanks at its end.
    WideView restOfLine() const {
        size_t end = std::min(text_.find(VXWCHAR{'\n'}, at_), text_.size());
        if (end > at_ && text_[end - 1] == '\r') --end;
        WideView rest = WideView(text_).substr(at_, end - at_);
        while (!rest.empty() && isBlank(rest.back())) rest.remove_suffix(1);
        return rest;
    }
    void endLine() {
        skipBlanks();
        if (!atLineEnd()) fail("something is left at the end of the line");
        take('\r');
        if (take('\n')) ++line_;
    }

    void keyLine() {
        WideView rest = restOfLine();
        at_ += rest.size();
        if (rest.size() < 2 || rest.back() != ']') fail("the name of a key lacks its ']'");
        rest = rest.substr(1, rest.size() - 2);
        const bool isDeleted = rest.starts_with(VXWCHAR{'-'});
        if (isDeleted) rest.remove_prefix(1);
        // The root is plain text; what follows it may be more than UTF-8 can hold.
        const size_t end = std::min(rest.find(VXWCHAR{'\\'}), rest.size());
        auto key = parseKeyName(toUtf8(rest.substr(0, end)));
        if (!key) fail("the name of a key begins with no root of the registry");
        if (end < rest.size()) key->path = checkedPath(rest.substr(end + 1));
        if (!key->path.empty()) key->full += "\\" + toUtf8(key->path);
        if (isDeleted && key->path.empty()) fail("a root of the registry cannot be deleted");
        keys_.push_back({*key, isDeleted, line_, {}});
    }

    WideString checkedPath(WideView path) const {
        for (size_t begin = 0; begin <= path.size();) {
            const size_t end = std::min(path.find(VXWCHAR{'\\'}, begin), path.size());
            if (end == begin) fail("the name of a key has an empty part");
            if (end - begin > kMaxKeyNameUnits) fail("a part of the name of a key is longer than 255 characters");
            begin = end + 1;
        }
        if (path.find(VXWCHAR{0}) != WideView::npos) fail("the name of a key holds a NUL");
        return WideString(path);
    }

    void valueLine() {
        if (keys_.empty()) fail("a value stands before the first key");
        if (keys_.back().isDeleted) fail("a value stands in a key that is deleted");
        RegFileValue value = {{}, {}, line_};
        if (!take('@')) value.name = quotedText();
        if (value.name.size() > kMaxValueNameUnits) fail("the name of a value is longer than 16,383 characters");
        if (value.name.find(VXWCHAR{0}) != WideString::npos) fail("the name of a value holds a NUL");
        skipBlanks();
        if (!take('=')) fail("'=' is missing behind the name of a value");
        skipBlanks();
        if (!take('-')) value.value = data();
        keys_.back().values.push_back(std::move(value));
    }

    // Lines may end inside of it, as they do in names.
    WideString quotedText() {
        WideString text;
        const int begin = line_;
        take('"');
        while (!take('"')) {
            if (at_ < text_.size() && text_[at_] == '\\') ++at_;
            if (at_ >= text_.size()) throw RegFileError{begin, "a text lacks its closing quote"};
            if (text_[at_] == '\n') ++line_;
            text += text_[at_++];
        }
        return text;
    }

    RegistryValue data() {
        if (peek() == '"') {
            const WideString text = quotedText();
            RegistryValue value = {RegistryType::sz, {}};
            value.data.resize((text.size() + 1) * sizeof(VXWCHAR));
            std::memcpy(value.data.data(), text.c_str(), value.data.size());
            return value;
        }
        if (takeWord(VX_TEXT("dword:"))) {
            const uint32_t number = hexadecimal(8, "a dword has one to eight hexadecimal digits");
            RegistryValue value = {RegistryType::dword, std::vector<uint8_t>(sizeof number)};
            std::memcpy(value.data.data(), &number, sizeof number);
            return value;
        }
        if (!takeWord(VX_TEXT("hex"))) fail("a value is a text in quotes, dword:, hex: or hex(N):");
        RegistryType type = RegistryType::binary;
        if (take('(')) {
            type = static_cast<RegistryType>(hexadecimal(8, "a type is a hexadecimal number of up to eight digits"));
            if (!take(')')) fail("')' is missing behind a type");
        }
        if (!take(':')) fail("':' is missing behind hex");
        return {type, bytes()};
    }

    uint32_t hexadecimal(int most, const char *what) {
        uint32_t number = 0;
        int digits = 0;
        for (; digitOf(peek()) >= 0; ++at_) {
            if (++digits > most) fail(what);
            number = number << 4 | static_cast<uint32_t>(digitOf(peek()));
        }
        if (digits == 0) fail(what);
        return number;
    }

    // Blanks, and line ends behind a backslash.
    void skipFolds() {
        for (;;) {
            skipBlanks();
            if (peek() != '\\') return;
            ++at_;
            skipBlanks();
            if (!atLineEnd() || at_ == text_.size()) fail("behind the backslash in a list of bytes the line does not end");
            take('\r');
            take('\n');
            ++line_;
        }
    }

    std::vector<uint8_t> bytes() {
        std::vector<uint8_t> list;
        skipFolds();
        while (!atLineEnd()) {
            list.push_back(static_cast<uint8_t>(hexadecimal(2, "a byte has one or two hexadecimal digits")));
            skipFolds();
            if (atLineEnd()) break;
            if (!take(',')) fail("bytes are separated by commas");
            skipFolds();
        }
        return list;
    }

    WideString text_;
    size_t at_ = 0;
    int line_ = 1;
    std::vector<RegFileKey> keys_;
};

}  // namespace

std::vector<RegFileKey> parseRegFile(const std::string &bytes) {
    return Parser(decode(bytes)).parse();
}

}  // namespace vxreg
