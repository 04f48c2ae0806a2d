// SPDX-License-Identifier: MIT
//
// The walk over a parameter key: finds by the stamps what is new there, and adds it to the pending changes. An unchanged key costs
// one look at the clients and one at its stamp; below it only components whose stamp moved are listed, and only values whose stamp
// moved are read. No error leaves the walk: what cannot be read is logged and passed over. One thread at a time.
//
// A value is never told with another's stamp. On Linux the two are read in one look; elsewhere the stamp is read again behind the
// data, and the data again if it moved.
#pragma once

#include "diag/debug_trace.h"
#include "platform/registry.h"
#include "preset/apo_preset_file.h"

namespace vxcomn {

// A component key as the walk has found it.
struct WalkedComponent {
    int32_t id;
    RegistrySubkey &key;
};

class ParameterWalk {
  public:
    ParameterWalk(const CTraceFuncCallTarget &trace, WalkMemory &memory, PendingChanges &changes, bool force) noexcept
        : trace_(trace), memory_(memory), changes_(changes), force_(force) {}

    // Who runs: forgets the clients that don't, and their marks in the store (known_clients.cpp).
    void lookAtClients(const WideString &configurationKey);
    // `mutex` only names the slot's lock in the log.
    void lookAtParameters(const WideString &parameterKey, const void *mutex);

  private:
    struct Reading {
        Status status = status::fileNotFound;
        uint64_t stamp = 0;
        GUID source = {};
        std::vector<uint8_t> data;
    };
    // The parameters of a component whose shared value is to be read.
    struct Marked {
        int32_t low = kHighestParam + 1;
        int32_t high = kLowestParam - 1;
    };

    void forgetClient(KnownClients::iterator &client);
    // Whether a client has come since its slot's clients were looked at; it is known then.
    bool hasJoined(const GUID &client);
    bool keyStamp(uint64_t &stamp) const;
    void walkComponents();
    void walkComponent(RegistrySubkey &key);
    void walkSharedValue(const WalkedComponent &component, const RegistryEntry &time, uint64_t stamp, Marked &marked);
    void walkPrivateValue(const WalkedComponent &component, const RegistryEntry &time, uint64_t stamp, Marked &marked);
    void deliverMarked(const WalkedComponent &component, const Marked &marked);
    bool isNew(uint64_t seen, uint64_t stamp) const noexcept { return force_ || seen != stamp; }
    uint64_t &slot(int32_t componentId, int32_t paramId);
    void mark(int32_t componentId, int32_t paramId, uint64_t stamp, Marked &marked);

    // Reads a value that stands in the component's keys under `name`, whose stamp was `stamp` when it was listed.
    static Reading read(const RegistryKey &component, const WideString &name, uint64_t stamp);
    // Adds what was read to the changes.
    void DeliverParameter(const WalkedComponent &component, int32_t paramId, const WideString &name, Reading reading,
                          bool isTransient);

    const CTraceFuncCallTarget &trace_;
    WalkMemory &memory_;
    PendingChanges &changes_;
    const bool force_;
    WideString clientsKey_, parameterKey_;
};

}  // namespace vxcomn
