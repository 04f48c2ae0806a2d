// SPDX-License-Identifier: MIT
//
// The login manager's announcement of sleep, PrepareForSleep, from the system bus. The bus is spoken through libsystemd, which is
// loaded if the machine has it and is no dependency of the library. One thread.
#pragma once

#include <poll.h>

#include "platform/power_events.h"

struct sd_bus;
struct sd_bus_message;

namespace vxcomn {

class LoginManager {
  public:
    explicit LoginManager(PowerListener &listener) : listener_(listener) {}
    ~LoginManager() { disconnect(); }
    LoginManager(const LoginManager &) = delete;
    LoginManager &operator=(const LoginManager &) = delete;

    // False if there is no bus to listen to.
    bool connect();
    // Passes on what has come in. False, and it is no longer connected, if the bus is gone.
    bool process();
    // What to poll for until then, and for how many milliseconds at most; -1 is without end.
    pollfd waitFor(int &milliseconds) const;

  private:
    static int onPrepareForSleep(sd_bus_message *message, void *self, void *error);
    void disconnect();

    PowerListener &listener_;
    sd_bus *bus_ = nullptr;
};

}  // namespace vxcomn
