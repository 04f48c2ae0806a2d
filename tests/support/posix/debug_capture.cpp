// SPDX-License-Identifier: MIT
#include "tests/support/debug_capture.h"

#include <unistd.h>

#include <cstdlib>
#include <fstream>

namespace vxcomn::testing {

struct DebugCapture::Impl {
    std::string path;
};

DebugCapture::DebugCapture() : impl_(new Impl) {
    std::string path = (std::filesystem::temp_directory_path() / "vxcomn-debug-XXXXXX").string();
    ::close(::mkstemp(path.data()));
    impl_->path = path;
    ::setenv("VXCOMN_DEBUG_OUTPUT", path.c_str(), 1);
}

DebugCapture::~DebugCapture() {
    ::unsetenv("VXCOMN_DEBUG_OUTPUT");
    std::error_code ignored;
    std::filesystem::remove(impl_->path, ignored);
    delete impl_;
}

std::vector<std::string> DebugCapture::lines() const {
    std::ifstream in(impl_->path, std::ios::binary);
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
}

}  // namespace vxcomn::testing
