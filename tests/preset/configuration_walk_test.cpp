// SPDX-License-Identifier: MIT
//
// The walk over the configuration key.
#include <doctest/doctest.h>

#include "platform/named_mutex.h"
#include "tests/preset/walk_host.h"

using namespace vxcomn;

namespace {

constexpr uint8_t kThreeComponents[] = {36, 0, 0, 0, 0, 0, 0, 0, 3, 0, 0, 0};

// What an application does that forces a selection, and lives.
struct Setter {
    WideString name = VX_TEXT("Global\\VxcomnTestSetter-") + toWide(std::to_string(test::processId()));
    NamedMutex mutex;

    Setter() { REQUIRE(NamedMutex::create(name, mutex) == status::ok); }
};

struct Configuration : test::SlotKeys {
    test::WalkHost host{*this};
    test::TaggedLog log{host};
    RegistryKey root = open(kStoreRoot);

    void set(const VXWCHAR *name, const WideString &text) const { REQUIRE(SetRegString(configuration, name, &text) == status::ok); }
    // How many flags the walk raised.
    int walk(bool force = false) {
        host.UpdateFromRegistry(root, true, force);
        const PendingConfiguration &p = host.Pending;
        return p.PendingEngineName + p.PendingEngineConfig + p.PendingIOConfig + p.PendingUserProfile + p.PendingContentType;
    }
};

}  // namespace

TEST_CASE_FIXTURE(Configuration, "each forced selection is found once, and raises its own flag") {
    const Setter setter;
    set(store_name::engineSetter, setter.name);
    set(store_name::ioConfigSetter, setter.name);
    set(store_name::engineName, VX_TEXT("KZNOVA"));
    REQUIRE(SetRegBinary(configuration, store_name::engineConfig, kThreeComponents, sizeof kThreeComponents) == status::ok);
    set(store_name::ioConfig, VX_TEXT("Headphones"));
    set(store_name::userProfile, VX_TEXT("Anna"));
    set(store_name::contentType, VX_TEXT("Music"));
    CHECK(walk() == 5);
    CHECK(host.Pending.EngineName == VX_TEXT("KZNOVA"));
    CHECK(host.Pending.EngineConfig.ComponentCount == 3);
    CHECK(host.Pending.EngineConfig.Size == sizeof kThreeComponents);
    CHECK(host.Pending.IOConfig == VX_TEXT("Headphones"));
    CHECK(host.Pending.UserProfile == VX_TEXT("Anna"));
    CHECK(host.Pending.ContentType == VX_TEXT("Music"));
    CHECK(walk() == 0);
    CHECK(host.Pending.EngineName.empty());
    CHECK(walk(true) == 5);
    // The walk finds; the properties stay as they are.
    CHECK(host.EngineShortName.get().empty());
}

TEST_CASE_FIXTURE(Configuration, "what a setter forced counts no longer when the setter has gone") {
    {
        const Setter setter;
        set(store_name::engineSetter, setter.name);
        set(store_name::engineName, VX_TEXT("KZNOVA"));
        set(store_name::ioConfigSetter, setter.name);
        set(store_name::ioConfig, VX_TEXT("Headphones"));
        set(store_name::userProfile, VX_TEXT("Anna"));
        CHECK(walk() == 3);
    }
    CHECK(walk(true) == 1);
    CHECK(host.Pending.PendingUserProfile);
}

TEST_CASE_FIXTURE(Configuration, "a write tells a walk that the same text is new") {
    set(store_name::userProfile, VX_TEXT("Anna"));
    CHECK(walk() == 1);
    CHECK(walk() == 0);
    set(store_name::userProfile, VX_TEXT("Anna"));
    CHECK(walk() == 1);
}

TEST_CASE_FIXTURE(Configuration, "values of wrong types and sizes force nothing") {
    const Setter setter;
    set(store_name::engineSetter, setter.name);
    set(store_name::ioConfigSetter, setter.name);
    RegistryKey key = open(configuration);
    const std::vector<uint8_t> tooLong(525, 1);
    key.setU32(store_name::engineName, 5);
    key.setBytes(store_name::engineConfig, tooLong);
    key.setBytes(store_name::ioConfig, tooLong);
    key.setU64(store_name::userProfile, 5);
    key.set(store_name::contentType, RegistryType::sz, {});
    key.setU64(store_name::writeTime, freshStamp());
    CHECK(walk() == 0);
    for (const size_t size : {size_t{0}, size_t{3}}) {
        key.setBytes(store_name::engineConfig, std::span(tooLong).first(size));
        CHECK(walk(true) == 0);
    }
    key.setText(store_name::userProfile, VX_TEXT("Anna"));
    key.setText(store_name::writeTime, VX_TEXT("12345678"));
    CHECK(walk(true) == 0);
}

TEST_CASE_FIXTURE(Configuration, "the hook is called at the end, and gets the root") {
    host.UpdateFromRegistry(root, false, false);
    set(store_name::userProfile, VX_TEXT("Anna"));
    host.UpdateFromRegistry(root, true, false);
    CHECK(host.configurationPolls == std::vector<bool>{false, true});
    CHECK(host.rootWasOpen);
    host.APOTypeRegKeyName.set({});
    host.UpdateFromRegistry(root, true, true);
    CHECK(host.configurationPolls.size() == 2);
}

TEST_CASE_FIXTURE(Configuration, "what the walk does is told") {
    CHECK(walk() == 0);
    const std::string path = toUtf8(configuration);
    CHECK(log.count("Failed to open registry key HKLM\\" + path +
                    " to check for new Engine, IOConfig, ContentType and ContentType") == 1);
    CHECK(log.has("Mutex handle = NULL!!!"));
    set(store_name::userProfile, VX_TEXT("Anna"));
    CHECK(walk() == 1);
    uint64_t stamp = 0;
    REQUIRE(open(configuration).readU64(store_name::writeTime, stamp) == RegistryRead::value);
    CHECK(log.count("New write timestamp = " + std::to_string(stamp)) == 1);
    const std::vector<std::string> texts = log.texts();
    CHECK(std::count_if(texts.begin(), texts.end(), [&](const std::string &text) {
              return text.rfind("{ UpdateFromRegistry(APOTypeRegKeyName = " + path + ", GlobalMutex = 0x", 0) == 0;
          }) == 2);
}
