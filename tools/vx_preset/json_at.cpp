// SPDX-License-Identifier: MIT
#include "tools/vx_preset/json_at.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>
#include <string_view>

#include "tools/vx_preset/failure.h"

namespace vx::preset {
namespace {

constexpr int kDeepest = 32;

int digitOf(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

std::string joined(std::initializer_list<std::string_view> pieces) {
    std::string text;
    for (const std::string_view piece : pieces) text += piece;
    return text;
}

// A value as a message shows it.
std::string shown(const Json &value) {
    std::string text = value.dump(-1, ' ', false, Json::error_handler_t::replace);
    if (text.size() > 60) text = text.substr(0, 57) + "...";
    return text;
}

}  // namespace

Json parseJson(const std::string &file, std::span<const uint8_t> text) {
    // Documents that people write are a few levels deep; the JSON library's own walks are recursive.
    const auto shallow = [&file](int depth, Json::parse_event_t, Json &) {
        if (depth > kDeepest)
            throw Failure(Exit::input,
                          file + ": found lists in lists without end, expected at most " + std::to_string(kDeepest) + " levels");
        return true;
    };
    try {
        return Json::parse(text.begin(), text.end(), shallow);
    } catch (const Json::parse_error &error) {
        const size_t at = std::min<size_t>(error.byte > 0 ? error.byte - 1 : 0, text.size());
        const auto line = 1 + std::count(text.begin(), text.begin() + static_cast<ptrdiff_t>(at), uint8_t{'\n'});
        throw Failure(Exit::input, file + ": line " + std::to_string(line) + ", byte " + std::to_string(at) +
                                       ": found what is no JSON, expected a document of vx preset; mend the text there");
    }
}

std::string hexText(std::span<const uint8_t> bytes) {
    std::string text;
    text.reserve(2 * bytes.size());
    for (const uint8_t byte : bytes) {
        text += "0123456789abcdef"[byte >> 4];
        text += "0123456789abcdef"[byte & 0xF];
    }
    return text;
}

void JsonAt::fail(const std::string &found, const std::string &expected) const {
    throw Failure(Exit::input, file_ + ": " + (path_.empty() ? "document" : path_) + ": found " + found + ", expected " + expected);
}

void JsonAt::expected(const std::string &what) const {
    fail(shown(*value_), what);
}

JsonAt JsonAt::at(const std::string &step, const Json &value) const {
    JsonAt place(file_, value);
    place.path_ = path_ + (path_.empty() && step.front() == '.' ? step.substr(1) : step);
    return place;
}

JsonAt JsonAt::member(const char *name) const {
    const std::optional<JsonAt> found = optional(name);
    if (!found) fail("no \"" + std::string(name) + "\"", "one");
    return *found;
}

std::optional<JsonAt> JsonAt::optional(const char *name) const {
    if (!value_->is_object()) expected("an object");
    const auto found = value_->find(name);
    if (found == value_->end()) return std::nullopt;
    return at(joined({".", name}), *found);
}

void JsonAt::only(std::initializer_list<const char *> names) const {
    if (!value_->is_object()) expected("an object");
    std::string known;
    for (const char *name : names) known += (known.empty() ? "" : ", ") + std::string(name);
    for (const auto &[name, ignored] : value_->items()) {
        if (std::find(names.begin(), names.end(), name) == names.end()) fail("\"" + name + "\"", "one of " + known);
    }
}

std::vector<JsonAt> JsonAt::items() const {
    if (!value_->is_array()) expected("a list");
    std::vector<JsonAt> list;
    for (size_t i = 0; i < value_->size(); ++i) list.push_back(at(joined({"[", std::to_string(i), "]"}), (*value_)[i]));
    return list;
}

int64_t JsonAt::number(int64_t low, int64_t high) const {
    const std::string range = "a whole number from " + std::to_string(low) + " to " + std::to_string(high);
    int64_t number = 0;
    if (value_->is_number_unsigned() && value_->get<uint64_t>() > static_cast<uint64_t>(INT64_MAX)) expected(range);
    if (value_->is_number_integer()) {
        number = value_->get<int64_t>();
    } else if (value_->is_string()) {
        const std::string text = value_->get<std::string>();
        const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
        const char *const end = text.data() + text.size();
        const auto [stop, error] = std::from_chars(text.data() + (hexadecimal ? 2 : 0), end, number, hexadecimal ? 16 : 10);
        if (error != std::errc() || stop != end) expected(range);
    } else {
        expected(range);
    }
    if (number < low || number > high) expected(range);
    return number;
}

float JsonAt::real() const {
    if (!value_->is_number()) expected("a number");
    const double number = value_->get<double>();
    if (std::isfinite(number) && std::fabs(number) > std::numeric_limits<float>::max()) expected("a number that fits 32-bit float");
    return static_cast<float>(number);
}

bool JsonAt::boolean() const {
    if (!value_->is_boolean()) expected("true or false");
    return value_->get<bool>();
}

std::string JsonAt::text() const {
    if (!value_->is_string()) expected("a text");
    return value_->get<std::string>();
}

std::vector<uint8_t> JsonAt::hex() const {
    const std::string digits = text();
    if (digits.size() % 2 != 0) fail(std::to_string(digits.size()) + " digits", "two hexadecimal digits a byte");
    std::vector<uint8_t> bytes(digits.size() / 2);
    for (size_t i = 0; i < digits.size(); ++i) {
        const int digit = digitOf(digits[i]);
        if (digit < 0) fail(joined({"'", digits.substr(i, 1), "' at digit ", std::to_string(i)}), "hexadecimal digits");
        bytes[i / 2] = static_cast<uint8_t>(bytes[i / 2] << 4 | digit);
    }
    return bytes;
}

}  // namespace vx::preset
