// SPDX-License-Identifier: MIT
//
// Translates the system's and SQLite's error numbers into status numbers, by table; what is in neither table is genFailure.
#pragma once

#include <span>

#include "platform/status.h"

namespace vxcomn {

struct StatusPair {
    int native;
    Status status;
};

// The tables themselves, for those who go the other way.
std::span<const StatusPair> errnoStatuses() noexcept;
std::span<const StatusPair> sqliteStatuses() noexcept;

Status statusOfErrno(int error) noexcept;
Status statusOfSqlite(int result) noexcept;  // of a primary or an extended result code

}  // namespace vxcomn
