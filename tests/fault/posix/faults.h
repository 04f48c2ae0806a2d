// SPDX-License-Identifier: MIT
//
// Failures on demand: the n-th allocation, statement of the store or file operation fails, or the process dies in it. Linux only,
// where the allocator, SQLite's calls of the system and this program's own can be had hold of. One thread at a time.
#pragma once

#include <cstdint>

namespace test {

enum class FaultKind : uint8_t {
    allocation,   // operator new
    storeMemory,  // what SQLite allocates
    statement,    // sqlite3_step
    storeFile,    // SQLite's open, read, write, truncation, mapping and locking of files
    file,         // open, pread and pwrite of this program's own code
};

enum class FaultEffect : uint8_t { failure, death };

// The n-th from now on, counted from 1.
void armFault(FaultKind kind, int n, FaultEffect effect = FaultEffect::failure);
// Whether it came to it. Nothing fails any more.
bool disarmFault();

// Runs `operation` with the first failing, the second, and so on until none is left to fail; `check(failed)` looks at the outcome
// each time. How many failures that were.
template <class Prepare, class Operation, class Check>
int failEach(FaultKind kind, Prepare prepare, Operation operation, Check check) {
    constexpr int kMost = 100000;
    for (int n = 1; n < kMost; ++n) {
        prepare();
        armFault(kind, n);
        operation();
        const bool failed = disarmFault();
        check(failed);
        if (!failed) return n - 1;
    }
    return -1;
}

}  // namespace test
