// SPDX-License-Identifier: MIT
#include "platform/posix/system_status.h"

#include <doctest/doctest.h>

#include <cerrno>
#include <set>

#include <sqlite3.h>

using namespace vxcomn;
using Numbers = std::set<int>;

namespace {

// The way back: the native numbers that come out as one status.
Numbers nativesOf(std::span<const StatusPair> table, Status status) {
    Numbers natives;
    for (const StatusPair &pair : table) {
        if (pair.status == status) natives.insert(pair.native);
    }
    return natives;
}

}  // namespace

TEST_CASE("the system's error numbers become Windows' and each of those comes from the right ones") {
    struct Row {
        Status status;
        Numbers natives;
    };
    const Row rows[] = {
        {0, {0}},
        {2, {ENOENT}},
        {3, {ENOTDIR}},
        {5, {EACCES, EPERM, EROFS, EISDIR}},
        {6, {EBADF}},
        {8, {ENOMEM}},
        {31, {EIO}},
        {32, {EBUSY, ETXTBSY}},
        {50, {ENOTSUP, ENOSYS}},
        {87, {EINVAL, ENAMETOOLONG, ELOOP}},
        {112, {ENOSPC, EDQUOT}},
        {122, {ERANGE}},
        {193, {ENOEXEC}},
    };
    size_t covered = 0;
    for (const Row &row : rows) {
        CHECK(nativesOf(errnoStatuses(), row.status) == row.natives);
        for (const int native : row.natives) CHECK(statusOfErrno(native) == row.status);
        covered += row.natives.size();
    }
    CHECK(covered == errnoStatuses().size());
    CHECK(statusOfErrno(99999) == 31);
}

TEST_CASE("SQLite's results become Windows' numbers and each of those comes from the right ones") {
    struct Row {
        Status status;
        Numbers natives;
    };
    const Row rows[] = {
        {0, {SQLITE_OK, SQLITE_ROW, SQLITE_DONE}},
        {5, {SQLITE_PERM, SQLITE_READONLY, SQLITE_CANTOPEN, SQLITE_AUTH}},
        {8, {SQLITE_NOMEM}},
        {31, {SQLITE_IOERR}},
        {32, {SQLITE_BUSY, SQLITE_LOCKED, SQLITE_PROTOCOL}},
        {87, {SQLITE_TOOBIG}},
        {112, {SQLITE_FULL}},
        {1009, {SQLITE_CORRUPT, SQLITE_NOTADB}},
    };
    size_t covered = 0;
    for (const Row &row : rows) {
        CHECK(nativesOf(sqliteStatuses(), row.status) == row.natives);
        for (const int native : row.natives) CHECK(statusOfSqlite(native) == row.status);
        covered += row.natives.size();
    }
    CHECK(covered == sqliteStatuses().size());
    CHECK(statusOfSqlite(SQLITE_BUSY_SNAPSHOT) == 32);  // an extended code counts as its primary one
    CHECK(statusOfSqlite(SQLITE_INTERNAL) == 31);
}
