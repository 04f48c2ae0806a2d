// SPDX-License-Identifier: MIT
#include "tests/support/helper.h"

#include <cstdio>
#include <map>

namespace test {
namespace {

std::map<std::string, HelperFunction> &helpers() {
    static std::map<std::string, HelperFunction> all;
    return all;
}

}  // namespace

Helper::Helper(const char *name, HelperFunction function) {
    helpers()[name] = function;
}

bool runHelper(int argc, char **argv, int &result) {
    if (argc < 3 || std::string(argv[1]) != "--helper") return false;
    const auto found = helpers().find(argv[2]);
    if (found == helpers().end()) {
        std::fprintf(stderr, "no helper '%s'\n", argv[2]);
        result = 2;
    } else {
        result = found->second(std::vector<std::string>(argv + 3, argv + argc));
    }
    return true;
}

void sayLine(const std::string &line) {
    std::fputs((line + "\n").c_str(), stdout);
    std::fflush(stdout);
}

}  // namespace test
