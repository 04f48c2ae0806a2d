// SPDX-License-Identifier: MIT
//
// Tells when the machine goes to sleep and wakes up again. One thread opens this and runs it, and the listener is called there: on
// Windows out of the message loop of a hidden window, elsewhere when the system's login manager says so, where there is one.
#pragma once

#include <cstdint>
#include <memory>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

enum class PowerEvent : uint8_t { suspend, resume };

class PowerListener {
  public:
    virtual void powerChanged(PowerEvent event) = 0;

  protected:
    ~PowerListener() = default;
};

class PowerEvents {
  public:
    // What opening came to: each step's status, 0 for success. Without a window class there is no window, and no events. Both are
    // always 0 on Linux.
    struct Opened {
        Status registered = status::ok;  // registering the window class; 0 if somebody had done that
        Status found = status::ok;       // looking it up
    };

    explicit PowerEvents(PowerListener &listener);
    ~PowerEvents();
    PowerEvents(const PowerEvents &) = delete;
    PowerEvents &operator=(const PowerEvents &) = delete;

    // Begins to listen, with a hidden window of this class and title on Windows. By the thread that will run.
    Opened open(const VXWCHAR *windowClass);
    // Calls the listener until close() is called; returns at once if opening made no window.
    void run();
    // Ends the run. Any thread.
    void close();
    // As though the system had told it: the listener is called in run(). Any thread, behind open().
    void inject(PowerEvent event);

  private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

}  // namespace vxcomn
