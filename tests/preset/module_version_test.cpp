// SPDX-License-Identifier: MIT
//
// The version of the installed module. In a test program "this module" is the program, whose extension is no module's.
#include "preset/module_version.h"

#include "platform/module.h"
#include "tests/preset/graph_fixture.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

// The module as it is installed: this program, which bears the library's version, or a file of other content.
struct Installed {
    explicit Installed(const SystemFacts &facts = systemFacts())
        : path(packageFolder(facts) +
               (facts.nativeArchitecture == kArchitectureX86 ? VX_TEXT("\\VXCOMN32U.dll") : VX_TEXT("\\VXCOMN64U.dll"))) {
        std::filesystem::create_directories(hostPath(path).parent_path());
        std::filesystem::remove(hostPath(path));
    }
    ~Installed() { std::filesystem::remove(hostPath(path)); }
    Installed(const Installed &) = delete;
    Installed &operator=(const Installed &) = delete;

    void put() const { std::filesystem::copy_file(test::selfProgram(), hostPath(path)); }
    void put(const Bytes &bytes) const { putFile(path, bytes); }

    const WideString path;
};

}  // namespace

TEST_CASE_FIXTURE(Graph, "the installed module tells the version, and its low bytes") {
    const Installed installed;
    installed.put();
    const GraphLog log;
    host->InitializeAPOPresetFile();
    CHECK(host->ModuleVersion.get() == 0x0002000100000000);
    CHECK(host->VersionBytes == std::array<uint8_t, 4>{2, 1, 0, 0});
    CHECK(log.inOrder({"Retrieving module version ...", "{ GetAPOModuleVersion()", "Returning APO module version = { 2, 1, 0, 0 }.",
                       "} GetAPOModuleVersion()", "APO module version = { 2, 1, 0, 0 }.", "Done."}));
}

TEST_CASE_FIXTURE(Graph, "where no module is installed and this one's extension is no module's the version is 0") {
    const Installed installed;
    const GraphLog log;
    host->InitializeAPOPresetFile();
    CHECK(host->ModuleVersion.get() == 0);
    CHECK(log.has("This module path = " + toUtf8(thisModulePath()) + "."));
    CHECK(log.has("Couldn't access '" + toUtf8(installed.path) + "' module file, error code = 2."));
    CHECK(log.texts().at(3).rfind("Invalid module extension '", 0) == 0);
}

TEST_CASE_FIXTURE(Graph, "an installed module without a version has version 0") {
    const Installed installed;
    installed.put(Bytes(100, 7));
    const GraphLog log;
    host->InitializeAPOPresetFile();
    CHECK(host->ModuleVersion.get() == 0);
    CHECK(log.has("Returning APO module version = { 0, 0, 0, 0 }."));
}

TEST_CASE_FIXTURE(Graph, "on a 32-bit machine the 32-bit module counts, in the folder of its kind") {
    SystemFacts facts = systemFacts();
    facts.nativeArchitecture = kArchitectureX86;
    const Installed installed(facts);
    uint64_t own = 12345;
    CHECK(GetAPOModuleVersion(*host, facts, &own) == 0);
    installed.put();
    CHECK(GetAPOModuleVersion(*host, facts, &own) == 0x0002000100000000);
    CHECK(own == 12345);  // this program is no module, so nothing is told of it
    CHECK(toUtf8(installed.path).find("SysWOW64") != std::string::npos);
}

TEST_CASE_FIXTURE(Graph, "a version's parts are sixteen bits each, major highest") {
    CHECK(versionPart(0xFFFE000300020001, 0) == 0xFFFE);
    CHECK(versionPart(0xFFFE000300020001, 1) == 3);
    CHECK(versionPart(0xFFFE000300020001, 2) == 2);
    CHECK(versionPart(0xFFFE000300020001, 3) == 1);
}
