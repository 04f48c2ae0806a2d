// SPDX-License-Identifier: MIT
#include "tests/support/debug_capture.h"

#include <fstream>
#include <iterator>
#include <random>

namespace vxcomn::testing {

TemporaryLog::TemporaryLog()
    : path_(std::filesystem::temp_directory_path() / ("vxcomn-log-" + std::to_string(std::random_device()()))) {
    file_ = openLogFile(toWide(path_.string()));
}

TemporaryLog::~TemporaryLog() {
    file_.reset();
    std::error_code ignored;
    std::filesystem::remove(path_, ignored);
}

std::string TemporaryLog::text() const {
    std::ifstream in(path_, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

}  // namespace vxcomn::testing
