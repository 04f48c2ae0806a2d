// SPDX-License-Identifier: MIT
//
// What differs between two presets or packages, as lines of path, left and right; and what one holds, as rows.
#pragma once

#include <string>
#include <vector>

#include "tools/vx_preset/files.h"
#include "tools/vx_preset/json_at.h"

namespace vx::preset {

struct Difference {
    std::string where;
    std::string left;   // empty: not there
    std::string right;  // the same
};

// Both of one kind. Presets that load alike but have other bytes differ in their layout.
std::vector<Difference> differencesOf(const std::string &leftFile, const Bytes &left, const std::string &rightFile,
                                      const Bytes &right);

// What `list` shows: a document for --json, and the same as aligned text.
Json listing(const std::string &file, const Bytes &bytes);
std::string listingText(const Json &listing);

}  // namespace vx::preset
