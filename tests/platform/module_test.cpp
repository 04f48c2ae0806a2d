// SPDX-License-Identifier: MIT
#include "platform/module.h"

#include <doctest/doctest.h>

#include <filesystem>
#include <fstream>

#include "platform/file_version.h"
#include "tests/support/process.h"

using namespace vxcomn;
namespace fs = std::filesystem;

namespace {

constexpr const char *kName = "VxcomnTestModule.dll";
constexpr const char *kExport = "vxcomnTestModuleAnswer";

int answerOf(const Module &module) {
    const auto answer = reinterpret_cast<int (*)()>(findExport(module.get(), kExport));
    return answer != nullptr ? answer() : 0;
}

// A folder of the test's own, with a copy of the test module under another name.
struct ModuleFolder {
    fs::path folder = fs::temp_directory_path() / ("vxcomn-modules-" + std::to_string(test::processId()));
    std::string extension = toUtf8(moduleExtension());

    ModuleFolder() {
        fs::create_directories(folder);
        const fs::path built = fs::path(test::selfProgram()).parent_path() / ("VxcomnTestModule" + extension);
        fs::copy_file(built, folder / ("Elsewhere" + extension), fs::copy_options::overwrite_existing);
    }
    ~ModuleFolder() {
        std::error_code ignored;
        fs::remove_all(folder, ignored);
    }
    std::string path(const std::string &name) const { return (folder / (name + extension)).string(); }
};

}  // namespace

TEST_CASE("a module loads by its name from the program's folder and tells its exports") {
    Status why = 99;
    const Module module = loadModule(kName, &why);
    REQUIRE(module);
    CHECK(why == status::ok);
    CHECK(answerOf(module) == 42);
    CHECK(findExport(module.get(), "noSuchExport") == nullptr);
    CHECK(findExport(nullptr, kExport) == nullptr);
    CHECK(findExport(module.get(), nullptr) == nullptr);
}

TEST_CASE("a module loaded twice is one module with two references") {
    const Module first = loadModule(kName);
    Module second = loadModule(kName);
    CHECK(first.get() == second.get());
    CHECK(freeModule(second.release()) != 0);
    CHECK(answerOf(first) == 42);
}

TEST_CASE("freeing no module fails") {
    CHECK(freeModule(nullptr) == 0);
}

TEST_CASE("a module that is not there, or has no name, answers 126") {
    Status why = 0;
    CHECK_FALSE(loadModule("VxcomnNoSuchModule.dll", &why));
    CHECK(why == status::modNotFound);
    CHECK_FALSE(loadModule("", &why));
    CHECK(why == status::modNotFound);
    CHECK_FALSE(loadModule(nullptr, &why));
    CHECK(why == status::modNotFound);
    CHECK_FALSE(loadModule("VxcomnNoSuchModule.dll"));
}

TEST_CASE("a file that is no module answers 193") {
    const ModuleFolder folder;
    std::ofstream(folder.path("Text")) << "This is a text and no module, however long it may be.\n" << std::string(4096, 'x');
    Status why = 0;
    CHECK_FALSE(loadModule(folder.path("Text").c_str(), &why));
    CHECK(why == status::badExeFormat);
}

TEST_CASE("a module loads by its path") {
    const ModuleFolder folder;
    const Module module = loadModule(folder.path("Elsewhere").c_str());
    CHECK(answerOf(module) == 42);
}

TEST_CASE("a folder added to the search is found in, and replaces an earlier one") {
    const ModuleFolder folder;
    CHECK_FALSE(loadModule("Elsewhere.dll"));
    setModuleDirectory(toWide(folder.folder.string()));
    CHECK(answerOf(loadModule("Elsewhere.dll")) == 42);
    CHECK(answerOf(loadModule(kName)) == 42);  // the program's folder still counts
    setModuleDirectory(toWide((folder.folder / "empty").string()));
    CHECK_FALSE(loadModule("Elsewhere.dll"));
    setModuleDirectory({});
}

TEST_CASE("this library's own path is that of the file that it is linked into") {
    const std::string path = toUtf8(thisModulePath());
    CHECK(fs::equivalent(path, test::selfProgram()));
    CHECK(fs::path(path).is_absolute());
}

TEST_CASE("the library's file bears version 2.1.0.0") {
    Status why = 99;
    CHECK(fileVersion(thisModulePath(), &why) == 0x0002000100000000u);
    CHECK(why == status::ok);
}

TEST_CASE("a file without a version, one that is no module, and one that is not there say so") {
    const ModuleFolder folder;
    Status why = 0;
    CHECK_FALSE(fileVersion(toWide(folder.path("Elsewhere")), &why));
    CHECK(why == status::resourceTypeNotFound);
    std::ofstream(folder.path("Text")) << "This is a text.";
    CHECK_FALSE(fileVersion(toWide(folder.path("Text")), &why));
    CHECK(why == status::badExeFormat);
    std::ofstream(folder.path("Empty")).flush();
    CHECK_FALSE(fileVersion(toWide(folder.path("Empty")), &why));
    CHECK(why == status::badExeFormat);
    CHECK_FALSE(fileVersion(toWide(folder.path("Missing")), &why));
    CHECK(why == status::fileNotFound);
    CHECK_FALSE(fileVersion(toWide(folder.path("Missing"))));
}
