// SPDX-License-Identifier: MIT
#include "tests/support/process.h"

namespace test {

Outcome run(const std::string &program, const std::vector<std::string> &arguments, const std::string &input,
            const Environment &environment) {
    Process process(program, arguments, environment);
    process.write(input);
    process.closeInput();
    Outcome outcome;
    outcome.output = process.readAll();
    outcome.status = process.wait();
    outcome.errors = process.errors();
    return outcome;
}

std::string builtProgram(const std::string &name) {
    const std::string self = selfProgram();
    const size_t folder = self.find_last_of("/\\") + 1;
    const std::string extension = self.ends_with(".exe") ? ".exe" : "";
    return self.substr(0, folder) + name + extension;
}

Process startHelper(const std::string &name, std::vector<std::string> arguments, const Environment &environment) {
    arguments.insert(arguments.begin(), {"--helper", name});
    return Process(selfProgram(), arguments, environment);
}

}  // namespace test
