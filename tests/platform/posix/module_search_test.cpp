// SPDX-License-Identifier: MIT
//
// The order in which Linux looks a module up.
#include <doctest/doctest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "platform/module.h"
#include "tests/support/process.h"

using namespace vxcomn;
namespace fs = std::filesystem;

namespace {

struct SearchFixture {
    fs::path root = std::getenv("VXCOMN_ROOT");
    fs::path system = root / "drive_c/Windows/System32";
    fs::path added = root / "drive_c/added";
    fs::path module = fs::path(test::selfProgram()).parent_path() / "VxcomnTestModule.so";

    SearchFixture() {
        fs::create_directories(system);
        fs::create_directories(added);
    }
    ~SearchFixture() {
        setModuleDirectory({});
        fs::remove_all(root / "drive_c");
    }
    static bool loads(const char *name) { return findExport(loadModule(name).get(), "vxcomnTestModuleAnswer") != nullptr; }
};

}  // namespace

TEST_CASE_FIXTURE(SearchFixture, "a module in drive C's system folder is found by its bare name, as .dll or as .so") {
    CHECK_FALSE(loads("InSystem.dll"));
    fs::copy_file(module, system / "InSystem.so");
    CHECK(loads("InSystem.dll"));
    CHECK(loads("InSystem.DLL"));
    CHECK(loads("InSystem.so"));
    CHECK_FALSE(loads("InSystem"));
    fs::copy_file(module, system / "Foreign.dll");
    CHECK(loads("Foreign.dll"));
}

TEST_CASE_FIXTURE(SearchFixture, "the added folder comes before the system folder") {
    fs::copy_file(module, system / "Twice.so");
    CHECK(loads("Twice.dll"));
    std::ofstream(added / "Twice.so") << "no module";
    setModuleDirectory(VX_TEXT("C:\\added"));
    Status why = 0;
    CHECK_FALSE(loadModule("Twice.dll", &why));  // found there, and that ends the search
    CHECK(why == status::badExeFormat);
}

TEST_CASE_FIXTURE(SearchFixture, "in one place the name itself comes before the one that ends in .so") {
    fs::copy_file(module, system / "Both.so");
    std::ofstream(system / "Both.dll") << "no module";
    CHECK_FALSE(loads("Both.dll"));
    CHECK(loads("Both.so"));
}

TEST_CASE_FIXTURE(SearchFixture, "a name with a separator is a path, of drive C or of the machine") {
    fs::copy_file(module, added / "ByPath.so");
    CHECK(loads("C:\\added\\ByPath.dll"));
    CHECK(loads((added / "ByPath.dll").c_str()));
    CHECK_FALSE(loads("C:\\nowhere\\ByPath.dll"));
    CHECK_FALSE(loads("C:\\..\\drive_c\\added\\ByPath.dll"));
    CHECK_FALSE(loads("./VxcomnTestModule.dll/"));
}

TEST_CASE_FIXTURE(SearchFixture, "what the dynamic linker knows is found last") {
    CHECK(loadModule("libsqlite3.so.0"));
    std::ofstream(system / "libsqlite3.so.0") << "no module";
    CHECK_FALSE(loadModule("libsqlite3.so.0"));
}
