// SPDX-License-Identifier: MIT
//
// The sample machine of examples/ for tests of the client's verbs: its three endpoints in the registry, its package in the system
// folder, and the sample engine under the name that its presets ask for. What a test stored is taken away at both ends.
#pragma once

#include <doctest/doctest.h>

#include <nlohmann/json.hpp>

#include "tests/tools/vx_fixture.h"

namespace test {

using nlohmann::json;

struct ClientFixture : VxFixture {
    ClientFixture();
    ~ClientFixture();

    // A verb that is expected to work; its output.
    static std::string done(const std::vector<std::string> &arguments);
    static json doneJson(std::vector<std::string> arguments);
    // A verb that is expected to end so, with these texts on standard error.
    static void fails(const std::vector<std::string> &arguments, int status, const std::vector<std::string> &texts);

    static std::string get(const std::string &name, const std::string &endpoint = "speakers");

    // Values of the registry, below HKLM.
    static void putText(const std::string &key, const std::string &name, const std::string &text);
    static void putBytes(const std::string &key, const std::string &name, const std::vector<uint8_t> &bytes);
    static void putNumber(const std::string &key, const std::string &name, uint32_t number);
    static void removeKey(const std::string &key);

    // Keys of the sample machine.
    static const std::string kSpeakers;        // the endpoint
    static const std::string kStore;           // of all slots
    static const std::string kSpeakersSlot;    // EFX
    static const std::string kSpeakersValues;  // its parameters, by the preset's selections

    std::filesystem::path system;  // the folder of packages and modules
};

// A verb that stays until the test lets it go.
class Running {
  public:
    explicit Running(const std::vector<std::string> &arguments) : process_(builtProgram("vx"), arguments) {}

    // The next line; fails the test at the end of the output.
    std::string line();
    json jsonLine() { return json::parse(line()); }
    // The next line of JSON that is of this kind.
    json next(const std::string &kind, const std::string &name);
    Process &process() { return process_; }

  private:
    Process process_;
};

}  // namespace test
