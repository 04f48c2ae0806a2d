// SPDX-License-Identifier: MIT
//
// CUpdateFromRegistryThread: the push path of a host derived from CAPOPresetFile. A polling thread waits for changes anywhere below
// the store's root, lets a burst of them end, and runs both walks; a helper thread hears of sleep and has everything told anew
// behind it. The side that runs effects holds the sync mutex of its configuration key; an observer with the hardware-only flag
// looks for it and leaves the walks to that side. Started and stopped by one control thread.
//
// Threads are waited for, never killed: one that is killed would take its locks along.
#pragma once

#include <atomic>
#include <thread>

#include "diag/debug_trace.h"
#include "platform/change_signal.h"
#include "platform/event.h"
#include "platform/power_events.h"
#include "preset/apo_preset_file.h"

namespace vxcomn {

class CUpdateFromRegistryThread : public CTraceFuncCallTarget, private PowerListener {
  public:
    using Owned = std::unique_ptr<CUpdateFromRegistryThread, UpdateThreadDeleter>;

    // Both threads, running; null if the polling thread could not be started. Without its helper it lives on, deaf to sleep. A
    // change that comes behind this call is walked for.
    static Owned start(CAPOPresetFile &owner, bool isClient, bool hardwareOnly);
    ~CUpdateFromRegistryThread() override;

    // As though the system had told it. Any thread, while the helper runs.
    void injectPowerEvent(PowerEvent event) { power_.inject(event); }

  private:
    CUpdateFromRegistryThread(CAPOPresetFile &owner, bool isClient, bool hardwareOnly);

    bool startPolling();
    void startHelper();
    void stop();
    void ThreadFunc();
    void listen(const WideString &syncMutex);
    void walk(const RegistryKey &root, bool wokenByRegistry);
    bool coalesce(ChangeSignal &changes);
    bool apoRuns(const WideString &syncMutex) const;
    void HelperWndThreadFunc();
    void powerChanged(PowerEvent event) override;

    CAPOPresetFile &owner_;
    const bool isClient_, hardwareOnly_;
    std::thread polling_, helper_;
    Event quit_{EventReset::manual};
    Event started_{EventReset::automatic};
    Event force_{EventReset::automatic};
    Event helperReady_{EventReset::manual};
    Event pollingEnded_{EventReset::manual}, helperEnded_{EventReset::manual};
    std::atomic<bool> stopsHelper_{false};
    PowerEvents power_{*this};
};

}  // namespace vxcomn
