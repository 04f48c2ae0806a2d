// SPDX-License-Identifier: MIT
#include "platform/posix/machine_root.h"

#include <doctest/doctest.h>

#include <filesystem>

#include <unistd.h>

#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
namespace fs = std::filesystem;

namespace {

const test::Helper sayRoot("say-root", [](const std::vector<std::string> &arguments) {
    if (!arguments.empty()) fs::current_path(arguments[0]);
    std::string root;
    const Status status = machineRoot(root);
    test::sayLine(status == status::ok ? root : "status " + std::to_string(status));
    return 0;
});

struct RootFixture {
    fs::path folder = fs::temp_directory_path() / ("vxcomn-roots-" + std::to_string(test::processId()));
    RootFixture() { fs::create_directories(folder); }
    ~RootFixture() { fs::remove_all(folder); }

    static std::string rootWith(const test::Environment &environment, const std::vector<std::string> &arguments = {}) {
        test::Process child = test::startHelper("say-root", arguments, environment);
        return child.readLine().value_or("(nothing)");
    }
};

std::string native(WideView path) {
    return nativePath(path).value_or("(none)");
}

}  // namespace

TEST_CASE_FIXTURE(RootFixture, "the machine root is the folder that VXCOMN_ROOT names, made with all above it") {
    const std::string named = folder / "a" / "b";
    CHECK(rootWith({{"VXCOMN_ROOT", named + "//"}, {"XDG_STATE_HOME", "/nowhere"}}) == named);
    CHECK(fs::is_directory(named));
    CHECK(rootWith({{"VXCOMN_ROOT", "here"}}, {folder.string()}) == (folder / "here").string());
    CHECK(fs::is_directory(folder / "here"));
}

TEST_CASE_FIXTURE(RootFixture,
                  "without VXCOMN_ROOT it is the system's folder where that can be written, else the user's state folder") {
    const bool system = access("/var/lib", W_OK) == 0 || access("/var/lib/vxcomn", W_OK) == 0;
    const std::string state = folder / "state", home = folder / "home";
    const auto expected = [&](const std::string &user) { return system ? std::string("/var/lib/vxcomn") : user; };
    const bool wasThere = fs::exists("/var/lib/vxcomn");
    CHECK(rootWith({{"VXCOMN_ROOT", ""}, {"XDG_STATE_HOME", state}, {"HOME", home}}) == expected(state + "/vxcomn"));
    CHECK(rootWith({{"VXCOMN_ROOT", ""}, {"XDG_STATE_HOME", ""}, {"HOME", home}}) == expected(home + "/.local/state/vxcomn"));
    CHECK(rootWith({{"VXCOMN_ROOT", ""}, {"XDG_STATE_HOME", "relative"}, {"HOME", home}}) ==
          expected(home + "/.local/state/vxcomn"));
    std::error_code ignored;
    if (!wasThere) fs::remove("/var/lib/vxcomn", ignored);
}

TEST_CASE_FIXTURE(RootFixture, "a machine root that cannot be made says why") {
    CHECK(rootWith({{"VXCOMN_ROOT", "/dev/null/x"}}) == "status 3");
    CHECK(rootWith({{"VXCOMN_ROOT", "/proc/none/x"}}) == "status 2");
}

TEST_CASE("a path of drive C lies in drive_c, with the case of its names") {
    std::string root;
    REQUIRE(machineRoot(root) == status::ok);
    const std::string drive = root + "/drive_c";
    CHECK(native(VX_TEXT("C:\\ProgramData\\x.Bin")) == drive + "/ProgramData/x.Bin");
    CHECK(native(VX_TEXT("c:/a\\b//c\\")) == drive + "/a/b/c");
    CHECK(native(VX_TEXT("\\a")) == drive + "/a");
    CHECK(native(VX_TEXT("C:\\")) == drive);
    CHECK(native(VX_TEXT("C:\\a\\.\\b\\..\\c")) == drive + "/a/c");
    CHECK(native(VX_TEXT("C:\\gr\u00FCn")) == drive + "/gr\xC3\xBCn");
}

TEST_CASE("a path that climbs out of drive C, or names another place, has no native path") {
    CHECK(native(VX_TEXT("C:\\..\\registry.db")) == "(none)");
    CHECK(native(VX_TEXT("C:\\a\\..\\..\\x")) == "(none)");
    CHECK(native(VX_TEXT("\\..")) == "(none)");
    CHECK(native(VX_TEXT("D:\\x")) == "(none)");
    CHECK(native(VX_TEXT("C:x")) == "(none)");
    CHECK(native(VX_TEXT("C:")) == "(none)");
    CHECK(native({}) == "(none)");
    CHECK(native(WideView(VX_TEXT("/a\0b"), 4)) == "(none)");
}

TEST_CASE("a path that begins with a slash is taken as it is") {
    CHECK(native(VX_TEXT("/a/../b\\c")) == "/a/../b\\c");
    CHECK(native(VX_TEXT("a\\b/c")) == "a/b/c");
}
