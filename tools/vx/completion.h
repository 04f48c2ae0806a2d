// SPDX-License-Identifier: MIT
//
// What the shell's completion asks: `vx complete -- WORD...` prints what the last word may become, one candidate a line, judged by
// the program's own verbs and options. The line kCompleteFiles stands for the names of files. A verb whose arguments are names that
// only the running machine knows gives them a Completer by the argument's name in the help.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace CLI {
class App;
}

namespace vx {

inline constexpr const char *kCompleteFiles = ":files";

// The candidates for an argument, by the positional arguments that stand before it. Must not throw.
using Completer = std::function<std::vector<std::string>(const std::vector<std::string> &before)>;

// `argument` is the name of a positional argument or the type name of an option's value, such as ENDPOINT, of every verb; or of
// one, with the verb's name in front, as in "get NAME".
void completeWith(const std::string &argument, Completer completer);

std::vector<std::string> completionsOf(const CLI::App &app, const std::vector<std::string> &words);

void addCompleteVerb(CLI::App &app);

}  // namespace vx
