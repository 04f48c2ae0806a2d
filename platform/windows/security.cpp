// SPDX-License-Identifier: MIT
#include "platform/security.h"

#include <cstdio>

// clang-format off: sdk.h brings windows.h, which the other leans on
#include <aclapi.h>
#include "platform/unique.h"
#include "platform/windows/sdk.h"
// clang-format on

namespace vxcomn {
namespace {

constexpr DWORD kKeyEverything = 0xF003F;
constexpr DWORD kMutexWait = SYNCHRONIZE;

struct SidTraits {
    using Raw = PSID;
    static constexpr Raw none = nullptr;
    static void close(Raw sid) noexcept { FreeSid(sid); }
};
using Sid = Unique<SidTraits>;

struct LocalTraits {
    using Raw = void *;
    static constexpr Raw none = nullptr;
    static void close(Raw memory) noexcept { LocalFree(memory); }
};
using LocalMemory = Unique<LocalTraits>;

void explain(const char *call, DWORD error) noexcept {
    std::printf("%s Error %u\n", call, static_cast<unsigned>(error));
}

EXPLICIT_ACCESSW grant(PSID sid, DWORD mask) noexcept {
    EXPLICIT_ACCESSW access = {};
    access.grfAccessPermissions = mask;
    access.grfAccessMode = SET_ACCESS;
    access.grfInheritance = NO_INHERITANCE;
    access.Trustee.TrusteeForm = TRUSTEE_IS_SID;
    access.Trustee.TrusteeType = TRUSTEE_IS_GROUP;
    access.Trustee.ptstrName = static_cast<LPWSTR>(sid);
    return access;
}

// A record that lives as long as the process, for objects must be made with it to the last moment. Empty after a failure.
class Record {
  public:
    explicit Record(DWORD worldMask) noexcept { build(worldMask); }
    const SecurityRecord &get() const noexcept { return record_; }

  private:
    void build(DWORD worldMask) noexcept {
        SID_IDENTIFIER_AUTHORITY worldAuthority = {SECURITY_WORLD_SID_AUTHORITY}, ntAuthority = {SECURITY_NT_AUTHORITY};
        Sid world, administrators;
        if (!AllocateAndInitializeSid(&worldAuthority, 1, SECURITY_WORLD_RID, 0, 0, 0, 0, 0, 0, 0, world.put()) ||
            !AllocateAndInitializeSid(&ntAuthority, 2, SECURITY_BUILTIN_DOMAIN_RID, DOMAIN_ALIAS_RID_ADMINS, 0, 0, 0, 0, 0, 0,
                                      administrators.put())) {
            return explain("AllocateAndInitializeSid", GetLastError());
        }
        EXPLICIT_ACCESSW entries[] = {grant(world.get(), worldMask), grant(administrators.get(), kKeyEverything)};
        entries[0].Trustee.TrusteeType = TRUSTEE_IS_WELL_KNOWN_GROUP;
        PACL made = nullptr;
        if (const DWORD error = SetEntriesInAclW(2, entries, nullptr, &made); error != ERROR_SUCCESS) {
            return explain("SetEntriesInAcl", error);
        }
        LocalMemory list(made);
        LocalMemory descriptor(LocalAlloc(LPTR, SECURITY_DESCRIPTOR_MIN_LENGTH));
        if (!descriptor) return explain("LocalAlloc", GetLastError());
        if (!InitializeSecurityDescriptor(descriptor.get(), SECURITY_DESCRIPTOR_REVISION)) {
            return explain("InitializeSecurityDescriptor", GetLastError());
        }
        if (!SetSecurityDescriptorDacl(descriptor.get(), TRUE, made, FALSE)) {
            return explain("SetSecurityDescriptorDacl", GetLastError());
        }
        list.release();
        attributes_ = {sizeof attributes_, descriptor.release(), FALSE};
        record_ = SecurityRecord(&attributes_);
    }

    SECURITY_ATTRIBUTES attributes_ = {};
    SecurityRecord record_{nullptr};
};

const Record &registryRecord() noexcept {
    static Record record(kKeyEverything);
    return record;
}
const Record &mutexRecord() noexcept {
    static Record record(kMutexWait);
    return record;
}

// At load, before any key or mutex is made.
[[gnu::constructor]] void buildRecords() {
    registryRecord();
    mutexRecord();
}

}  // namespace

const SecurityRecord &registrySecurity() noexcept {
    return registryRecord().get();
}
const SecurityRecord &mutexSecurity() noexcept {
    return mutexRecord().get();
}

}  // namespace vxcomn
