// SPDX-License-Identifier: MIT
//
// Catches what this process writes to the debugger output, and a log file for the logger's file sink.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "platform/log_file.h"

namespace vxcomn::testing {

// Catches lines from its construction to its end. One at a time.
class DebugCapture {
  public:
    DebugCapture();
    ~DebugCapture();
    DebugCapture(const DebugCapture &) = delete;
    DebugCapture &operator=(const DebugCapture &) = delete;

    // The lines so far, without their line feeds, as UTF-8.
    std::vector<std::string> lines() const;

  private:
    struct Impl;
    Impl *impl_;
};

// A log file in the temporary folder.
class TemporaryLog {
  public:
    TemporaryLog();
    ~TemporaryLog();
    TemporaryLog(const TemporaryLog &) = delete;
    TemporaryLog &operator=(const TemporaryLog &) = delete;

    void *handle() const { return file_.get(); }
    std::string text() const;

  private:
    std::filesystem::path path_;
    LogFileHandle file_;
};

}  // namespace vxcomn::testing
