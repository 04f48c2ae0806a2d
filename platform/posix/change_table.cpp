// SPDX-License-Identifier: MIT
#include "platform/posix/change_table.h"

#include <cerrno>
#include <mutex>
#include <new>
#include <string>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/posix/machine_root.h"
#include "platform/posix/open_to_all.h"
#include "platform/posix/system_status.h"

namespace vxcomn {
namespace {

constexpr off_t kLockedBytes = off_t{1} << 30;  // far behind the content; the lock of mark n is byte n from here

struct flock markLock(short type, int mark) noexcept {
    struct flock lock = {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    lock.l_start = kLockedBytes + mark;
    lock.l_len = 1;
    return lock;
}

void signal(ChangeTable::Slot &slot) noexcept {
    slot.generation.fetch_add(1);
    if (slot.waiting.load() != 0 && slot.waiting.exchange(0) != 0) wakeAll(&slot.generation, true);
}

}  // namespace

ChangeTable *ChangeTable::get(Status &why) noexcept {
    static std::mutex mutex;
    static ChangeTable *made = nullptr;
    const std::lock_guard lock(mutex);
    why = status::ok;
    if (made != nullptr) return made;
    try {
        std::string path;
        if (why = machineRoot(path); why != status::ok) return nullptr;
        path += "/signals";
        Descriptor file = openForAll(path);
        struct stat info;
        if (!file || fstat(file.get(), &info) != 0) {
            why = statusOfErrno(errno);
            return nullptr;
        }
        // A fresh file is all zeros, which is its beginning. Room on the disk now, since a mapped page that finds none ends the
        // process.
        if (info.st_size < static_cast<off_t>(sizeof(Page)) && posix_fallocate(file.get(), 0, sizeof(Page)) != 0) {
            why = status::diskFull;
            return nullptr;
        }
        void *mapped = mmap(nullptr, sizeof(Page), PROT_READ | PROT_WRITE, MAP_SHARED, file.get(), 0);
        if (mapped == MAP_FAILED) {
            why = statusOfErrno(errno);
            return nullptr;
        }
        made = new ChangeTable(std::move(file), static_cast<Page *>(mapped));
    } catch (const std::bad_alloc &) {
        why = status::notEnoughMemory;
    }
    return made;
}

ChangeTable::Slot &ChangeTable::slot(int64_t key, ChangeKind kind) noexcept {
    return page_->slots[(static_cast<uint64_t>(key) * 4 + static_cast<uint64_t>(kind)) % kSlots];
}

void ChangeTable::publish(std::span<const int64_t> keys, ChangeKind kind) noexcept {
    for (const int64_t key : keys) {
        if (kind == ChangeKind::gone) signal(slot(key, ChangeKind::gone));
        if (kind != ChangeKind::keys) signal(slot(key, ChangeKind::values));
        signal(slot(key, ChangeKind::keys));
    }
}

void ChangeTable::publishEverything() noexcept {
    for (Slot &each : page_->slots) signal(each);
}

bool ChangeTable::takeMark() noexcept {
    if (mark_ >= 0) return true;
    if (!markFile_) {
        // Its own open file, so that the lock is not shared with anybody who looks at it.
        markFile_.reset(::open(("/proc/self/fd/" + std::to_string(file_.get())).c_str(), O_RDWR | O_CLOEXEC));
        if (!markFile_) return false;
    }
    for (int i = 0; i < static_cast<int>(kMarks); ++i) {
        const int mark = (getpid() + i) % static_cast<int>(kMarks);
        struct flock lock = markLock(F_WRLCK, mark);
        if (fcntl(markFile_.get(), F_OFD_SETLK, &lock) != 0) continue;
        mark_ = mark;
        if (page_->marks[mark].load() != 0) publishEverything();
        page_->marks[mark].store(0);
        return true;
    }
    return false;
}

void ChangeTable::beginWrite() noexcept {
    if (takeMark()) page_->marks[mark_].store(static_cast<uint32_t>(getpid()));
}

void ChangeTable::endWrite() noexcept {
    if (mark_ >= 0) page_->marks[mark_].store(0);
}

void ChangeTable::finishForTheDead() noexcept {
    for (int i = 0; i < static_cast<int>(kMarks); ++i) {
        uint32_t process = page_->marks[i].load();
        if (process == 0) continue;
        struct flock lock = markLock(F_WRLCK, i);
        if (fcntl(file_.get(), F_OFD_GETLK, &lock) != 0 || lock.l_type != F_UNLCK) continue;
        publishEverything();
        page_->marks[i].compare_exchange_strong(process, 0);
    }
}

void ChangeTable::forgetMark() noexcept {
    markFile_.reset();
    mark_ = -1;
}

}  // namespace vxcomn
