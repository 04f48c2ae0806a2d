// SPDX-License-Identifier: MIT
//
// The connection's half of the store: tables, prepared statements, and the file's identity.
#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <string>

#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/posix/open_to_all.h"
#include "platform/posix/registry_store.h"

namespace vxcomn {
namespace {

// Names are blobs of UTF-16, so that nothing in them is ever converted; the encoding lets `CAST(name AS TEXT)` read them by hand.
// `folded` is what names compare by. Keys are never given an id twice, so a handle to a deleted key cannot come to mean another.
// The four roots exist from the beginning, under the numbers of RegistryRoot plus 1.
constexpr const char *kTables = R"(
    CREATE TABLE store (identity INTEGER NOT NULL);
    CREATE TABLE keys (
        id INTEGER PRIMARY KEY AUTOINCREMENT, parent INTEGER NOT NULL, folded BLOB NOT NULL, name BLOB NOT NULL,
        UNIQUE (parent, folded));
    CREATE TABLE entries (
        id INTEGER PRIMARY KEY, key INTEGER NOT NULL, folded BLOB NOT NULL, name BLOB NOT NULL, type INTEGER NOT NULL,
        data BLOB NOT NULL, UNIQUE (key, folded));
    INSERT INTO keys (id, parent, folded, name) VALUES
        (1, 0, x'01', x'01'), (2, 0, x'02', x'02'), (3, 0, x'03', x'03'), (4, 0, x'04', x'04');
    PRAGMA user_version = 1;
)";

#define VXCOMN_KEYS_OF_TREE \
    "WITH RECURSIVE tree(id) AS (VALUES (?1) UNION SELECT keys.id FROM keys JOIN tree ON keys.parent = tree.id) "

constexpr const char *kQueries[static_cast<int>(Query::count)] = {
    "BEGIN IMMEDIATE",
    "COMMIT",
    "ROLLBACK",
    "SELECT id FROM keys WHERE parent = ?1 AND folded = ?2",
    "SELECT 1 FROM keys WHERE id = ?1",
    "INSERT INTO keys (parent, folded, name) VALUES (?1, ?2, ?3)",
    "SELECT name FROM keys WHERE parent = ?1 ORDER BY id",
    "SELECT 1 FROM keys WHERE parent = ?1 LIMIT 1",
    // Of what is longer than allowed only the length is looked at.
    "SELECT type, CASE WHEN length(data) <= ?3 THEN data END FROM entries WHERE key = ?1 AND folded = ?2",
    "INSERT INTO entries (key, folded, name, type, data) SELECT ?1, ?2, ?3, ?4, ?5 WHERE EXISTS (SELECT 1 FROM keys WHERE id = ?1) "
    "ON CONFLICT (key, folded) DO UPDATE SET type = excluded.type, data = excluded.data",
    "UPDATE entries SET type = ?4, data = ?5 WHERE key = ?1 AND folded = ?2",
    "DELETE FROM entries WHERE key = ?1 AND folded = ?2",
    "SELECT name FROM entries WHERE key = ?1 ORDER BY id",
    // A row without a name for a key without values, and none for a key that isn't there.
    "SELECT entries.name, type, CASE WHEN length(data) <= ?2 THEN data END FROM keys LEFT JOIN entries ON key = keys.id "
    "WHERE keys.id = ?1 ORDER BY entries.id",
    "SELECT keys.id, keys.name, type, data FROM keys LEFT JOIN entries ON key = keys.id AND entries.folded = ?2 AND "
    "length(data) <= ?3 WHERE parent = ?1 ORDER BY keys.id",
    VXCOMN_KEYS_OF_TREE "DELETE FROM entries WHERE key IN tree",
    VXCOMN_KEYS_OF_TREE "DELETE FROM keys WHERE id IN tree AND id <> ?2",
    VXCOMN_KEYS_OF_TREE "SELECT id FROM tree",
};

#undef VXCOMN_KEYS_OF_TREE

// SQLite asks here whether to try again while another process writes. Commits take microseconds, so the first waits are short; who
// still waits after some 10 s has met a process that hangs.
int waitForOthers(void *, int tries) {
    constexpr int kMostTries = 5000;
    constexpr int kStepMicroseconds = 50, kLongestMicroseconds = 2000;
    if (tries >= kMostTries) return 0;
    usleep(static_cast<useconds_t>(std::min(kStepMicroseconds * (tries + 1), kLongestMicroseconds)));
    return 1;
}

std::atomic<uint64_t> statementCount, commitCount;

int countCommit(void *) {
    commitCount.fetch_add(1, std::memory_order_relaxed);
    return 0;
}

void check(int result) {
    if (result != SQLITE_OK) throw StoreError{result};
}

}  // namespace

Statement::~Statement() {
    sqlite3_reset(statement_);
    sqlite3_clear_bindings(statement_);
}

Statement &Statement::bind(int argument, int64_t number) {
    check(sqlite3_bind_int64(statement_, argument, number));
    return *this;
}

Statement &Statement::bind(int argument, WideView text) {
    return bind(argument, std::span(reinterpret_cast<const uint8_t *>(text.data()), text.size() * sizeof(VXWCHAR)));
}

Statement &Statement::bind(int argument, std::span<const uint8_t> bytes) {
    // A null pointer would be taken for NULL, which is not the same as nothing.
    const void *start = bytes.empty() ? static_cast<const void *>("") : bytes.data();
    check(sqlite3_bind_blob64(statement_, argument, start, bytes.size(), SQLITE_STATIC));
    return *this;
}

bool Statement::next() {
    const int result = sqlite3_step(statement_);
    if (result == SQLITE_ROW) return true;
    if (result == SQLITE_DONE) return false;
    throw StoreError{result};
}

bool Statement::isNull(int column) const {
    return sqlite3_column_type(statement_, column) == SQLITE_NULL;
}

int64_t Statement::number(int column) const {
    return sqlite3_column_int64(statement_, column);
}

WideString Statement::text(int column) const {
    const std::span<const uint8_t> found = bytes(column);
    WideString text(found.size() / sizeof(VXWCHAR), VXWCHAR{0});
    if (!text.empty()) std::memcpy(text.data(), found.data(), text.size() * sizeof(VXWCHAR));
    return text;
}

std::span<const uint8_t> Statement::bytes(int column) const {
    const auto *start = static_cast<const uint8_t *>(sqlite3_column_blob(statement_, column));
    return {start, start != nullptr ? static_cast<size_t>(sqlite3_column_bytes(statement_, column)) : 0};
}

StoreConnection::StoreConnection(const std::string &path) : path_(path) {
    try {
        open();
    } catch (const StoreError &) {
        leaveFilesAlone();
        close();
        throw;
    }
}

StoreConnection::~StoreConnection() {
    close();
}

void StoreConnection::open() {
    // SQLite gives the journals the permissions of the file. One that is there is not opened here: closing it again would let go of
    // the locks that this process has on it through another copy of this code, a program's own beside the library's.
    struct stat present;
    const bool isThere = lstat(path_.c_str(), &present) == 0 && S_ISREG(present.st_mode);
    if (!isThere && !openForAll(path_)) throw StoreError{SQLITE_CANTOPEN};
    check(sqlite3_open_v2(path_.c_str(), &database_, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX, nullptr));
    sqlite3_extended_result_codes(database_, 1);
    sqlite3_busy_handler(database_, waitForOthers, nullptr);
    sqlite3_commit_hook(database_, countCommit, nullptr);
    execute("PRAGMA trusted_schema = OFF; PRAGMA cell_size_check = ON; PRAGMA encoding = 'UTF-16le'");
    execute("PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL");
    if (askNumber("PRAGMA user_version") == 0) makeTables();
    identity_ = askNumber("SELECT identity FROM store");
    // A file whose roots are gone is as good as none.
    if (askNumber("SELECT count(*) FROM keys WHERE id <= 4 AND parent = 0") != 4) throw StoreError{SQLITE_CORRUPT};
    for (int i = 0; i < static_cast<int>(Query::count); ++i) {
        check(sqlite3_prepare_v3(database_, kQueries[i], -1, SQLITE_PREPARE_PERSISTENT, &statements_[i], nullptr));
    }
    struct stat info;
    if (stat(path_.c_str(), &info) != 0) throw StoreError{SQLITE_CANTOPEN};
    device_ = info.st_dev, file_ = info.st_ino;
}

void StoreConnection::makeTables() {
    execute("BEGIN IMMEDIATE");
    execute(kTables);
    int64_t identity = 0;
    if (getrandom(&identity, sizeof identity, 0) != static_cast<ssize_t>(sizeof identity)) throw StoreError{SQLITE_IOERR};
    execute(("INSERT INTO store VALUES (" + std::to_string(identity) + ")").c_str());
    execute("COMMIT");
}

void StoreConnection::execute(const char *sql) {
    check(sqlite3_exec(database_, sql, nullptr, nullptr, nullptr));
}

int64_t StoreConnection::askNumber(const char *sql) {
    sqlite3_stmt *statement = nullptr;
    check(sqlite3_prepare_v2(database_, sql, -1, &statement, nullptr));
    const int result = sqlite3_step(statement);
    const int64_t answer = sqlite3_column_int64(statement, 0);
    sqlite3_finalize(statement);
    if (result != SQLITE_ROW) throw StoreError{result == SQLITE_DONE ? SQLITE_CORRUPT : result};
    return answer;
}

void StoreConnection::close() {
    for (sqlite3_stmt *&statement : statements_) {
        sqlite3_finalize(statement);
        statement = nullptr;
    }
    sqlite3_close(database_);
    database_ = nullptr;
}

Statement StoreConnection::operator()(Query query) {
    statementCount.fetch_add(1, std::memory_order_relaxed);
    return Statement(statements_[static_cast<int>(query)]);
}

void StoreConnection::publishChanges(ChangeTable &table) noexcept {
    for (int kind = 0; kind < 3; ++kind) {
        std::vector<int64_t> &keys = changed_[kind];
        std::sort(keys.begin(), keys.end());
        keys.erase(std::unique(keys.begin(), keys.end()), keys.end());
        table.publish(keys, static_cast<ChangeKind>(kind));
    }
    forgetChanges();
}

bool StoreConnection::inPlace() const {
    struct stat info;
    return stat(path_.c_str(), &info) == 0 && info.st_ino == file_ && info.st_dev == device_;
}

void StoreConnection::leaveFilesAlone() {
    if (database_ != nullptr) sqlite3_db_config(database_, SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 1, nullptr);
}

StoreCounts storeCounts() noexcept {
    return {statementCount.load(), commitCount.load()};
}

StoreTransaction::StoreTransaction(StoreConnection &connection) : connection_(connection), open_(connection.oneWrite() == nullptr) {
    if (open_) connection_(Query::begin).run();
}

StoreTransaction::~StoreTransaction() {
    if (!open_) return;
    // A key that was made goes with it, and its number to the next one.
    connection_.keys().clear();
    try {
        connection_(Query::rollback).run();
    } catch (const StoreError &) {
        // SQLite has rolled back by itself already, because of what went wrong before.
        open_ = false;
    }
}

void StoreTransaction::commit() {
    if (open_) connection_(Query::commit).run();
    open_ = false;
}

}  // namespace vxcomn
