// SPDX-License-Identifier: MIT
//
// Programs as children of a test: started with pipes to and from them, read line by line, killed in the middle. Whatever crosses
// processes is tested with these. One thread uses a child at a time.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace test {

using Environment = std::vector<std::pair<std::string, std::string>>;  // what differs from the test's own

class Process {
  public:
    Process(const std::string &program, const std::vector<std::string> &arguments, const Environment &environment = {});
    Process(Process &&) noexcept;
    ~Process();  // kills it if it still runs

    // To its standard input.
    void write(const std::string &text);
    void closeInput();

    // From its standard output: the next line without its end, or nothing at the end; the rest as it is.
    std::optional<std::string> readLine();
    std::string readAll();

    // Ends it at once, as kill -9 or TerminateProcess do.
    void kill();
    // Waits for its end and gives its exit status, -1 if it was killed. Whatever it printed and nobody read is thrown away.
    int wait();
    // What it printed on its standard error stream, once it has ended.
    std::string errors();

  private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

struct Outcome {
    int status;
    std::string output, errors;  // with plain line feeds on both platforms
};

// Runs a program to its end.
Outcome run(const std::string &program, const std::vector<std::string> &arguments, const std::string &input = {},
            const Environment &environment = {});

// The path of the test program itself, and of another program of the same build by its bare name.
std::string selfProgram();
std::string builtProgram(const std::string &name);

// Starts a helper (helper.h) of this test program.
Process startHelper(const std::string &name, std::vector<std::string> arguments, const Environment &environment = {});

uint32_t processId();

}  // namespace test
