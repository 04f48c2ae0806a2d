// SPDX-License-Identifier: MIT
#include "platform/posix/machine_root.h"

#include <cerrno>
#include <cstdlib>
#include <mutex>
#include <vector>

#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/environment.h"
#include "platform/posix/open_to_all.h"
#include "platform/posix/system_status.h"

namespace vxcomn {
namespace {

constexpr const char *kSystemRoot = "/var/lib/vxcomn";

// Makes a folder with all above it. What others make at the same time is no failure.
Status makeFolders(const std::string &path) {
    for (size_t end = 1; end != std::string::npos;) {
        end = path.find('/', end);
        const std::string folder = path.substr(0, end);
        if (end != std::string::npos) ++end;
        const bool isLast = end == std::string::npos;
        // The folders above the machine's own are the user's, made as the user makes folders.
        if (isLast ? makeFolderForAll(folder) : mkdir(folder.c_str(), 0777) == 0 || errno == EEXIST) continue;
        // Above the root there may be folders that we see but must not write in.
        const int reason = errno;
        struct stat there;
        if (stat(folder.c_str(), &there) != 0) return statusOfErrno(reason);
    }
    struct stat made;
    if (stat(path.c_str(), &made) != 0) return statusOfErrno(errno);
    return S_ISDIR(made.st_mode) ? status::ok : status::pathNotFound;
}

std::string homeFolder() {
    if (const auto home = environmentVariable("HOME"); home && !home->empty()) return *home;
    passwd entry;
    passwd *found = nullptr;
    std::vector<char> buffer(16384);
    if (getpwuid_r(getuid(), &entry, buffer.data(), buffer.size(), &found) == 0 && found != nullptr) return found->pw_dir;
    return "/";
}

// The folder by the rules above, made.
Status chooseRoot(std::string &root) {
    const auto named = environmentVariable("VXCOMN_ROOT");
    const auto state = environmentVariable("XDG_STATE_HOME");
    if (named && !named->empty()) {
        root = *named;
    } else if (makeFolders(kSystemRoot) == status::ok && access(kSystemRoot, W_OK | X_OK) == 0) {
        root = kSystemRoot;
        return status::ok;
    } else if (state && state->starts_with('/')) {  // a relative one is to be ignored, by the rules for that variable
        root = *state + "/vxcomn";
    } else {
        root = homeFolder() + "/.local/state/vxcomn";
    }
    if (!root.starts_with('/')) {
        char *here = getcwd(nullptr, 0);
        if (here == nullptr) return statusOfErrno(errno);
        root = std::string(here) + "/" + root;
        std::free(here);
    }
    while (root.size() > 1 && root.ends_with('/')) root.pop_back();
    return makeFolders(root);
}

std::mutex rootMutex;
std::string &chosenRoot() {
    static std::string root;
    return root;
}

// The parts of a path inside drive C, joined by slashes; nothing if it climbs out.
std::optional<std::string> insideDrive(WideView path) {
    std::vector<std::string> parts;
    while (!path.empty()) {
        const size_t end = path.find_first_of(VX_TEXT("\\/"));
        const WideView part = path.substr(0, end);
        path.remove_prefix(end == WideView::npos ? path.size() : end + 1);
        if (part.empty() || part == VX_TEXT(".")) continue;
        if (part != VX_TEXT("..")) {
            parts.push_back(toUtf8(part));
        } else if (parts.empty()) {
            return std::nullopt;
        } else {
            parts.pop_back();
        }
    }
    std::string joined;
    for (const std::string &part : parts) joined += "/" + part;
    return joined;
}

}  // namespace

Status machineRoot(std::string &root) {
    const std::lock_guard lock(rootMutex);
    std::string &chosen = chosenRoot();
    if (chosen.empty()) {
        std::string made;
        if (const Status status = chooseRoot(made); status != status::ok) return status;
        chosen = made;
    }
    root = chosen;
    return status::ok;
}

std::optional<std::string> nativePath(WideView path) {
    if (path.empty() || path.find(VXWCHAR{0}) != WideView::npos) return std::nullopt;
    if (path.front() == '/') return toUtf8(path);
    const bool hasDrive = path.size() >= 2 && path[1] == ':';
    if (!hasDrive && path.front() != '\\') {
        std::string relative = toUtf8(path);
        for (char &c : relative) {
            if (c == '\\') c = '/';
        }
        return relative;
    }
    if (hasDrive) {
        // `C:x` means a place that only a Windows process has, its folder on that drive.
        const bool onDriveC = path[0] == 'C' || path[0] == 'c';
        if (!onDriveC || path.size() < 3 || (path[2] != '\\' && path[2] != '/')) return std::nullopt;
        path.remove_prefix(2);
    }
    const auto inside = insideDrive(path);
    std::string root;
    if (!inside || machineRoot(root) != status::ok) return std::nullopt;
    return root + "/drive_c" + *inside;
}

}  // namespace vxcomn
