// SPDX-License-Identifier: MIT
//
// Handles are counted in the system's list of all handles: not every Windows environment counts them by process.
#include "tests/support/resource_use.h"

#include <windows.h>

#include <tlhelp32.h>
#include <winternl.h>

#include <cstring>
#include <vector>

namespace vxcomn::testing {

namespace {

// Class 64 of NtQuerySystemInformation.
struct HandleEntry {
    void *object;
    ULONG_PTR processId, handle;
    ULONG access;
    USHORT creator, type;
    ULONG attributes, reserved;
};
struct HandleList {
    ULONG_PTR count, reserved;
    HandleEntry entries[1];
};

uint64_t handlesInUse() {
    constexpr auto handleList = static_cast<SYSTEM_INFORMATION_CLASS>(64);
    constexpr NTSTATUS tooSmall = static_cast<NTSTATUS>(0xC0000004);
    std::vector<std::uint64_t> memory(1 << 14);
    NTSTATUS status = 0;
    while ((status = NtQuerySystemInformation(handleList, memory.data(), static_cast<ULONG>(memory.size() * 8), nullptr)) ==
           tooSmall)
        memory.resize(2 * memory.size());
    if (status < 0) return 0;
    const auto *list = reinterpret_cast<const HandleList *>(memory.data());
    uint64_t own = 0;
    for (ULONG_PTR i = 0; i < list->count; ++i) own += list->entries[i].processId == GetCurrentProcessId() ? 1 : 0;
    return own;
}

uint64_t threadsInUse() {
    const HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPTHREAD, 0);
    THREADENTRY32 entry = {};
    entry.dwSize = sizeof entry;
    uint64_t own = 0;
    for (BOOL more = Thread32First(snapshot, &entry); more != 0; more = Thread32Next(snapshot, &entry))
        own += entry.th32OwnerProcessID == GetCurrentProcessId() ? 1 : 0;
    CloseHandle(snapshot);
    return own;
}

}  // namespace

ResourceUse resourcesInUse() {
    return {handlesInUse(), threadsInUse()};
}

}  // namespace vxcomn::testing
