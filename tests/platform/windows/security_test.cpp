// SPDX-License-Identifier: MIT
#include "platform/security.h"

#include <doctest/doctest.h>

#include "platform/registry.h"
#include "platform/windows/sdk.h"
#include "tests/platform/registry_fixture.h"

using namespace vxcomn;

namespace {

struct Grant {
    DWORD mask;
    bool world, administrators;
    BYTE flags;
};

bool isWellKnown(PSID sid, WELL_KNOWN_SID_TYPE type) {
    return IsWellKnownSid(sid, type) != FALSE;
}

std::vector<Grant> grantsOf(const SecurityRecord &record) {
    const auto *attributes = static_cast<const SECURITY_ATTRIBUTES *>(record.attributes());
    REQUIRE(attributes != nullptr);
    CHECK(attributes->nLength == sizeof *attributes);
    CHECK(attributes->bInheritHandle == FALSE);
    BOOL present = FALSE, defaulted = TRUE;
    PACL list = nullptr;
    REQUIRE(GetSecurityDescriptorDacl(attributes->lpSecurityDescriptor, &present, &list, &defaulted));
    CHECK(present);
    CHECK_FALSE(defaulted);
    REQUIRE(list != nullptr);
    std::vector<Grant> grants;
    for (DWORD i = 0; i < list->AceCount; ++i) {
        void *entry = nullptr;
        REQUIRE(GetAce(list, i, &entry));
        auto *allowed = static_cast<ACCESS_ALLOWED_ACE *>(entry);
        CHECK(allowed->Header.AceType == ACCESS_ALLOWED_ACE_TYPE);
        PSID sid = &allowed->SidStart;
        grants.push_back({allowed->Mask, isWellKnown(sid, WinWorldSid), isWellKnown(sid, WinBuiltinAdministratorsSid),
                          allowed->Header.AceFlags});
    }
    return grants;
}

void checkRecord(const SecurityRecord &record, DWORD worldMask) {
    const std::vector<Grant> grants = grantsOf(record);
    REQUIRE(grants.size() == 2);
    for (const Grant &grant : grants) {
        CHECK(grant.world != grant.administrators);
        CHECK(grant.mask == (grant.world ? worldMask : 0xF003F));
        CHECK(grant.flags == 0);
    }
    CHECK(grants[0].world != grants[1].world);
}

}  // namespace

TEST_CASE("the record for keys lets everybody and the administrators do everything") {
    checkRecord(registrySecurity(), 0xF003F);
}

TEST_CASE("the record for mutexes lets everybody wait") {
    checkRecord(mutexSecurity(), 0x100000);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "a key is made with the record") {
    RegistryKey made;
    bool created = false;
    CHECK(key.createBelow(VX_TEXT("made"), RegistryAccess::all, made, &created, &registrySecurity()) == status::ok);
    CHECK(created);
    CHECK(made.setU32(VX_TEXT("v"), 1) == status::ok);
    CHECK(RegistryKey::create(kRoot, path + VX_TEXT("\\other"), RegistryAccess::all, made, &created, &registrySecurity()) ==
          status::ok);
    CHECK(created);
}
