// SPDX-License-Identifier: MIT
//
// How often the tests with processes go round: as often as a test run has time for where processes are cheap, less often where a
// process is dear (under Wine, and with a sanitizer).
#pragma once

namespace test {

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr bool kSanitized = true;
#else
inline constexpr bool kSanitized = false;
#endif

inline constexpr bool kDearProcesses = sizeof(wchar_t) == 2;  // Windows

inline constexpr int kKillRounds = kDearProcesses ? 20 : kSanitized ? 60 : 400;
inline constexpr int kManyWrites = kDearProcesses ? 100 : 500;

}  // namespace test
