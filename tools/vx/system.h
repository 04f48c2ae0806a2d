// SPDX-License-Identifier: MIT
//
// What vx asks of the operating system and the C++ library does not have; tools/vx/posix and tools/vx/windows hold the twins. All
// text is UTF-8.
#pragma once

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace vx {

// The command line behind the program's name. On Windows what main gets is in the code page of the day and has lost what that
// cannot spell, so it is taken from the system again, and the console is told that what is printed is UTF-8.
std::vector<std::string> commandLine(int argc, char **argv);

struct CloseFile {
    void operator()(std::FILE *file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, CloseFile>;

// Opens a file in a mode of fopen; null with errno set if the system refuses.
File openFile(const std::filesystem::path &path, const char *mode);

// 64-bit positions, whatever `long` is. Both return false for a pipe.
bool seekFile(std::FILE *file, uint64_t position);
std::optional<uint64_t> fileSize(std::FILE *file);

// The program's own standard stream, ready for bytes.
std::FILE *binaryInput();
std::FILE *binaryOutput();

// From here on a write to a pipe that nobody reads any more fails instead of ending the program.
void surviveClosedOutput();
// Whether standard output is a pipe that nobody reads any more, as far as the system tells before something is written.
bool outputClosed();

bool isTerminal(std::FILE *stream);
int terminalWidth(std::FILE *stream);
unsigned long processId();

// The folder of this program, and the file of the module that a piece of code lies in.
std::filesystem::path programFolder();
std::filesystem::path fileOfCode(const void *code);

// The names under which this platform looks for the module `name` ("X.dll"), first to last.
std::vector<std::string> moduleFileNames(const std::string &name);
// Where modules without a path are installed for the whole machine; empty if that is not known.
std::filesystem::path moduleSystemFolder();

// Loads a module only to tell why the host could not use it.
struct ModuleProbe {
    bool loads = false;
    bool hasInitialize = false;  // exports VXDSPAPI_Initialize
    std::string reason;          // the system's, if it does not load
};
ModuleProbe probeModule(const std::filesystem::path &path);

// Runs a program, found along PATH, with its output on this program's standard error stream, and waits. Its exit status; nothing if
// there is no such program.
std::optional<int> runProgram(const std::vector<std::string> &arguments);

}  // namespace vx
