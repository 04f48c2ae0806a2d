// SPDX-License-Identifier: MIT
//
// A file that a verb makes. It is written under a temporary name in its own folder and takes its real name only when all is well,
// so that a failed run leaves no half file, and an existing file stays whole until then. Nothing is written over unasked. Standard
// output ("-") and things that are no regular files, such as devices and pipes, are written straight.
#pragma once

#include <cstdio>
#include <filesystem>
#include <string>

#include "tools/vx/system.h"

namespace vx {

class OutputFile {
  public:
    // Fails if the file exists and `force` is not given, or if its folder takes no file.
    OutputFile(const std::string &path, bool force);
    OutputFile(const OutputFile &) = delete;
    OutputFile &operator=(const OutputFile &) = delete;
    ~OutputFile();

    const std::string &path() const { return path_; }
    // Where to write for now.
    const std::filesystem::path &writePath() const { return writePath_; }
    std::FILE *stream() const { return stream_; }
    bool isRegular() const { return temporary_; }

    // Everything that is written goes through here: fails with the system's reason.
    void write(const void *bytes, size_t count);
    void writeText(const std::string &text) { write(text.data(), text.size()); }
    void seek(uint64_t position);

    // Closes the file and gives it its real name.
    void commit();
    // For writers that open writePath() on their own.
    void closeStream();

  private:
    [[noreturn]] void fail(int error) const;

    std::string path_;
    std::filesystem::path target_;
    std::filesystem::path writePath_;
    File owned_;
    std::FILE *stream_ = nullptr;
    bool temporary_ = false;
    bool force_ = false;
};

// Fails if `path` is a regular file that is there and `force` is not given: for outputs that are only begun at the end of a run.
void checkMayWrite(const std::string &path, bool force);

}  // namespace vx
