// SPDX-License-Identifier: MIT
#include "platform/posix/system_status.h"

#include <cerrno>

#include <sqlite3.h>

namespace vxcomn {
namespace {

constexpr StatusPair kErrnoStatuses[] = {
    {0, status::ok},
    {ENOENT, status::fileNotFound},
    {ENOTDIR, status::pathNotFound},
    {EACCES, status::accessDenied},
    {EPERM, status::accessDenied},
    {EROFS, status::accessDenied},
    {EISDIR, status::accessDenied},
    {EBADF, status::invalidHandle},
    {ENOMEM, status::notEnoughMemory},
    {EIO, status::genFailure},
    {EBUSY, status::sharingViolation},
    {ETXTBSY, status::sharingViolation},
    {ENOTSUP, status::notSupported},
    {ENOSYS, status::notSupported},
    {EINVAL, status::invalidParameter},
    {ENAMETOOLONG, status::invalidParameter},
    {ELOOP, status::invalidParameter},
    {ENOSPC, status::diskFull},
    {EDQUOT, status::diskFull},
    {ERANGE, status::insufficientBuffer},
    {ENOEXEC, status::badExeFormat},
};

constexpr StatusPair kSqliteStatuses[] = {
    {SQLITE_OK, status::ok},
    {SQLITE_ROW, status::ok},
    {SQLITE_DONE, status::ok},
    {SQLITE_PERM, status::accessDenied},
    {SQLITE_READONLY, status::accessDenied},
    {SQLITE_CANTOPEN, status::accessDenied},
    {SQLITE_AUTH, status::accessDenied},
    {SQLITE_NOMEM, status::notEnoughMemory},
    {SQLITE_IOERR, status::genFailure},
    {SQLITE_BUSY, status::sharingViolation},
    {SQLITE_LOCKED, status::sharingViolation},
    {SQLITE_PROTOCOL, status::sharingViolation},
    {SQLITE_TOOBIG, status::invalidParameter},
    {SQLITE_FULL, status::diskFull},
    {SQLITE_CORRUPT, status::badDb},
    {SQLITE_NOTADB, status::badDb},
};

Status lookUp(std::span<const StatusPair> table, int native) noexcept {
    for (const StatusPair &pair : table) {
        if (pair.native == native) return pair.status;
    }
    return status::genFailure;
}

}  // namespace

std::span<const StatusPair> errnoStatuses() noexcept {
    return kErrnoStatuses;
}
std::span<const StatusPair> sqliteStatuses() noexcept {
    return kSqliteStatuses;
}

Status statusOfErrno(int error) noexcept {
    return lookUp(kErrnoStatuses, error);
}

// The lower byte of an extended code is its primary one.
Status statusOfSqlite(int result) noexcept {
    return lookUp(kSqliteStatuses, result & 0xFF);
}

}  // namespace vxcomn
