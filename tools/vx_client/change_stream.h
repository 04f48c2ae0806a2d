// SPDX-License-Identifier: MIT
//
// What others change in a slot, as it comes. Two threads wait in the control API's two receive functions; whatever arrives is told
// to a listener on one of them, so that a listener never hears two things at once and may call the session. Selections are taken
// over as they arrive, and a selection that lapses because its setter died, which nothing signals, is noticed within a second.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <exception>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "tools/vx_client/session.h"

namespace vx::client {

struct ParameterChange {
    GUID source = {};  // all zeros: the preset, or the library itself
    uint64_t time = 0;
    int32_t componentId = 0;
    int32_t paramId = 0;
    int32_t channel = 0;
    bool transient = false;
    std::vector<uint8_t> data;
};

// What a slot has selected; `forcedRecord` is the engine's record in hexadecimal where a client forces one.
struct Selections {
    std::string engine, ioConfig, profile, content, forcedRecord;
    std::string engineSetter, ioConfigSetter;

    friend bool operator==(const Selections &, const Selections &) = default;
};

class ChangeListener {
  public:
    virtual ~ChangeListener() = default;

    // Weightiest first. `all`: everything that stands in the store, at the beginning and after a selection, rather than news.
    virtual void onParameters(const std::vector<ParameterChange> &changes, bool all) = 0;
    virtual void onSelections(const Selections &before, const Selections &now) = 0;
    // "gone" or a state.
    virtual void onEndpoint(const std::string &state) = 0;
};

// Takes packed change records apart; what is not whole is left out.
std::vector<ParameterChange> parseChanges(const void *blob, uint32_t size, uint32_t count);

class ChangeStream {
  public:
    ChangeStream(const Session &session, ChangeListener &listener);
    ChangeStream(const ChangeStream &) = delete;
    ChangeStream &operator=(const ChangeStream &) = delete;
    // Ends both waits.
    ~ChangeStream();

    // What was selected when the stream was made.
    const Selections &initialSelections() const { return initial_; }
    // Tells the listener everything that stands in the store before it returns, and then what changes.
    void start();
    // Throws what a listener threw.
    void check();

  private:
    void receiveParameters();
    void receiveSelections();
    void takeSelections();
    void lookAtEndpoint();
    void deliver(uint32_t milliseconds);
    void guarded(void (ChangeStream::*loop)());
    void wake();

    const Session &session_;
    ChangeListener &listener_;
    Selections initial_, selections_;
    std::string state_;
    bool force_ = true;
    int idleWaits_ = 0;  // in a row that ended at once without news
    std::atomic<bool> stopping_ = false;
    std::mutex mutex_;
    std::condition_variable taken_;
    bool selectionWaits_ = false;  // under mutex_: the other thread has one for this one
    std::exception_ptr failure_;   // under mutex_
    std::thread parameters_, selectionsThread_;
};

}  // namespace vx::client
