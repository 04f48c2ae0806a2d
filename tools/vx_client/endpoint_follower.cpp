// SPDX-License-Identifier: MIT
#include "tools/vx_client/endpoint_follower.h"

#include <algorithm>
#include <cstdio>

#include "platform/clock.h"
#include "platform/named_mutex.h"
#include "preset/store_names.h"
#include "tools/vx/failure.h"
#include "tools/vx/host_session.h"
#include "tools/vx/run_report.h"
#include "tools/vx/text.h"
#include "tools/vx_client/change_stream.h"
#include "tools/vx_client/endpoint_choice.h"
#include "tools/vx_client/raw_value.h"
#include "tools/vx_client/writer.h"

namespace vx {

namespace {

using namespace client;

constexpr double kLongestDelayMs = 60000.0;  // a stamp further away is of another clock
constexpr int32_t kGlobalComponent = -1, kCleanBuffers = -33;

struct PendingChange {
    FollowedChange change;
    uint64_t stamp = 0;
};

// From a stamp of the store to now, if both are of this machine's clock.
std::optional<double> millisecondsSince(uint64_t stamp) {
    const int64_t written = vxcomn::nanosecondsOf(static_cast<int64_t>(stamp), vxcomn::performanceFrequency());
    const double elapsed = static_cast<double>(vxcomn::performanceNanoseconds() - written) / 1e6;
    return elapsed >= 0.0 && elapsed < kLongestDelayMs ? std::optional(elapsed) : std::nullopt;
}

// A name from the store is data: it may name a module, never a path.
bool isModuleName(const std::string &engine) {
    return !engine.empty() && engine.find_first_of("/\\:") == std::string::npos;
}

// Names the slot as one whose effects run, for as long as it lives.
vxcomn::NamedMutex markReceiver(const Session &session, bool quiet) {
    const vxcomn::WideString key = vxcomn::configurationKey(session.device().storeName, vxcomn::toWide(session.apo()));
    vxcomn::NamedMutex mark;
    bool created = false;
    if (vxcomn::NamedMutex::create(vxcomn::syncMutexName(key), mark, vxcomn::MutexOwner::none, &created) == vxcomn::status::ok &&
        !created && !quiet)
        std::fprintf(stderr, "follow: another program runs the effects of this slot, too\n");
    return mark;
}

class EndpointFollower final : public RunFollower, private ChangeListener {
  public:
    explicit EndpointFollower(const RunOptions &options)
        : quiet_(options.common.quiet || options.common.json),
          fixedEngine_(options.engine),
          session_(findEndpoint(options.follow), options.apo, SessionKind::observer),
          mark_(markReceiver(session_, quiet_)),
          stream_(session_, *this) {
        engine_ = stream_.initialSelections().engine;
        if (engine_.empty() && !fixedEngine_)
            throw Failure(ExitStatus::input,
                          session_.device().name + ", " + session_.apo() +
                              ": the slot has no engine, because it has no preset; vx doctor tells why, and --engine names one");
        if (!fixedEngine_ && !isModuleName(engine_))
            throw Failure(ExitStatus::input, session_.device().name + ", " + session_.apo() + ": the slot's engine \"" + engine_ +
                                                 "\" is no module name; vx doctor tells who chose it, and --engine names another");
        say("follow: " + session_.device().name + ", " + session_.apo() + ", engine " +
            (engine_.empty() ? "-" : printable(engine_)));
    }

    std::string engine() override {
        if (fixedEngine_) return *fixedEngine_;
        const std::lock_guard lock(mutex_);
        return engine_;
    }

    void engineRefused(const std::string &why) override { say("follow: the engine stays as it was: " + why); }

    void attach(HostSession *host) override {
        {
            const std::lock_guard lock(mutex_);
            host_ = host;
            if (host_ == nullptr) return;
            for (const ParameterChange &change : settings_) send(change);
        }
        if (started_) return;
        started_ = true;
        stream_.start();
    }

    void beforeBlock(double seconds) override {
        stream_.check();
        const std::lock_guard lock(mutex_);
        inBlock_.swap(waiting_);
        for (PendingChange &pending : inBlock_) pending.change.seconds = seconds;
    }

    void afterBlock() override {
        for (PendingChange &pending : inBlock_) {
            if (pending.stamp != 0) pending.change.heardMs = millisecondsSince(pending.stamp);
            say(textf("follow: %8.3f s ", pending.change.seconds) + changeText(pending.change));
            changes_.push_back(std::move(pending.change));
        }
        inBlock_.clear();
    }

    std::vector<FollowedChange> changes() const override { return changes_; }

  private:
    void onParameters(const std::vector<ParameterChange> &changes, bool all) override {
        const std::lock_guard lock(mutex_);
        const std::vector<ParameterChange> before = settings_;
        if (all) settings_.clear();
        for (const ParameterChange &change : changes) {
            if (host_ != nullptr) send(change);
            const ParameterChange *const old = find(before, change);
            // At the beginning all is new, and that is no change; a selection that moves brings what differs.
            if (heardOnce_ && (!all || old == nullptr || old->data != change.data)) note(change, old, !all);
            keep(change);
        }
        heardOnce_ = true;
    }

    void onSelections(const Selections &before, const Selections &now) override {
        const std::lock_guard lock(mutex_);
        noteSelection("engine", before.engine, now.engine, now.engineSetter);
        noteSelection("configuration", before.ioConfig, now.ioConfig, now.ioConfigSetter);
        noteSelection("profile", before.profile, now.profile, {});
        noteSelection("content", before.content, now.content, {});
        if (isModuleName(now.engine)) engine_ = now.engine;
    }

    void onEndpoint(const std::string &state) override { say("follow: the endpoint is " + state + "; the sound goes on as it is"); }

    // The rest is under mutex_.
    void send(const ParameterChange &change) {
        // The store keeps no channel; what it hands out stands for all, which for an engine is the first and only.
        host_->send({{}, change.componentId, change.paramId, 0, change.data});
    }

    static bool sameSlot(const ParameterChange &left, const ParameterChange &right) {
        return left.componentId == right.componentId && left.paramId == right.paramId && left.transient == right.transient &&
               (!left.transient || left.source == right.source);
    }

    static const ParameterChange *find(const std::vector<ParameterChange> &settings, const ParameterChange &change) {
        const auto found =
            std::find_if(settings.begin(), settings.end(), [&](const ParameterChange &other) { return sameSlot(other, change); });
        return found == settings.end() ? nullptr : &*found;
    }

    // For the next host. A command is carried out once.
    void keep(const ParameterChange &change) {
        if (change.componentId == kGlobalComponent && change.paramId == kCleanBuffers) return;
        std::erase_if(settings_, [&](const ParameterChange &other) { return sameSlot(other, change); });
        settings_.push_back(change);
    }

    void note(const ParameterChange &change, const ParameterChange *before, bool written) {
        const auto text = [&](const ParameterChange &value) { return spokenText(value.componentId, value.paramId, value.data); };
        FollowedChange followed;
        followed.name = parameterTitle(change.componentId, change.paramId);
        if (followed.name.empty()) followed.name = textf("%d,%d", change.componentId, change.paramId);
        followed.text = followed.name + " " + (before == nullptr ? "-" : text(*before)) + " -> " + text(change);
        followed.writer = writerText(writerOf(change.source, session_.instance()));
        if (written) followed.takenMs = millisecondsSince(change.time);
        waiting_.push_back({std::move(followed), written ? change.time : 0});
    }

    void noteSelection(const char *name, const std::string &before, const std::string &now, const std::string &setter) {
        if (before == now) return;
        FollowedChange followed;
        followed.name = name;
        followed.text =
            std::string(name) + " " + (before.empty() ? "-" : printable(before)) + " -> " + (now.empty() ? "-" : printable(now));
        followed.writer = writerText(setterOf(setter));
        waiting_.push_back({std::move(followed), 0});
    }

    void say(const std::string &text) const {
        if (!quiet_) std::fprintf(stderr, "%s\n", text.c_str());
    }

    const bool quiet_;
    const std::optional<std::string> fixedEngine_;
    mutable std::mutex mutex_;
    Session session_;
    vxcomn::NamedMutex mark_;
    HostSession *host_ = nullptr;
    std::vector<ParameterChange> settings_;  // as they stand, in the order of their arrival
    std::vector<PendingChange> waiting_;     // in the engine, and not in a block yet
    bool heardOnce_ = false;
    bool started_ = false;
    // The playing thread's own.
    std::vector<PendingChange> inBlock_;
    std::vector<FollowedChange> changes_;
    std::string engine_;  // under mutex_
    // Ends first: its threads use all of the above.
    ChangeStream stream_;
};

}  // namespace

std::unique_ptr<RunFollower> followEndpoint(const RunOptions &options) {
    return std::make_unique<EndpointFollower>(options);
}

}  // namespace vx
