// SPDX-License-Identifier: MIT
#include "tests/support/process.h"

#include <array>
#include <stdexcept>
#include <thread>

#include <windows.h>

namespace test {
namespace {

std::string readToEnd(HANDLE file) {
    std::string all;
    std::array<char, 4096> piece;
    DWORD count = 0;
    while (ReadFile(file, piece.data(), piece.size(), &count, nullptr) != 0 && count > 0) all.append(piece.data(), count);
    return all;
}

std::string withPlainLineFeeds(const std::string &text) {
    std::string plain;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '\r' || i + 1 == text.size() || text[i + 1] != '\n') plain.push_back(text[i]);
    }
    return plain;
}

std::wstring wide(const std::string &utf8) {
    std::wstring text(static_cast<size_t>(MultiByteToWideChar(CP_UTF8, 0, utf8.data(), static_cast<int>(utf8.size()), nullptr, 0)),
                      0);
    MultiByteToWideChar(CP_UTF8, 0, utf8.data(), static_cast<int>(utf8.size()), text.data(), static_cast<int>(text.size()));
    return text;
}

// One argument so that the child's start-up code takes it apart to the same text again: backslashes count only ahead of a quote.
std::string quoted(const std::string &argument) {
    std::string text = "\"";
    size_t backslashes = 0;
    for (const char c : argument) {
        if (c == '"') text.append(backslashes + 1, '\\');
        backslashes = c == '\\' ? backslashes + 1 : 0;
        text.push_back(c);
    }
    return text.append(backslashes, '\\').append("\"");
}

// A pipe of which the child inherits one end.
void makePipe(HANDLE &childEnd, HANDLE &ownEnd, bool childReads) {
    SECURITY_ATTRIBUTES inherit{sizeof inherit, nullptr, TRUE};
    HANDLE reading = nullptr, writing = nullptr;
    if (CreatePipe(&reading, &writing, &inherit, 0) == 0) throw std::runtime_error("pipe");
    childEnd = childReads ? reading : writing;
    ownEnd = childReads ? writing : reading;
    SetHandleInformation(ownEnd, HANDLE_FLAG_INHERIT, 0);
}

}  // namespace

struct Process::Impl {
    HANDLE child = nullptr;
    bool ended = false, killed = false;
    int status = 0;
    HANDLE input = nullptr, output = nullptr;
    std::string unread;
    std::string errorText;
    std::thread errorReader;

    void closeInput() {
        if (input != nullptr) CloseHandle(input);
        input = nullptr;
    }

    void reap() {
        if (ended) return;
        WaitForSingleObject(child, INFINITE);
        DWORD code = 0;
        GetExitCodeProcess(child, &code);
        ended = true;
        status = killed ? -1 : static_cast<int>(code);
        errorReader.join();
    }
};

Process::Process(const std::string &program, const std::vector<std::string> &arguments, const Environment &environment)
    : impl_(std::make_unique<Impl>()) {
    HANDLE in = nullptr, out = nullptr, errors = nullptr, errorOutput = nullptr;
    makePipe(in, impl_->input, true);
    makePipe(out, impl_->output, false);
    makePipe(errors, errorOutput, false);
    std::string line = quoted(program);
    for (const std::string &argument : arguments) line.append(" ").append(quoted(argument));
    std::wstring command = wide(line);
    STARTUPINFOW start{};
    start.cb = sizeof start;
    start.dwFlags = STARTF_USESTDHANDLES;
    start.hStdInput = in;
    start.hStdOutput = out;
    start.hStdError = errors;
    // The child takes the environment as it is at this moment.
    for (const auto &[name, value] : environment) SetEnvironmentVariableW(wide(name).c_str(), wide(value).c_str());
    PROCESS_INFORMATION started{};
    const BOOL done = CreateProcessW(nullptr, command.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr, &start, &started);
    for (const auto &change : environment) SetEnvironmentVariableW(wide(change.first).c_str(), nullptr);
    CloseHandle(in);
    CloseHandle(out);
    CloseHandle(errors);
    if (done == 0) throw std::runtime_error("cannot start " + program);
    CloseHandle(started.hThread);
    impl_->child = started.hProcess;
    impl_->errorReader = std::thread([impl = impl_.get(), errorOutput] {
        impl->errorText = withPlainLineFeeds(readToEnd(errorOutput));
        CloseHandle(errorOutput);
    });
}

Process::Process(Process &&) noexcept = default;

Process::~Process() {
    if (!impl_) return;
    if (!impl_->ended) kill();
    impl_->closeInput();
    CloseHandle(impl_->output);
    CloseHandle(impl_->child);
}

void Process::write(const std::string &text) {
    for (size_t done = 0; done < text.size();) {
        DWORD count = 0;
        if (WriteFile(impl_->input, text.data() + done, static_cast<DWORD>(text.size() - done), &count, nullptr) == 0) return;
        done += count;
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
            if (line.ends_with('\r')) line.pop_back();
            return line;
        }
        std::array<char, 4096> piece;
        DWORD count = 0;
        if (ReadFile(impl_->output, piece.data(), piece.size(), &count, nullptr) == 0 || count == 0) return std::nullopt;
        impl_->unread.append(piece.data(), count);
    }
}

std::string Process::readAll() {
    std::string all = withPlainLineFeeds(impl_->unread + readToEnd(impl_->output));
    impl_->unread.clear();
    return all;
}

void Process::kill() {
    impl_->killed = true;
    TerminateProcess(impl_->child, 1);
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
    std::wstring path(1024, 0);
    path.resize(GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size())));
    std::string utf8(static_cast<size_t>(
                         WideCharToMultiByte(CP_UTF8, 0, path.data(), static_cast<int>(path.size()), nullptr, 0, nullptr, nullptr)),
                     0);
    WideCharToMultiByte(CP_UTF8, 0, path.data(), static_cast<int>(path.size()), utf8.data(), static_cast<int>(utf8.size()), nullptr,
                        nullptr);
    return utf8;
}

uint32_t processId() {
    return GetCurrentProcessId();
}

}  // namespace test
