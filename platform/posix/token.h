// SPDX-License-Identifier: MIT
//
// Tokens: the files in the machine folder's `tokens` behind named mutexes (named_mutex.h). Every process that holds the name has a
// shared lock on byte 0 of the file, and the owner an exclusive one on byte 1. The kernel takes both away from a process that dies,
// so neither can be left behind; a file that nobody holds is as good as none, and is removed by whoever meets it. Who waits sleeps
// on a word of the mapped file. A dead owner wakes nobody, so sleepers look again every kCareMilliseconds.
//
// Turned down: the C library's robust mutexes in shared memory. They keep pointers there, which another user could bend.
//
// One Token a name and process, shared by all its handles. Any control thread.
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>

#include "platform/named_mutex.h"
#include "platform/posix/descriptor.h"

namespace vxcomn {

class Token : public std::enable_shared_from_this<Token> {
  public:
    enum class Open : uint8_t { existing, makeFree, makeOwned };

    // Opens the token of a name. `created` tells whether nobody held it before.
    static Status open(WideView name, Open how, std::shared_ptr<Token> &token, bool &created);
    static bool exists(WideView name);

    Token(std::string path, std::string guardPath) : path_(std::move(path)), guardPath_(std::move(guardPath)) {}
    ~Token();
    Token(const Token &) = delete;
    Token &operator=(const Token &) = delete;

    MutexWait acquire(uint32_t milliseconds) noexcept;
    Status release() noexcept;

    // The calling thread ends: what it owns is free, and known to be abandoned.
    void abandon() noexcept;
    // In the child of a fork: the name is the parent's.
    void forget() noexcept { file_.reset(); }

  private:
    // The file, mapped. Whatever somebody writes into it can make a waiter look once more, or take a release for an abandonment.
    struct Page {
        std::atomic<uint32_t> owned;       // owner: 1 before use, 0 ahead of a release. Who finds 1 follows a dead owner
        std::atomic<uint32_t> generation;  // counts releases; waiters sleep on it
        std::atomic<uint32_t> waiting;     // 1: somebody sleeps, or is about to
    };

    Status openFile(Open how, bool &created);
    MutexWait tryAcquire() noexcept;
    void letGo() noexcept;

    const std::string path_, guardPath_;
    Descriptor file_;
    Page *page_ = nullptr;
    std::mutex mutex_;  // guards the two below
    uint32_t owner_ = 0;
    int depth_ = 0;
};

}  // namespace vxcomn
