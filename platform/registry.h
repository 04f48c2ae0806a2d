// SPDX-License-Identifier: MIT
//
// The registry: the system's own on Windows, the machine folder's `registry.db` on Linux. Keys and value names compare without
// regard to case and keep the spelling of their first writer. Paths are written with backslashes. Every write that has returned
// holds, also when the process is killed right behind it. Any control thread; a key object belongs to one thread at a time.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

class ChangeSignal;
class SecurityRecord;

enum class RegistryRoot : uint8_t { localMachine = 0, currentUser = 1, users = 2, classesRoot = 3 };

// Numbers as in winnt.h.
enum class RegistryType : uint32_t { none = 0, sz = 1, expandSz = 2, binary = 3, dword = 4, multiSz = 7, qword = 11 };

// The rights that a key is opened with, as in winnt.h. The 64-bit view is always meant.
enum class RegistryAccess : uint32_t { read = 0x20119, write = 0x20106, readWrite = 0x2011F, all = 0xF013F };

struct RegistryValue {
    RegistryType type = RegistryType::none;
    std::vector<uint8_t> data;  // as stored; text is UTF-16 little-endian, usually with its end
};

// A value under its name.
struct RegistryEntry {
    WideString name;
    RegistryValue value;
};

struct RegistrySubkey;

// What reading one value came to.
enum class RegistryRead : uint8_t { value, absent, wrongType };

class RegistryKey {
  public:
    RegistryKey() noexcept;
    RegistryKey(RegistryKey &&) noexcept;
    RegistryKey &operator=(RegistryKey &&) noexcept;
    ~RegistryKey();

    // Opens a key that exists: 0, 2 if there is none, 5 without the right.
    static Status open(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key);
    // Opens a key and makes it, with all above it, where it is missing. `created` (if given) tells whether it was; what is made
    // gets the rights of `security` (security.h), or those of the key above it.
    static Status create(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, bool *created = nullptr,
                         const SecurityRecord *security = nullptr);
    // The same, below an open key.
    Status openBelow(WideView path, RegistryAccess access, RegistryKey &key) const;
    Status createBelow(WideView path, RegistryAccess access, RegistryKey &key, bool *created = nullptr,
                       const SecurityRecord *security = nullptr) const;

    explicit operator bool() const noexcept;
    void close() noexcept;

    // Reads one value of a key by the key's path, as open and query do; on Linux with one look at the store for a path known from
    // before.
    static Status queryAt(RegistryRoot root, WideView path, WideView name, RegistryValue &value, size_t limit = SIZE_MAX);
    // Opens a key and lists its values (as `entries`), the same way.
    static Status openWithEntries(RegistryRoot root, WideView path, RegistryAccess access, RegistryKey &key, size_t limit,
                                  std::vector<RegistryEntry> &found);

    // A value of any type. The empty name is the key's own ("default") value. 234 if it has more than `limit` bytes, and then
    // `value` has the type and no data, and nothing of it was read.
    Status query(WideView name, RegistryValue &value, size_t limit = SIZE_MAX) const;
    // Typed reads. A 32-bit value is a REG_DWORD or 4 bytes of REG_BINARY, a 64-bit value a REG_QWORD or 8 bytes of REG_BINARY,
    // text is REG_SZ up to its first end or that of its data, bytes are REG_BINARY of at most `limit` bytes. Outputs are left alone
    // unless the answer is `value`.
    RegistryRead readU32(WideView name, uint32_t &value) const;
    RegistryRead readU64(WideView name, uint64_t &value) const;
    RegistryRead readText(WideView name, WideString &value) const;
    RegistryRead readBytes(WideView name, std::vector<uint8_t> &value, size_t limit) const;

    Status set(WideView name, RegistryType type, std::span<const uint8_t> data);
    Status setU32(WideView name, uint32_t value);
    Status setU64(WideView name, uint64_t value);
    Status setText(WideView name, WideView value);
    Status setBytes(WideView name, std::span<const uint8_t> data);
    Status deleteValue(WideView name);

    // Deletes a key below this one; 5 if that has keys below itself (on both platforms).
    Status deleteBelow(WideView path);
    // Deletes a key below this one with all that is in it; with an empty path all that is in this key, which itself stays.
    Status deleteTreeBelow(WideView path);

    // The names, in the order of their making on Linux and in the system's order on Windows; compare as sets.
    Status subkeys(std::vector<WideString> &names) const;
    Status values(std::vector<WideString> &names) const;
    // The values with their names; one of more than `limit` bytes without its data. One look at the store on Linux, and a sight of
    // one moment there.
    Status entries(size_t limit, std::vector<RegistryEntry> &found) const;
    // Opens all keys below this one and reads a value of each (at most `limit` bytes, or it counts as absent). The same. One that
    // the caller may not open comes without its key.
    Status openSubkeys(RegistryAccess access, WideView valueName, size_t limit, std::vector<RegistrySubkey> &found) const;

  private:
    friend ChangeSignal;
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

// What openSubkeys finds of a key.
struct RegistrySubkey {
    WideString name;
    RegistryKey key;
    std::optional<RegistryValue> value;
};

// Calls `work`, whose registry calls on this thread are one write then on Linux: others see all of it or nothing, and are told
// once. On Windows each call stands by itself. What went well stays when `work` returns an error. It may be called a second time,
// as if the first had never been, so it starts from the same place each time; it must not wait for anybody who uses the registry.
// Returns what `work` returned, or why the whole could not be written.
Status inOneWrite(const std::function<Status()> &work);

}  // namespace vxcomn
