// SPDX-License-Identifier: MIT
#include "tools/vx/system.h"

#include <dlfcn.h>
#include <poll.h>
#include <spawn.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>

extern char **environ;

namespace vx {
namespace fs = std::filesystem;

namespace {

constexpr int kUsualWidth = 80;
constexpr int kNoSuchCommand = 127;

fs::path homeMachineFolder() {
    const char *state = std::getenv("XDG_STATE_HOME");
    if (state != nullptr && *state != '\0') return fs::path(state) / "vxcomn";
    const char *home = std::getenv("HOME");
    return home == nullptr ? fs::path() : fs::path(home) / ".local/state/vxcomn";
}

}  // namespace

std::vector<std::string> commandLine(int argc, char **argv) {
    return argc > 1 ? std::vector<std::string>(argv + 1, argv + argc) : std::vector<std::string>();
}

File openFile(const fs::path &path, const char *mode) {
    return File(std::fopen(path.c_str(), mode));
}

bool seekFile(std::FILE *file, uint64_t position) {
    return fseeko(file, static_cast<off_t>(position), SEEK_SET) == 0;
}

std::optional<uint64_t> fileSize(std::FILE *file) {
    struct stat status = {};
    if (fstat(fileno(file), &status) != 0 || !S_ISREG(status.st_mode)) return std::nullopt;
    return static_cast<uint64_t>(status.st_size);
}

std::FILE *binaryInput() {
    return stdin;
}
std::FILE *binaryOutput() {
    return stdout;
}

void surviveClosedOutput() {
    std::signal(SIGPIPE, SIG_IGN);
}

bool outputClosed() {
    pollfd output = {STDOUT_FILENO, 0, 0};
    return poll(&output, 1, 0) > 0 && (output.revents & POLLERR) != 0;
}

bool isTerminal(std::FILE *stream) {
    return isatty(fileno(stream)) != 0;
}

int terminalWidth(std::FILE *stream) {
    winsize size = {};
    return ioctl(fileno(stream), TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : kUsualWidth;
}

unsigned long processId() {
    return static_cast<unsigned long>(getpid());
}

fs::path programFolder() {
    std::error_code ignored;
    return fs::read_symlink("/proc/self/exe", ignored).parent_path();
}

fs::path fileOfCode(const void *code) {
    Dl_info info = {};
    if (dladdr(code, &info) == 0 || info.dli_fname == nullptr) return {};
    std::error_code ignored;
    return fs::absolute(info.dli_fname, ignored);
}

std::vector<std::string> moduleFileNames(const std::string &name) {
    const std::string ending = ".dll";
    if (!name.ends_with(ending)) return {name};
    return {name, name.substr(0, name.size() - ending.size()) + ".so"};
}

fs::path moduleSystemFolder() {
    const char *named = std::getenv("VXCOMN_ROOT");
    fs::path root = named != nullptr && *named != '\0' ? fs::path(named) : fs::path("/var/lib/vxcomn");
    if (named == nullptr && access(root.c_str(), W_OK) != 0 && access(root.parent_path().c_str(), W_OK) != 0)
        root = homeMachineFolder();
    return root.empty() ? root : root / "drive_c/Windows/System32";
}

ModuleProbe probeModule(const fs::path &path) {
    ModuleProbe probe;
    std::error_code ignored;
    void *module = dlopen(fs::absolute(path, ignored).c_str(), RTLD_NOW | RTLD_LOCAL);
    if (module == nullptr) {
        const char *why = dlerror();
        probe.reason = why == nullptr ? "unknown" : why;
        return probe;
    }
    probe.loads = true;
    probe.hasInitialize = dlsym(module, "VXDSPAPI_Initialize") != nullptr;
    dlclose(module);
    return probe;
}

std::optional<int> runProgram(const std::vector<std::string> &arguments) {
    std::vector<char *> pointers;
    for (const std::string &argument : arguments) pointers.push_back(const_cast<char *>(argument.c_str()));
    pointers.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, STDERR_FILENO, STDOUT_FILENO);
    pid_t child = 0;
    const int refused = posix_spawnp(&child, pointers[0], &actions, nullptr, pointers.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (refused != 0) return std::nullopt;
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (!WIFEXITED(status)) return 128 + WTERMSIG(status);
    if (WEXITSTATUS(status) == kNoSuchCommand) return std::nullopt;
    return WEXITSTATUS(status);
}

}  // namespace vx
