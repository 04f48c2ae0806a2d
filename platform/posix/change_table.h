// SPDX-License-Identifier: MIT
//
// How processes tell each other that the registry changed: the machine folder's file `signals`, mapped by all. It has a slot for
// each key, by its number; a write adds 1 to the slots of its key and of all keys above, behind its commit, and wakes those who
// sleep on one. Numbers of keys that are alike modulo the count of slots share a slot, which at worst signals once too often.
//
// A writer that is killed between its commit and its wake would leave sleepers unaware. So each process that writes marks itself
// before the commit, in a word of its own beside which it holds a lock; whoever sleeps looks at the marks ten times a second, and
// signals everything once for a mark whose process is gone.
//
// Turned down: inotify on the database, which tells of the write ahead of the commit and of every other key's writes too.
#pragma once

#include <atomic>
#include <cstdint>
#include <span>

#include "platform/posix/descriptor.h"
#include "platform/posix/wait_object.h"
#include "platform/status.h"

namespace vxcomn {

// What happened, and the slot of each key for those who wait for that. `values` also signals who watches keys and values, who waits
// in the slot of `keys`; `gone` (the key itself is deleted) signals all.
enum class ChangeKind : uint8_t { values, keys, gone };

class ChangeTable {
  public:
    struct Slot {
        std::atomic<uint32_t> generation;  // counts changes
        std::atomic<uint32_t> waiting;     // 1: somebody sleeps on it, or is about to; taken back by who wakes
    };

    // The process's one, which stays for its life; null, with the reason in `why`, as long as the file cannot be had.
    static ChangeTable *get(Status &why) noexcept;

    Slot &slot(int64_t key, ChangeKind kind) noexcept;
    // Signals the watchers of all these keys.
    void publish(std::span<const int64_t> keys, ChangeKind kind) noexcept;
    void publishEverything() noexcept;

    // Around each write, from before its commit to behind its publication. One write at a time in a process.
    void beginWrite() noexcept;
    void endWrite() noexcept;

    // The last number that uniqueCounter (unique_counter.h) gave.
    std::atomic<uint64_t> &lastNumber() noexcept { return page_->lastNumber; }

    // Does for writers that died in the middle what they left undone.
    void finishForTheDead() noexcept;
    // In the child of a fork: the mark is the parent's.
    void forgetMark() noexcept;

  private:
    static constexpr size_t kSlots = 32768, kMarks = 1024;
    struct Page {
        std::atomic<uint32_t> marks[kMarks];  // 0, or the number of the process that is inside a write
        Slot slots[kSlots];
        std::atomic<uint64_t> lastNumber;
    };

    ChangeTable(Descriptor file, Page *page) noexcept : file_(std::move(file)), page_(page) {}
    bool takeMark() noexcept;

    Descriptor file_;  // for looking at others' locks
    Page *const page_;
    Descriptor markFile_;  // holds the lock of our mark
    int mark_ = -1;
};

}  // namespace vxcomn
