// SPDX-License-Identifier: MIT
//
// SQLite by itself, as somebody would use it for the same values: a table of names and values, write-ahead journal, synchronous
// NORMAL, prepared statements.
#pragma once

#include <array>
#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include <sqlite3.h>

#include "bench/store/figures.h"

namespace vxcomn::bench {

class SqlitePeer {
  public:
    static constexpr int kValues = 6;

    explicit SqlitePeer(const std::filesystem::path &file) {
        check(sqlite3_open(file.c_str(), &database_));
        run("PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL; CREATE TABLE entries (name TEXT PRIMARY KEY, value BLOB)");
        begin_ = prepare("BEGIN IMMEDIATE");
        commit_ = prepare("COMMIT");
        write_ = prepare("INSERT INTO entries VALUES (?1, ?2) ON CONFLICT (name) DO UPDATE SET value = excluded.value");
        read_ = prepare("SELECT value FROM entries WHERE name = ?1");
        for (int i = 0; i < kValues; ++i) names_[static_cast<size_t>(i)] = "parameter " + std::to_string(i);
    }
    ~SqlitePeer() {
        for (sqlite3_stmt *each : {begin_, commit_, write_, read_}) sqlite3_finalize(each);
        sqlite3_close(database_);
    }
    SqlitePeer(const SqlitePeer &) = delete;
    SqlitePeer &operator=(const SqlitePeer &) = delete;

    // One commit of six values.
    void writeSix(const std::vector<uint8_t> &value) {
        step(begin_);
        for (const std::string &name : names_) {
            bindName(write_, name);
            check(sqlite3_bind_blob(write_, 2, value.data(), static_cast<int>(value.size()), SQLITE_STATIC));
            step(write_);
        }
        step(commit_);
    }

    // Reads one value into a buffer; its size.
    int read(int which, uint8_t *buffer, int size) {
        bindName(read_, names_[static_cast<size_t>(which)]);
        require(sqlite3_step(read_) == SQLITE_ROW, "the peer has no such value");
        const int bytes = std::min(size, sqlite3_column_bytes(read_, 0));
        std::memcpy(buffer, sqlite3_column_blob(read_, 0), static_cast<size_t>(bytes));
        sqlite3_reset(read_);
        return bytes;
    }

  private:
    static void check(int result) { require(result == SQLITE_OK, "SQLite by itself failed"); }
    void run(const char *sql) { check(sqlite3_exec(database_, sql, nullptr, nullptr, nullptr)); }
    sqlite3_stmt *prepare(const char *sql) {
        sqlite3_stmt *statement = nullptr;
        check(sqlite3_prepare_v3(database_, sql, -1, SQLITE_PREPARE_PERSISTENT, &statement, nullptr));
        return statement;
    }
    static void bindName(sqlite3_stmt *statement, const std::string &name) {
        check(sqlite3_bind_text(statement, 1, name.c_str(), static_cast<int>(name.size()), SQLITE_STATIC));
    }
    static void step(sqlite3_stmt *statement) {
        require(sqlite3_step(statement) == SQLITE_DONE, "SQLite by itself failed");
        sqlite3_reset(statement);
    }

    sqlite3 *database_ = nullptr;
    sqlite3_stmt *begin_ = nullptr, *commit_ = nullptr, *write_ = nullptr, *read_ = nullptr;
    std::array<std::string, kValues> names_;
};

}  // namespace vxcomn::bench
