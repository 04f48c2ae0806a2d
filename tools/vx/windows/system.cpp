// SPDX-License-Identifier: MIT
#include "tools/vx/system.h"

#include <fcntl.h>
#include <io.h>
#include <windows.h>

#include <shellapi.h>

#include <string>

namespace vx {
namespace fs = std::filesystem;

namespace {

constexpr int kUsualWidth = 80;
constexpr DWORD kLongestPath = 32768;

fs::path pathOfModule(HMODULE module) {
    std::wstring path(kLongestPath, L'\0');
    path.resize(GetModuleFileNameW(module, path.data(), kLongestPath));
    return fs::path(path);
}

std::wstring wide(const std::string &text) {
    return fs::path(std::u8string(text.begin(), text.end())).wstring();
}

// One argument as the receiving program's start-up code takes it apart again: backslashes count only in front of a quotation mark.
std::wstring quoted(const std::wstring &argument) {
    std::wstring result = L"\"";
    size_t backslashes = 0;
    for (const wchar_t unit : argument) {
        if (unit == L'"') result.append(backslashes + 1, L'\\');
        backslashes = unit == L'\\' ? backslashes + 1 : 0;
        result += unit;
    }
    return result.append(backslashes, L'\\') + L"\"";
}

std::FILE *binary(std::FILE *stream) {
    _setmode(_fileno(stream), _O_BINARY);
    return stream;
}

}  // namespace

std::vector<std::string> commandLine(int, char **) {
    SetConsoleOutputCP(CP_UTF8);
    int count = 0;
    LPWSTR *list = CommandLineToArgvW(GetCommandLineW(), &count);
    std::vector<std::string> arguments;
    for (int i = 1; i < count; ++i) {
        const std::u8string text = fs::path(list[i]).u8string();
        arguments.emplace_back(text.begin(), text.end());
    }
    LocalFree(static_cast<HLOCAL>(list));
    return arguments;
}

File openFile(const fs::path &path, const char *mode) {
    const std::string text = mode;
    return File(_wfopen(path.c_str(), std::wstring(text.begin(), text.end()).c_str()));
}

bool seekFile(std::FILE *file, uint64_t position) {
    return _fseeki64(file, static_cast<int64_t>(position), SEEK_SET) == 0;
}

std::optional<uint64_t> fileSize(std::FILE *file) {
    const auto handle = reinterpret_cast<HANDLE>(_get_osfhandle(_fileno(file)));
    LARGE_INTEGER size = {};
    if (GetFileType(handle) != FILE_TYPE_DISK || GetFileSizeEx(handle, &size) == 0) return std::nullopt;
    return static_cast<uint64_t>(size.QuadPart);
}

std::FILE *binaryInput() {
    return binary(stdin);
}
std::FILE *binaryOutput() {
    return binary(stdout);
}

void surviveClosedOutput() {}

bool outputClosed() {
    return false;
}

bool isTerminal(std::FILE *stream) {
    DWORD mode = 0;
    return GetConsoleMode(reinterpret_cast<HANDLE>(_get_osfhandle(_fileno(stream))), &mode) != 0;
}

int terminalWidth(std::FILE *stream) {
    CONSOLE_SCREEN_BUFFER_INFO info = {};
    if (GetConsoleScreenBufferInfo(reinterpret_cast<HANDLE>(_get_osfhandle(_fileno(stream))), &info) == 0) return kUsualWidth;
    return info.srWindow.Right - info.srWindow.Left + 1;
}

unsigned long processId() {
    return GetCurrentProcessId();
}

fs::path programFolder() {
    return pathOfModule(nullptr).parent_path();
}

fs::path fileOfCode(const void *code) {
    HMODULE module = nullptr;
    const DWORD flags = GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT;
    const auto address = static_cast<LPCWSTR>(code);
    return GetModuleHandleExW(flags, address, &module) != 0 ? pathOfModule(module) : fs::path();
}

std::vector<std::string> moduleFileNames(const std::string &name) {
    return {name};
}

fs::path moduleSystemFolder() {
    std::wstring path(kLongestPath, L'\0');
    path.resize(GetSystemDirectoryW(path.data(), kLongestPath));
    return fs::path(path);
}

ModuleProbe probeModule(const fs::path &path) {
    ModuleProbe probe;
    std::error_code ignored;
    const HMODULE module = LoadLibraryW(fs::absolute(path, ignored).c_str());
    if (module == nullptr) {
        probe.reason = "LoadLibrary failed with Windows error " + std::to_string(GetLastError());
        return probe;
    }
    probe.loads = true;
    probe.hasInitialize = GetProcAddress(module, "VXDSPAPI_Initialize") != nullptr;
    FreeLibrary(module);
    return probe;
}

std::optional<int> runProgram(const std::vector<std::string> &arguments) {
    std::wstring line;
    for (const std::string &argument : arguments) line += (line.empty() ? L"" : L" ") + quoted(wide(argument));
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    startup.dwFlags = STARTF_USESTDHANDLES;
    startup.hStdInput = GetStdHandle(STD_INPUT_HANDLE);
    startup.hStdOutput = startup.hStdError = GetStdHandle(STD_ERROR_HANDLE);
    PROCESS_INFORMATION process = {};
    if (CreateProcessW(nullptr, line.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup, &process) == 0)
        return std::nullopt;
    WaitForSingleObject(process.hProcess, INFINITE);
    DWORD status = 1;
    GetExitCodeProcess(process.hProcess, &status);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    return static_cast<int>(status);
}

}  // namespace vx
