// SPDX-License-Identifier: MIT
#include "tests/support/process.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <stdexcept>
#include <thread>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

extern char **environ;

namespace test {
namespace {

std::string readToEnd(int file) {
    std::string all;
    std::array<char, 4096> piece;
    for (;;) {
        const ssize_t count = read(file, piece.data(), piece.size());
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return all;
        all.append(piece.data(), static_cast<size_t>(count));
    }
}

std::vector<std::string> mergedEnvironment(const Environment &changes) {
    std::vector<std::string> all;
    for (char **entry = environ; *entry != nullptr; ++entry) {
        bool changed = false;
        for (const auto &[name, value] : changes) changed |= std::strncmp(*entry, (name + "=").c_str(), name.size() + 1) == 0;
        if (!changed) all.emplace_back(*entry);
    }
    for (const auto &[name, value] : changes) all.push_back(name + "=" + value);
    return all;
}

std::vector<char *> pointers(std::vector<std::string> &texts) {
    std::vector<char *> all;
    for (std::string &text : texts) all.push_back(text.data());
    all.push_back(nullptr);
    return all;
}

}  // namespace

struct Process::Impl {
    pid_t child = 0;
    bool ended = false;
    int status = 0;
    int input = -1, output = -1;
    std::string unread;
    std::string errorText;
    std::thread errorReader;

    void closeInput() {
        if (input >= 0) close(input);
        input = -1;
    }

    void reap() {
        if (ended) return;
        int result = 0;
        while (waitpid(child, &result, 0) < 0 && errno == EINTR) {
        }
        ended = true;
        status = WIFEXITED(result) ? WEXITSTATUS(result) : -1;
        errorReader.join();
    }
};

Process::Process(const std::string &program, const std::vector<std::string> &arguments, const Environment &environment)
    : impl_(std::make_unique<Impl>()) {
    signal(SIGPIPE, SIG_IGN);  // a child that has ended must not end the test
    int in[2], out[2], errors[2];
    if (pipe2(in, O_CLOEXEC) != 0 || pipe2(out, O_CLOEXEC) != 0 || pipe2(errors, O_CLOEXEC) != 0) throw std::runtime_error("pipe");
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, in[0], STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&actions, out[1], STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&actions, errors[1], STDERR_FILENO);
    std::vector<std::string> words{program};
    words.insert(words.end(), arguments.begin(), arguments.end());
    std::vector<std::string> variables = mergedEnvironment(environment);
    const int failure =
        posix_spawn(&impl_->child, program.c_str(), &actions, nullptr, pointers(words).data(), pointers(variables).data());
    posix_spawn_file_actions_destroy(&actions);
    close(in[0]);
    close(out[1]);
    close(errors[1]);
    impl_->input = in[1];
    impl_->output = out[0];
    if (failure != 0) throw std::runtime_error("cannot start " + program + ": " + std::strerror(failure));
    impl_->errorReader = std::thread([impl = impl_.get(), file = errors[0]] {
        impl->errorText = readToEnd(file);
        close(file);
    });
}

Process::Process(Process &&) noexcept = default;

Process::~Process() {
    if (!impl_) return;
    if (!impl_->ended) kill();
    impl_->closeInput();
    close(impl_->output);
}

void Process::write(const std::string &text) {
    for (size_t done = 0; done < text.size();) {
        const ssize_t count = ::write(impl_->input, text.data() + done, text.size() - done);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return;
        done += static_cast<size_t>(count);
    }
}

void Process::closeInput() {
    impl_->closeInput();
}

std::optional<std::string> Process::readLine() {
    for (;;) {
        if (const size_t end = impl_->unread.find('\n'); end != std::string::npos) {
            std::string line = impl_->unread.substr(0, end);
            impl_->unread.erase(0, end + 1);
            return line;
        }
        std::array<char, 4096> piece;
        const ssize_t count = read(impl_->output, piece.data(), piece.size());
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return std::nullopt;
        impl_->unread.append(piece.data(), static_cast<size_t>(count));
    }
}

std::string Process::readAll() {
    std::string all = impl_->unread + readToEnd(impl_->output);
    impl_->unread.clear();
    return all;
}

void Process::kill() {
    ::kill(impl_->child, SIGKILL);
    impl_->reap();
}

int Process::wait() {
    impl_->closeInput();
    readAll();
    impl_->reap();
    return impl_->status;
}

std::string Process::errors() {
    return impl_->errorText;
}

std::string selfProgram() {
    std::array<char, 4096> path;
    const ssize_t length = readlink("/proc/self/exe", path.data(), path.size());
    return std::string(path.data(), length > 0 ? static_cast<size_t>(length) : 0);
}

uint32_t processId() {
    return static_cast<uint32_t>(getpid());
}

}  // namespace test
