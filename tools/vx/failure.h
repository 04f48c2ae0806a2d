// SPDX-License-Identifier: MIT
//
// The exit statuses of vx and the one way to fail. Apart from verb.h, because what parses command lines takes long to compile.
#pragma once

#include <stdexcept>
#include <string>

namespace vx {

enum class ExitStatus : int {
    ok = 0,
    found = 1,   // a check failed or something was found
    usage = 2,   // the command line
    input = 3,   // an input file, engine or endpoint is not usable
    system = 4,  // the system refused: rights, device busy, disk full
};

// Ends a verb. The message says what, what was found, what was expected, and what to do; main prints it behind "vx: ".
class Failure : public std::runtime_error {
  public:
    Failure(ExitStatus exitStatus, const std::string &message) : std::runtime_error(message), status(exitStatus) {}

    ExitStatus status;
};

}  // namespace vx
