// SPDX-License-Identifier: MIT
//
// The process's half of the store: its one connection, and what to do with a damaged file.
#include "platform/posix/registry_store.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <memory>
#include <mutex>
#include <new>
#include <optional>

#include <fcntl.h>
#include <pthread.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/debug_output.h"
#include "platform/environment.h"
#include "platform/posix/descriptor.h"
#include "platform/posix/machine_root.h"
#include "platform/posix/open_to_all.h"
#include "platform/posix/system_status.h"

namespace vxcomn {
namespace {

constexpr const char *kFileName = "/registry.db";
constexpr const char *kLockName = "/registry.lock";
// The file and what SQLite keeps beside it.
constexpr std::array<const char *, 4> kParts = {"", "-wal", "-shm", "-journal"};

// Both without a destructor, so that whatever runs at the end of the process still finds them.
std::mutex storeMutex;
StoreConnection *connection = nullptr;
bool forkIsWatched = false;
// The connection, for a thread that is inside of a OneWrite and so holds the mutex already.
thread_local StoreConnection *ownConnection = nullptr;

void closeConnection() {
    if (connection != nullptr && !connection->inPlace()) connection->leaveFilesAlone();
    delete connection;
    connection = nullptr;
}

// SQLite's locks do not pass to the child of a fork although its records of them do. So the connection is closed ahead of every
// fork, and both sides open one of their own when they next need it.
void watchForks() {
    if (forkIsWatched) return;
    forkIsWatched = pthread_atfork(
                        [] {
                            storeMutex.lock();
                            closeConnection();
                        },
                        [] { storeMutex.unlock(); },
                        [] {
                            Status ignored;
                            if (ChangeTable *const table = ChangeTable::get(ignored)) table->forgetMark();
                            storeMutex.unlock();
                        }) == 0;
}

[[gnu::destructor]] void closeAtUnload() {
    const std::lock_guard lock(storeMutex);
    closeConnection();
}

std::optional<struct stat> look(const std::string &path) {
    struct stat info;
    if (stat(path.c_str(), &info) != 0) return std::nullopt;
    return info;
}

// Held while the file is opened, made or set aside; goes with the process that holds it.
class FileLock {
  public:
    explicit FileLock(const std::string &path) : file_(openForAll(path)) {
        if (!file_) return;
        while (flock(file_.get(), LOCK_EX) != 0) {
            if (errno != EINTR) {
                file_.reset();
                return;
            }
        }
    }
    explicit operator bool() const { return static_cast<bool>(file_); }

  private:
    Descriptor file_;
};

// To whoever looks after the machine: always to the standard error stream, and to the debug output if that is elsewhere.
void tell(const std::string &message) {
    std::fprintf(stderr, "%s\n", message.c_str());
    if (environmentVariable("VXCOMN_DEBUG_OUTPUT").value_or("stderr") != "stderr") debugOutput(message);
}

// Renames what there is of the file to registry.db.damaged-N. The lock must be held.
void setAside(const std::string &path, const char *reason) {
    std::string aside;
    const auto taken = [&aside] {
        for (const char *part : kParts) {
            if (look(aside + part)) return true;
        }
        return false;
    };
    for (int number = 1;; ++number) {
        aside = path + ".damaged-" + std::to_string(number);
        if (!taken()) break;
    }
    for (const char *part : kParts) {
        if (!look(path + part)) continue;
        if (rename((path + part).c_str(), (aside + part).c_str()) != 0) throw StoreError{SQLITE_READONLY};
    }
    // Who watches a key of that file has to look for it anew.
    Status ignored;
    if (ChangeTable *const table = ChangeTable::get(ignored)) table->publishEverything();
    tell("registry: " + path + " is damaged (" + reason + "); it was set aside as " + aside + " and a fresh one begun");
}

// The statements are ours and fixed, so a table that is not there or a row that is there twice can only mean a damaged file. A file
// that cannot be written although it may be says so in its first bytes, which then are wrong.
bool meansDamage(int result, const std::string &path) {
    switch (result & 0xFF) {
        case SQLITE_CORRUPT:
        case SQLITE_NOTADB:
        case SQLITE_FORMAT:
        case SQLITE_ERROR:
        case SQLITE_CONSTRAINT:
        case SQLITE_MISMATCH:
            return true;
        case SQLITE_READONLY:
            return result == SQLITE_READONLY && access(path.c_str(), W_OK) == 0;
        default:
            return false;
    }
}

// Opens the file; one that is damaged, which two attempts must agree on, is set aside first. The lock must be held.
std::unique_ptr<StoreConnection> openWhole(const std::string &path) {
    const auto file = look(path), journal = look(path + "-wal");
    if ((!file || file->st_size == 0) && journal && journal->st_size > 0) setAside(path, "there is only its journal");
    for (const bool isSecond : {false, true}) {
        try {
            return std::make_unique<StoreConnection>(path);
        } catch (const StoreError &error) {
            if (!meansDamage(error.result, path)) throw;
            if (isSecond) setAside(path, sqlite3_errstr(error.result));
        }
    }
    return std::make_unique<StoreConnection>(path);
}

class Store {
  public:
    Status prepare() {
        std::string root;
        if (const Status status = machineRoot(root); status != status::ok) return status;
        path_ = root + kFileName, lockPath_ = root + kLockName;
        return status::ok;
    }

    StoreConnection &current() {
        if (connection != nullptr && connection->inPlace()) return *connection;
        closeConnection();
        watchForks();
        const FileLock lock(lockPath_);
        if (!lock) throw StoreError{SQLITE_CANTOPEN};
        connection = openWhole(path_).release();
        return *connection;
    }

    // After a statement's error. True if it is worth to try again, on a connection made anew or, the second time, a fresh file: a
    // file that could not be opened or read for a moment may look damaged, too, and would be lost.
    bool replace(int result) {
        if (!meansDamage(result, path_)) return false;
        const FileLock lock(lockPath_);
        if (!lock) return false;
        // Another process may have met the same damage and been faster.
        const bool ours = connection != nullptr && connection->inPlace();
        if (connection != nullptr) connection->leaveFilesAlone();
        closeConnection();
        if (ours && suspected_) setAside(path_, sqlite3_errstr(result));
        suspected_ = true;
        return true;
    }

  private:
    bool suspected_ = false;
    std::string path_, lockPath_;
};

// The mark of a write (change_table.h), for a scope.
class WriteMark {
  public:
    explicit WriteMark(ChangeTable *table) noexcept : table_(table) {
        if (table_ != nullptr) table_->beginWrite();
    }
    ~WriteMark() {
        if (table_ != nullptr) table_->endWrite();
    }
    WriteMark(const WriteMark &) = delete;
    WriteMark &operator=(const WriteMark &) = delete;

  private:
    ChangeTable *const table_;
};

Status attempt(Store &store, bool writes, StoreTask &task, bool &again) {
    again = false;
    // Without the table a write holds all the same; there can be no watchers then either.
    Status noTable;
    ChangeTable *const table = writes ? ChangeTable::get(noTable) : nullptr;
    const WriteMark mark(table);
    try {
        StoreConnection &current = store.current();
        current.forgetChanges();
        const Status status = task(current);
        if (table != nullptr) current.publishChanges(*table);
        // Set aside under our hands: what was written went with it.
        again = writes && !current.inPlace();
        return again ? status::badDb : status;
    } catch (const StoreError &error) {
        // What was noted may hold in spite of the error; telling it once too often does no harm.
        if (table != nullptr && connection != nullptr) connection->publishChanges(*table);
        again = store.replace(error.result);
        return statusOfSqlite(error.result);
    } catch (const std::bad_alloc &) {
        // It may not even have been noted.
        if (table != nullptr) table->publishEverything();
        throw;
    }
}

// A call inside of a OneWrite.
Status runInside(StoreConnection &store, StoreTask &task) {
    OneWrite &write = *store.oneWrite();
    if (write.failure != SQLITE_OK) return statusOfSqlite(write.failure);
    try {
        return task(store);
    } catch (const StoreError &error) {
        write.failure = error.result;
    } catch (const std::bad_alloc &) {
        write.failure = SQLITE_NOMEM;
    }
    return statusOfSqlite(write.failure);
}

// Runs the work as one transaction; false if it has to be done again.
bool writeOnce(StoreConnection &store, bool trust, const std::function<Status()> &work, Status &status) {
    struct Inside {
        explicit Inside(StoreConnection &own, OneWrite &write) : store(own) {
            store.setOneWrite(&write);
            ownConnection = &store;
        }
        ~Inside() {
            ownConnection = nullptr;
            store.setOneWrite(nullptr);
        }
        StoreConnection &store;
    };
    StoreTransaction transaction(store);
    OneWrite write = {.trust = trust};
    {
        const Inside inside(store, write);
        status = work();
    }
    if (write.failure != SQLITE_OK) throw StoreError{write.failure};
    if (write.stale) return false;
    transaction.commit();
    return true;
}

}  // namespace

Status inOneWrite(const std::function<Status()> &work) {
    if (ownConnection != nullptr) return work();
    return runInStore(true, [&work](StoreConnection &store) {
        Status status = status::ok;
        if (!writeOnce(store, true, work, status)) writeOnce(store, false, work, status);
        return status;
    });
}

Status runInStore(bool writes, StoreTask &task) noexcept {
    constexpr int kAttempts = 4;
    try {
        if (ownConnection != nullptr) return runInside(*ownConnection, task);
        const std::lock_guard lock(storeMutex);
        Store store;
        Status status = store.prepare();
        bool again = status == status::ok;
        for (int i = 0; again && i < kAttempts; ++i) status = attempt(store, writes, task, again);
        return status;
    } catch (const StoreError &error) {
        return statusOfSqlite(error.result);
    } catch (const std::bad_alloc &) {
        return status::notEnoughMemory;
    }
}

}  // namespace vxcomn
