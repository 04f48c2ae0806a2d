// SPDX-License-Identifier: MIT
//
// A place in a JSON document with the path that leads to it, for reading documents that people write: every wrong type, range or
// unknown name ends in a Failure that names file, path, what was found and what was expected.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <nlohmann/json.hpp>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace vx::preset {

using Json = nlohmann::ordered_json;

// Parses a document; the failure names line and column.
Json parseJson(const std::string &file, std::span<const uint8_t> text);

// Bytes as two small hexadecimal digits each.
std::string hexText(std::span<const uint8_t> bytes);

class JsonAt {
  public:
    JsonAt(std::string file, const Json &value) : file_(std::move(file)), value_(&value) {}

    // An object's members. `only` refuses names that mean nothing here.
    JsonAt member(const char *name) const;
    std::optional<JsonAt> optional(const char *name) const;
    void only(std::initializer_list<const char *> names) const;
    bool has(const char *name) const { return value_->is_object() && value_->contains(name); }

    std::vector<JsonAt> items() const;

    // Numbers are JSON numbers or texts such as "0x1000010".
    int64_t number(int64_t low, int64_t high) const;
    uint32_t u32() const { return static_cast<uint32_t>(number(0, UINT32_MAX)); }
    int32_t i32() const { return static_cast<int32_t>(number(INT32_MIN, INT32_MAX)); }
    float real() const;
    bool boolean() const;
    std::string text() const;
    std::vector<uint8_t> hex() const;

    const Json &json() const { return *value_; }
    const std::string &file() const { return file_; }

    [[noreturn]] void fail(const std::string &found, const std::string &expected) const;
    [[noreturn]] void expected(const std::string &what) const;

  private:
    JsonAt at(const std::string &step, const Json &value) const;

    std::string file_;
    std::string path_;
    const Json *value_;
};

}  // namespace vx::preset
