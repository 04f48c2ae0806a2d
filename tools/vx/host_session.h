// SPDX-License-Identifier: MIT
//
// One engine opened through the library, in the order in which an audio processing object does it: open, ask for formats, set them,
// create and enable the components, send parameters, process blocks, free. Turns the library's terse answers into errors that say
// what to do.
#pragma once

#include <VXDSPAPI.h>

#include <optional>
#include <string>
#include <vector>

#include "tools/vx/parameters.h"

namespace vx {

struct EngineChoice {
    std::string engine;
    std::optional<std::string> platform;
    int hostType = 0;
    uint32_t hardware = 0;
    std::optional<std::string> commandLine;
    int recordRate = 0;
};

// What the engine answered to a parameter; by its own convention, often the bytes that it took.
struct ParameterAnswer {
    ParameterWrite write;
    uint32_t result = 0;
};

class HostSession {
  public:
    explicit HostSession(const EngineChoice &choice);
    HostSession(const HostSession &) = delete;
    HostSession &operator=(const HostSession &) = delete;
    ~HostSession();

    // Asks for both formats, sets them, and creates and enables the engine's components.
    void start(IOFormat input, IOFormat output);

    ParameterAnswer send(const ParameterWrite &write);

    // [render] Processes one block in place.
    void process(ProcessBuffers &buffers, IOFormat &input, IOFormat &output) {
        VXDSPAPI_Process(handle_, &buffers, &input, &output);
    }

    // [capture] Takes one block of the capture side.
    void record(ProcessBuffers &buffers, IOFormat &format) { VXDSPAPI_Record(handle_, &buffers, &format); }

    // Runs a diagnostic command of the host's own; what it wrote.
    std::vector<uint8_t> command(int32_t id, const std::vector<uint8_t> &input);

    // The engine's file as the library loaded it.
    std::string engineFile() const;

  private:
    LibraryContext &context() const { return **static_cast<LibraryContext **>(handle_); }
    void createComponents(int sampleRate);
    [[noreturn]] void failFormat(const char *side, const IOFormat &wanted, const IOFormat &offered, uint32_t answer) const;

    EngineChoice choice_;
    VXHandle handle_ = nullptr;
};

}  // namespace vx
