// SPDX-License-Identifier: MIT
//
// The machine: one folder that stands for what is machine-wide on Windows. It is the one that VXCOMN_ROOT names, else
// /var/lib/vxcomn where that can be written, else $XDG_STATE_HOME/vxcomn or ~/.local/state/vxcomn. It holds `registry.db`,
// `signals`, `tokens` and `drive_c`. The first use in a process chooses it, and makes it where it is missing; it stays for the life
// of the process. Control threads.
#pragma once

#include <optional>
#include <string>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// The folder's absolute path, without a slash at its end.
Status machineRoot(std::string &root);

// The file system's path for a path as the library spells it. `C:\x\y` and `\x\y` lie in drive_c, with the case of names as given;
// a path that begins with `/` is taken as it is; another one is relative, with its backslashes turned. Nothing if the path names
// another drive, climbs out of drive C, or holds a NUL.
std::optional<std::string> nativePath(WideView path);

}  // namespace vxcomn
