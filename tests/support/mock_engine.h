// SPDX-License-Identifier: MIT
//
// An engine module for tests: it writes down every call and lets the test answer. The module is one for the whole process, so the
// test that loads it by name sees the state of the instance that the host works with.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "vxcomn/library_context.h"

struct MockEngine {
    // What the host calls, as text: "SetParameter(-1, -29, 0, [00])".
    std::vector<std::string> calls;

    // Answers; the defaults succeed and leave the samples alone.
    bool decline = false;
    uint32_t formatResult = 0;
    uint32_t setFormatResult = 0;
    uint32_t parameterResult = 0;
    uint32_t dataResult = 0;
    std::function<void(LibraryContext *, EngineEventCallback)> onInitialize;
    std::function<void(VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *)> onProcess;
    std::function<void(VXEngineHandle, ProcessBuffers *, IOFormat *)> onRecord;
    std::function<void()> onControl;  // in every control call behind Initialize

    // What Initialize was given.
    uint32_t hardware = 0;
    std::string platformName;
    std::string commandLine;
    EngineEventCallback callback = nullptr;
    LibraryContext *context = nullptr;
    int32_t hostType = 0;
};

// The module's own export: its state.
using MockEngineState = MockEngine *(*)();
