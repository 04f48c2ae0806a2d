// SPDX-License-Identifier: MIT
//
// vxreg, the registry on the command line, with the syntax and the layout of Windows' `reg`, so that one script serves both
// platforms: what the verbs share. Each verb stands in a file of its own.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "tools/vxreg/key_name.h"

namespace vxreg {

// What a verb ends with: its message goes to the standard error stream and the exit status is 1.
struct Failure {
    std::string message;
};

[[noreturn]] void failSyntax(const std::string &verb, const std::string &what);
// For a status other than ok of a call about `what`.
[[noreturn]] void failStatus(vxcomn::Status status, const std::string &what);

// The key and the switches of a command line. A switch stands there at most once; an unknown one is an error.
struct Command {
    KeyName key;
    std::optional<std::string> value;      // /v NAME; empty for /ve
    std::optional<std::string> type;       // /t TYPE
    std::optional<std::string> data;       // /d DATA
    std::optional<std::string> separator;  // /s TEXT of add
    bool allValues = false;                // /va
    bool recursive = false;                // /s of query
    bool force = false;                    // /f, and /y of export
};

// `known` names the switches of the verb, each behind a blank: those with an argument end in '='.
Command parseCommand(const std::string &verb, const std::vector<std::string> &arguments, const std::string &known);

// Asks on standard output and reads the answer; the end of the input means no.
bool confirm(const std::string &question);

// The name of a value as it is printed.
std::string printName(const vxcomn::WideString &name);

void add(const std::vector<std::string> &arguments);
void query(const std::vector<std::string> &arguments);
void remove(const std::vector<std::string> &arguments);
void exportKeys(std::vector<std::string> arguments);
void importKeys(const std::vector<std::string> &arguments);

// The usage of a verb, or of the program for an empty name; empty for an unknown one.
std::string usage(const std::string &verb);

}  // namespace vxreg
