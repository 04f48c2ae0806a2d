// SPDX-License-Identifier: MIT
//
// Whoever makes the machine folder makes it for everybody, as the security records do on Windows.
#include <doctest/doctest.h>

#include <filesystem>

#include <sys/stat.h>

#include "platform/change_signal.h"
#include "platform/named_mutex.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
namespace fs = std::filesystem;

namespace {

// Uses everything that lies in the folder, under the mask of a user who shares nothing. Goes without taking anything away.
const test::Helper user("use-machine-alone", [](const std::vector<std::string> &) {
    umask(077);
    RegistryKey key;
    ChangeSignal signal;
    NamedMutex mutex;
    if (RegistryKey::create(RegistryRoot::localMachine, VX_TEXT("a"), RegistryAccess::all, key) != status::ok) return 1;
    if (key.setU32(VX_TEXT("v"), 1) != status::ok) return 2;
    if (ChangeSignal::open(key, ChangeFilter::values, signal) != status::ok || signal.arm() != status::ok) return 3;
    if (NamedMutex::create(VX_TEXT("Global\\m"), mutex) != status::ok) return 4;
    test::sayLine("ready");
    std::getchar();
    return 0;
});

unsigned modeOf(const fs::path &path) {
    struct stat info = {};
    REQUIRE_MESSAGE(stat(path.c_str(), &info) == 0, path.string());
    return info.st_mode & 0777;
}

}  // namespace

TEST_CASE("the machine folder and all in it can be read and written by everybody, whatever the maker's mask") {
    const fs::path above = fs::temp_directory_path() / ("vxcomn-modes-" + std::to_string(test::processId()));
    const fs::path root = above / "deep" / "root";
    test::Process process = test::startHelper("use-machine-alone", {}, {{"VXCOMN_ROOT", root.string()}});
    CHECK(process.readLine().value_or("") == "ready");
    CHECK(modeOf(root) == 0777);
    CHECK(modeOf(root / "tokens") == 0777);
    for (const char *file :
         {"registry.db", "registry.db-wal", "registry.db-shm", "registry.lock", "signals", "tokens/.guard", "tokens/Global%5Cm"}) {
        INFO(file);
        CHECK(modeOf(root / file) == 0666);
    }
    CHECK(process.wait() == 0);
    CHECK_FALSE(fs::exists(root / "tokens/Global%5Cm"));
    fs::remove_all(above);
}

TEST_CASE("a machine folder that was there keeps the permissions that it has") {
    const fs::path root = fs::temp_directory_path() / ("vxcomn-modes-" + std::to_string(test::processId()));
    fs::create_directory(root);
    fs::permissions(root, fs::perms::owner_all);
    test::Process process = test::startHelper("use-machine-alone", {}, {{"VXCOMN_ROOT", root.string()}});
    CHECK(process.readLine().value_or("") == "ready");
    CHECK(process.wait() == 0);
    CHECK(modeOf(root) == 0700);
    fs::remove_all(root);
}

TEST_CASE("a link in the place of one of its files is not followed") {
    const fs::path root = fs::temp_directory_path() / ("vxcomn-modes-" + std::to_string(test::processId()));
    fs::create_directory(root);
    fs::create_symlink(root / "elsewhere", root / "signals");
    test::Process process = test::startHelper("use-machine-alone", {}, {{"VXCOMN_ROOT", root.string()}});
    CHECK(process.wait() == 3);
    CHECK_FALSE(fs::exists(root / "elsewhere"));
    fs::remove_all(root);
}

TEST_CASE("tokens of killed processes are swept away by the next that has one") {
    const fs::path root = fs::temp_directory_path() / ("vxcomn-modes-" + std::to_string(test::processId()));
    test::Process killed = test::startHelper("use-machine-alone", {}, {{"VXCOMN_ROOT", root.string()}});
    CHECK(killed.readLine().value_or("") == "ready");
    killed.kill();
    fs::rename(root / "tokens/Global%5Cm", root / "tokens/Global%5Cother");
    test::Process next = test::startHelper("use-machine-alone", {}, {{"VXCOMN_ROOT", root.string()}});
    CHECK(next.readLine().value_or("") == "ready");
    CHECK_FALSE(fs::exists(root / "tokens/Global%5Cother"));
    CHECK(fs::exists(root / "tokens/Global%5Cm"));
    CHECK(next.wait() == 0);
    fs::remove_all(root);
}
