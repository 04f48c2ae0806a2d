// SPDX-License-Identifier: MIT
//
// The store behind the registry: `registry.db` in the machine folder, an SQLite file in write-ahead mode. registry.cpp says what is
// asked of it; this file keeps the process's one connection, finds out whether the file is whole, and sets a damaged one aside.
// Control threads; one at a time is inside.
//
// A commit is in the kernel's hands when it returns, so a process that is killed loses nothing; a machine that loses power may lose
// the last commits but not the file. Any number of processes write at once: each waits its turn. Turned down: one file a key, where
// a tree cannot be deleted in one piece; a service that owns the store, which somebody would have to keep alive.
//
// A damaged file is renamed to registry.db.damaged-N, with its journals, under the lock of the file registry.lock, and a fresh one
// begun. Other processes notice at their next statement that their file is no longer in place, and a write counts only if it still
// was in place after the commit.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include <sqlite3.h>
#include <sys/types.h>

#include "platform/posix/change_table.h"
#include "platform/posix/registry_key.h"
#include "platform/posix/registry_key_cache.h"
#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// What SQLite said to a statement. Thrown inside the store only.
struct StoreError {
    int result;
};

enum class Query : uint8_t {
    begin,
    commit,
    rollback,
    findKey,
    keyExists,
    addKey,
    listKeys,
    hasKeysBelow,
    readValue,
    writeValue,
    overwriteValue,
    deleteValue,
    listValues,
    listEntries,
    listSubkeys,
    deleteValuesOfTree,
    deleteKeysOfTree,
    listTree,
    count
};

// One run of a prepared statement; ready for the next run when it goes out of scope. Arguments count from 1, columns from 0. What
// is bound must outlive the run.
class Statement {
  public:
    explicit Statement(sqlite3_stmt *statement) noexcept : statement_(statement) {}
    ~Statement();
    Statement(const Statement &) = delete;
    Statement &operator=(const Statement &) = delete;

    Statement &bind(int argument, int64_t number);
    Statement &bind(int argument, WideView text);
    Statement &bind(int argument, std::span<const uint8_t> bytes);

    bool next();  // true while there is a row
    void run() {
        while (next()) {
        }
    }

    bool isNull(int column) const;
    int64_t number(int column) const;
    WideString text(int column) const;
    std::span<const uint8_t> bytes(int column) const;  // until the next call

  private:
    sqlite3_stmt *statement_;
};

// The write that the calling thread is inside of (inOneWrite).
struct OneWrite {
    // Keys that are known from before are taken as they are, and `stale` tells that one of them proved to be gone. Then all is done
    // again without trust.
    bool trust;
    bool stale = false;
    int failure = SQLITE_OK;  // what SQLite said first; nothing is tried any more then
};

// How often the store was asked and how often it was written to, since the process began. For tests and benchmarks.
struct StoreCounts {
    uint64_t statements, commits;
};
StoreCounts storeCounts() noexcept;

// One open registry.db.
class StoreConnection {
  public:
    // Opens the file, which is made where it is missing. The lock of registry.lock must be held.
    explicit StoreConnection(const std::string &path);
    ~StoreConnection();
    StoreConnection(const StoreConnection &) = delete;
    StoreConnection &operator=(const StoreConnection &) = delete;

    Statement operator()(Query query);
    int64_t changes() const { return sqlite3_changes(database_); }
    int64_t lastKey() const { return sqlite3_last_insert_rowid(database_); }

    // A random number that this file was given when it was made. Ids of keys count only together with it.
    int64_t identity() const { return identity_; }

    // What a task has written, so that it is told when the task has returned; a key that is noted again and again is told once.
    void noteChange(std::span<const int64_t> keys, ChangeKind kind) {
        std::vector<int64_t> &changed = changed_[static_cast<int>(kind)];
        changed.insert(changed.end(), keys.begin(), keys.end());
    }
    void forgetChanges() noexcept {
        for (std::vector<int64_t> &changed : changed_) changed.clear();
    }
    void publishChanges(ChangeTable &table) noexcept;

    KeyCache &keys() noexcept { return keys_; }
    OneWrite *oneWrite() const noexcept { return oneWrite_; }
    void setOneWrite(OneWrite *write) noexcept { oneWrite_ = write; }

    // Whether the file still is the one at the path. One look at the folder.
    bool inPlace() const;
    // Closing shall leave all files alone, since they are not, or not for long, this connection's own.
    void leaveFilesAlone();

  private:
    void open();
    void makeTables();
    void execute(const char *sql);
    int64_t askNumber(const char *sql);
    void close();

    std::string path_;
    std::vector<int64_t> changed_[3];  // by ChangeKind
    KeyCache keys_;
    OneWrite *oneWrite_ = nullptr;
    sqlite3 *database_ = nullptr;
    sqlite3_stmt *statements_[static_cast<int>(Query::count)] = {};
    int64_t identity_ = 0;
    dev_t device_ = 0;
    ino_t file_ = 0;
};

// A write of several statements: all of them hold, or none. Inside a OneWrite it is a part of that.
class StoreTransaction {
  public:
    explicit StoreTransaction(StoreConnection &connection);
    ~StoreTransaction();
    StoreTransaction(const StoreTransaction &) = delete;
    StoreTransaction &operator=(const StoreTransaction &) = delete;
    void commit();

  private:
    StoreConnection &connection_;
    bool open_;
};

// Runs `task` on the process's connection, again on a fresh file if this one proves to be damaged. With `writes`, the task's writes
// have returned for good when this returns.
class StoreTask {
  public:
    virtual Status operator()(StoreConnection &store) = 0;

  protected:
    ~StoreTask() = default;
};
Status runInStore(bool writes, StoreTask &task) noexcept;

template <class Body>
Status runInStore(bool writes, Body body) noexcept {
    struct Task final : StoreTask {
        explicit Task(Body &wrapped) : body(wrapped) {}
        Status operator()(StoreConnection &store) override { return body(store); }
        Body &body;
    } task(body);
    return runInStore(writes, static_cast<StoreTask &>(task));
}

}  // namespace vxcomn
