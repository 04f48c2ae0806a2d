// SPDX-License-Identifier: MIT
#include "tests/fault/posix/faults.h"

#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <initializer_list>
#include <new>

#include <fcntl.h>
#include <signal.h>
#include <sqlite3.h>
#include <sys/mman.h>
#include <sys/types.h>
#include <unistd.h>

namespace {

struct Plan {
    bool armed = false, happened = false;
    test::FaultKind kind = test::FaultKind::allocation;
    test::FaultEffect effect = test::FaultEffect::failure;
    int left = 0;
} plan;

bool fails(test::FaultKind kind) {
    if (!plan.armed || plan.kind != kind || --plan.left != 0) return false;
    if (plan.effect == test::FaultEffect::death) kill(getpid(), SIGKILL);
    plan.happened = true;
    return true;
}

void *allocate(size_t size) {
    if (fails(test::FaultKind::allocation)) return nullptr;
    return std::malloc(size != 0 ? size : 1);
}

sqlite3_mem_methods ownMemory;

void *storeMalloc(int size) {
    return fails(test::FaultKind::storeMemory) ? nullptr : ownMemory.xMalloc(size);
}
void *storeRealloc(void *block, int size) {
    return fails(test::FaultKind::storeMemory) ? nullptr : ownMemory.xRealloc(block, size);
}

// -1 with an error number, as the call itself fails.
bool fileFails(int error) {
    if (!fails(test::FaultKind::storeFile)) return false;
    errno = error;
    return true;
}

int storeOpen(const char *path, int flags, int mode) {
    return fileFails(EMFILE) ? -1 : open(path, flags | O_CLOEXEC, mode);
}
ssize_t storeRead(int file, void *to, size_t count, off_t offset) {
    return fileFails(EIO) ? -1 : pread(file, to, count, offset);
}
ssize_t storeWrite(int file, const void *from, size_t count, off_t offset) {
    return fileFails(ENOSPC) ? -1 : pwrite(file, from, count, offset);
}
int storeTruncate(int file, off_t size) {
    return fileFails(EIO) ? -1 : ftruncate(file, size);
}
void *storeMap(void *at, size_t size, int protection, int flags, int file, off_t offset) {
    return fileFails(ENOMEM) ? MAP_FAILED : mmap(at, size, protection, flags, file, offset);
}
int storeLock(int file, int command, ...) {
    va_list list;
    va_start(list, command);
    void *const argument = va_arg(list, void *);
    va_end(list);
    const bool takes = command == F_SETLK && static_cast<struct flock *>(argument)->l_type != F_UNLCK;
    return takes && fileFails(ENOLCK) ? -1 : fcntl(file, command, argument);
}

template <class Function>
void replace(sqlite3_vfs *files, const char *name, Function function) {
    files->xSetSystemCall(files, name, reinterpret_cast<sqlite3_syscall_ptr>(function));
}

// Ahead of whatever uses SQLite first.
[[gnu::constructor]] void takeHold() {
    sqlite3_config(SQLITE_CONFIG_GETMALLOC, &ownMemory);
    sqlite3_mem_methods failing = ownMemory;
    failing.xMalloc = storeMalloc;
    failing.xRealloc = storeRealloc;
    sqlite3_config(SQLITE_CONFIG_MALLOC, &failing);
    sqlite3_vfs *const files = sqlite3_vfs_find(nullptr);
    replace(files, "open", storeOpen);
    for (const char *name : {"pread", "pread64"}) replace(files, name, storeRead);
    for (const char *name : {"pwrite", "pwrite64"}) replace(files, name, storeWrite);
    replace(files, "ftruncate", storeTruncate);
    replace(files, "mmap", storeMap);
    replace(files, "fcntl", storeLock);
}

}  // namespace

namespace test {

void armFault(FaultKind kind, int n, FaultEffect effect) {
    plan = {true, false, kind, effect, n};
}

bool disarmFault() {
    plan.armed = false;
    return plan.happened;
}

}  // namespace test

// The linker sends the program's own calls here (--wrap).
extern "C" {
int __real_sqlite3_step(sqlite3_stmt *statement);
int __wrap_sqlite3_step(sqlite3_stmt *statement) {
    return fails(test::FaultKind::statement) ? SQLITE_FULL : __real_sqlite3_step(statement);
}
ssize_t __real_pread(int file, void *to, size_t count, off_t offset);
ssize_t __wrap_pread(int file, void *to, size_t count, off_t offset) {
    if (fails(test::FaultKind::file)) return errno = EIO, -1;
    return __real_pread(file, to, count, offset);
}
ssize_t __real_pwrite(int file, const void *from, size_t count, off_t offset);
ssize_t __wrap_pwrite(int file, const void *from, size_t count, off_t offset) {
    if (fails(test::FaultKind::file)) return errno = ENOSPC, -1;
    return __real_pwrite(file, from, count, offset);
}
int __real_open(const char *path, int flags, ...);
int __wrap_open(const char *path, int flags, ...) {
    va_list list;
    va_start(list, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? static_cast<mode_t>(va_arg(list, int)) : 0;
    va_end(list);
    if (fails(test::FaultKind::file)) return errno = EMFILE, -1;
    return __real_open(path, flags, mode);
}
}

void *operator new(size_t size) {
    if (void *const block = allocate(size)) return block;
    throw std::bad_alloc();
}
void *operator new[](size_t size) {
    if (void *const block = allocate(size)) return block;
    throw std::bad_alloc();
}
void *operator new(size_t size, const std::nothrow_t &) noexcept {
    return allocate(size);
}
void *operator new[](size_t size, const std::nothrow_t &) noexcept {
    return allocate(size);
}
void operator delete(void *block) noexcept {
    std::free(block);
}
void operator delete[](void *block) noexcept {
    std::free(block);
}
void operator delete(void *block, size_t) noexcept {
    std::free(block);
}
void operator delete[](void *block, size_t) noexcept {
    std::free(block);
}
