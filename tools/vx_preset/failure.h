// SPDX-License-Identifier: MIT
//
// How a preset verb ends when it cannot go on: an exit status and a message that says what was found where, what was expected and
// what to do. Thrown by the parts of a verb, caught where the verbs are registered.
#pragma once

#include <stdexcept>
#include <string>

namespace vx::preset {

enum class Exit : int {
    well = 0,
    found = 1,   // a check failed or a difference was found
    usage = 2,   // the command line
    input = 3,   // an input file is not usable
    system = 4,  // the system refused
};

class Failure : public std::runtime_error {
  public:
    Failure(Exit exit, const std::string &message) : std::runtime_error(message), exit_(exit) {}
    Exit exit() const noexcept { return exit_; }

  private:
    Exit exit_;
};

}  // namespace vx::preset
