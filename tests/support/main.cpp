// SPDX-License-Identifier: MIT
//
// The main function of every test program: gives the process a machine root of its own, runs the tests, and takes the root away. A
// helper (helper.h) runs instead in the root of the test that started it.
#define DOCTEST_CONFIG_IMPLEMENT
#include <doctest/doctest.h>

#include <cstdlib>
#include <filesystem>
#include <random>
#include <string>

#include "tests/support/helper.h"

namespace {

void setVariable(const char *name, const std::string &value) {
#if defined(__MINGW32__)
    _putenv_s(name, value.c_str());
#else
    setenv(name, value.c_str(), 1);
#endif
}

}  // namespace

int main(int argc, char **argv) {
    int helperResult = 0;
    if (test::runHelper(argc, argv, helperResult)) return helperResult;

    namespace fs = std::filesystem;
    std::random_device random;
    const fs::path root = fs::temp_directory_path() / ("vxcomn-test-" + std::to_string(random()));
    fs::create_directories(root);
    if (std::getenv("VXCOMN_ROOT") == nullptr) setVariable("VXCOMN_ROOT", root.string());

    doctest::Context context(argc, argv);
    const int result = context.run();

    std::error_code ignored;
    fs::remove_all(root, ignored);
    return result;
}
