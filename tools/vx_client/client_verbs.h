// SPDX-License-Identifier: MIT
//
// The verbs of a control client: what the machine's endpoints run, and how to change it.
#pragma once

#include <CLI/CLI.hpp>

#include "tools/vx/console.h"
#include "tools/vx_client/session.h"

namespace vx {

// list, doctor, props, engine, ioconfig, profile, content, get, set, raw, reset, watch, activate.
void addClientVerbs(CLI::App &app, int &exitStatus);

namespace client {

// What the verbs of one slot have in common: ENDPOINT, --apo, --json, -q, --color.
struct SlotOptions {
    SlotChoice slot;
    CommonOptions common;
};
void addSlotOptions(CLI::App &verb, SlotOptions &options);
void addApoOption(CLI::App &verb, std::string &apo);

Session openSlot(const SlotChoice &choice, SessionKind kind = SessionKind::control);

// What the shell's completion knows of endpoints and parameters (tools/vx/completion.h).
void addClientCompletions();

void addListVerb(CLI::App &app);
void addDoctorVerb(CLI::App &app, int &exitStatus);
void addPropsVerb(CLI::App &app);
void addSelectionVerbs(CLI::App &app);
void addGetVerb(CLI::App &app);
void addSetVerb(CLI::App &app);
void addRawVerb(CLI::App &app);
void addResetVerb(CLI::App &app);
void addWatchVerb(CLI::App &app);
void addActivateVerb(CLI::App &app);

}  // namespace client
}  // namespace vx
