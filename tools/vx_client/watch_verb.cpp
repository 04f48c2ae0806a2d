// SPDX-License-Identifier: MIT
//
// vx watch: each change of a slot as it comes, who wrote it, and the old and the new value.
#include <iostream>
#include <map>
#include <memory>
#include <optional>

#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_client/change_stream.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_choice.h"
#include "tools/vx_client/endpoint_json.h"
#include "tools/vx_client/hold.h"
#include "tools/vx_client/raw_value.h"
#include "tools/vx_client/user_parameters.h"
#include "tools/vx_client/writer.h"

namespace vx::client {

namespace {

struct WatchOptions : SlotOptions {
    std::optional<double> seconds;
    std::optional<uint64_t> most;
    bool initial = false;
};

// A private value of a client's stands beside the shared one.
struct ParameterKey {
    int32_t componentId, paramId;
    std::string client;  // empty: shared

    friend auto operator<=>(const ParameterKey &, const ParameterKey &) = default;
};

struct Value {
    std::vector<uint8_t> data;
    std::optional<float> level;  // of a user parameter
    uint64_t time = 0;
};

class Watcher final : public ChangeListener {
  public:
    Watcher(const WatchOptions &options, const Session &session)
        : options_(options), session_(session), style_(options.common.colour, stdout), begin_(Clock::now()) {}

    bool isDone() const { return done_; }

    void start(const Selections &selections) {
        Json json = {{"seq", 0},
                     {"kind", "start"},
                     {"endpoint", deviceJson(session_.device())},
                     {"apo", session_.apo()},
                     {"engine", textOrNull(selections.engine)},
                     {"ioConfig", textOrNull(selections.ioConfig)},
                     {"profile", textOrNull(selections.profile)},
                     {"content", textOrNull(selections.content)}};
        put(json, style_.bold(session_.device().name + ", " + session_.apo() + ": engine " + dashed(selections.engine) +
                              ", configuration " + dashed(selections.ioConfig) + ", profile " + dashed(selections.profile) +
                              ", content " + dashed(selections.content)));
    }

    void onParameters(const std::vector<ParameterChange> &changes, bool all) override {
        for (const ParameterChange &change : changes) {
            const ParameterKey key = {change.componentId, change.paramId, change.transient ? guidText(change.source) : ""};
            const Value now = {change.data, levelOf(change), change.time};
            const auto found = values_.find(key);
            const bool known = found != values_.end();
            // Where a selection has moved, all comes anew; what is as before is no news.
            const bool old = all && known && found->second.data == now.data;
            if (!old && (started_ || options_.initial)) tell(change, known ? &found->second : nullptr, now);
            values_[key] = now;
        }
        started_ = true;
    }

    void onSelections(const Selections &before, const Selections &now) override {
        started_ = true;
        selection("engine", before.engine, now.engine, now.engineSetter);
        selection("engineConfig", before.forcedRecord, now.forcedRecord, now.engineSetter);
        selection("ioConfig", before.ioConfig, now.ioConfig, now.ioConfigSetter);
        selection("profile", before.profile, now.profile, {});
        selection("content", before.content, now.content, {});
    }

    void onEndpoint(const std::string &state) override {
        event({{"kind", "endpoint"}, {"state", state}}, "the endpoint is " + state);
        if (state == "gone")
            throw Failure(ExitStatus::input, session_.device().name + ": the endpoint is gone; vx list shows what is there");
    }

  private:
    using Clock = std::chrono::steady_clock;

    static std::string dashed(const std::string &text) { return text.empty() ? "-" : printable(text); }

    // The slider's place, where the store still holds what was delivered.
    std::optional<float> levelOf(const ParameterChange &change) const {
        const UserParameter *const parameter = userParameterAt(change.componentId, change.paramId);
        if (parameter == nullptr || change.transient) return std::nullopt;
        const float level = VXAPOCOMAPI_GetUserParameter(session_.handle(), static_cast<int32_t>(parameter->id));
        std::vector<uint8_t> stored(change.data.size() + 1);
        auto size = static_cast<uint32_t>(stored.size());
        if (level < 0.0F || VXAPOCOMAPI_GetUserParameterEx(session_.handle(), change.componentId, change.paramId, change.channel,
                                                           stored.data(), &size, nullptr, nullptr) != 1)
            return std::nullopt;
        stored.resize(std::min<size_t>(size, stored.size()));
        return stored == change.data ? std::optional(level) : std::nullopt;
    }

    static std::string text(const ParameterChange &change, const Value *value) {
        if (value == nullptr) return "-";
        const UserParameter *const parameter = userParameterAt(change.componentId, change.paramId);
        if (parameter != nullptr && value->level) return userValueText(*parameter, *value->level);
        return spokenText(change.componentId, change.paramId, value->data);
    }

    static Json json(const ParameterChange &change, const Value *value) {
        if (value == nullptr) return {};
        Json result = rawJson(change.componentId, change.paramId, value->data);
        if (value->level) result["level"] = userValueNumber(*value->level);
        return result;
    }

    void tell(const ParameterChange &change, const Value *before, const Value &now) {
        const std::string title = parameterTitle(change.componentId, change.paramId);
        const Writer writer = writerOf(change.source, session_.instance());
        event({{"kind", started_ ? "parameter" : "initial"},
               {"component", change.componentId},
               {"id", change.paramId},
               {"name", textOrNull(title)},
               {"transient", change.transient},
               {"time", change.time},
               {"writer", writerJson(writer)},
               {"old", json(change, before)},
               {"new", json(change, &now)}},
              textf("%-14s ", title.empty() ? textf("%d,%d", change.componentId, change.paramId).c_str() : title.c_str()) +
                  text(change, before) + " -> " + text(change, &now) + (change.transient ? ", transient" : "") + "  by " +
                  writerText(writer));
    }

    void selection(const char *name, const std::string &before, const std::string &now, const std::string &setter) {
        if (before == now) return;
        const Writer writer = setterOf(setter);
        event({{"kind", "selection"},
               {"name", name},
               {"writer", writerJson(writer)},
               {"old", textOrNull(before)},
               {"new", textOrNull(now)}},
              textf("%-14s ", name) + dashed(before) + " -> " + dashed(now) + (setter.empty() ? "" : "  by " + writerText(writer)));
    }

    void event(const Json &fields, const std::string &text) {
        if (done_) return;
        const double seconds = std::chrono::duration<double>(Clock::now() - begin_).count();
        Json json = {{"seq", ++sequence_}, {"seconds", seconds}};
        json.update(fields);
        put(json, textf("%9.3f s  ", seconds) + text);
        if (options_.most && sequence_ >= *options_.most) done_ = true;
    }

    void put(const Json &json, const std::string &text) {
        std::cout << (options_.common.json ? lineText(json) : text + "\n") << std::flush;
    }

    const WatchOptions &options_;
    const Session &session_;
    Style style_;
    Clock::time_point begin_;
    std::map<ParameterKey, Value> values_;
    bool started_ = false;
    uint64_t sequence_ = 0;
    std::atomic<bool> done_ = false;
};

void watch(const WatchOptions &options) {
    const Hold hold(options.seconds);
    const Session session = openSlot(options.slot, SessionKind::observer);
    Watcher watcher(options, session);
    ChangeStream stream(session, watcher);
    watcher.start(stream.initialSelections());
    stream.start();
    while (!hold.isOver() && !watcher.isDone()) {
        stream.check();
        hold.nap();
    }
    stream.check();
}

}  // namespace

void addWatchVerb(CLI::App &app) {
    auto options = std::make_shared<WatchOptions>();
    CLI::App *verb = app.add_subcommand("watch", "Each change of an effect slot as it comes, who wrote it, old and new value");
    addSlotOptions(*verb, *options);
    addHoldOption(*verb, options->seconds, "Watch for so long");
    verb->add_option("--count", options->most, "End after so many changes")->check(CLI::PositiveNumber)->type_name("N");
    verb->add_flag("--initial", options->initial, "Begin with what stands in the store");
    verb->footer(
        "With --json every line is an object with a sequence number: first a start, then a parameter, selection or endpoint each.\n"
        "Examples:\n"
        "  vx watch speakers\n"
        "  vx watch speakers --json --count 10");
    verb->callback([options] { watch(*options); });
}

}  // namespace vx::client
