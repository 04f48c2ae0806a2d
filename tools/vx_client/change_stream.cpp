// SPDX-License-Identifier: MIT
#include "tools/vx_client/change_stream.h"

#include <chrono>

#include "platform/endpoints.h"
#include "platform/named_mutex.h"
#include "platform/registry.h"
#include "preset/byte_cursor.h"
#include "preset/store_names.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

using namespace vxcomn;

constexpr uint32_t kWait = 1000;  // milliseconds; how late a setter's death may be noticed
// A wait that ends sooner without news was none: the system gives no notice, and this keeps the loop from spinning.
constexpr auto kNoWait = std::chrono::milliseconds(2);
constexpr auto kPoll = std::chrono::milliseconds(20);
constexpr size_t kReservedBytes = 7;
constexpr size_t kMostRecord = 524;

// The forced record counts while its setter lives, as the name does.
void readForced(const Session &session, Selections &selections) {
    RegistryKey key;
    const WideString path = configurationKey(session.device().storeName, toWide(session.apo()));
    if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) != status::ok) return;
    WideString engineSetter, ioConfigSetter;
    key.readText(store_name::engineSetter, engineSetter);
    key.readText(store_name::ioConfigSetter, ioConfigSetter);
    if (!ioConfigSetter.empty() && NamedMutex::exists(ioConfigSetter)) selections.ioConfigSetter = toUtf8(ioConfigSetter);
    if (engineSetter.empty() || !NamedMutex::exists(engineSetter)) return;
    selections.engineSetter = toUtf8(engineSetter);
    std::vector<uint8_t> record;
    if (key.readBytes(store_name::engineConfig, record, kMostRecord) != RegistryRead::value) return;
    for (const uint8_t byte : record) selections.forcedRecord += textf("%02x", byte);
}

Selections readSelections(const Session &session) {
    Selections selections;
    selections.engine = session.engine();
    selections.ioConfig = session.ioConfig();
    selections.profile = session.profile();
    selections.content = session.content();
    readForced(session, selections);
    return selections;
}

bool readChange(ByteCursor &cursor, ParameterChange &change) {
    uint32_t low = 0, high = 0, size = 0;
    uint8_t transient = 0;
    const uint8_t *const source = cursor.take(sizeof change.source);
    if (source == nullptr) return false;
    std::memcpy(&change.source, source, sizeof change.source);
    if (!cursor.u32(low) || !cursor.u32(high) || !cursor.i32(change.componentId) || !cursor.i32(change.paramId) ||
        !cursor.i32(change.channel) || !cursor.u32(size) || !cursor.u8(transient) || cursor.take(kReservedBytes) == nullptr)
        return false;
    change.time = uint64_t{high} << 32 | low;
    change.transient = transient != 0;
    const uint8_t *const data = cursor.take(size);
    if (data == nullptr) return false;
    change.data.assign(data, data + size);
    return true;
}

std::string endpointState(const Session &session) {
    VARIANT value = {};
    VXAPOCOMAPI_GetEndpointPropertyValue(session.handle(), nullptr, VXAPOCOMAPI_EndpointPropID_EndpointState, &value);
    if (VXAPOCOMAPI_GetLastError(session.handle()) != VXAPOCOMAPI_ERROR_NONE || value.vt != VT_I4) return "gone";
    return stateText(static_cast<uint32_t>(value.lVal));
}

}  // namespace

std::vector<ParameterChange> parseChanges(const void *blob, uint32_t size, uint32_t count) {
    std::vector<ParameterChange> changes;
    ByteCursor cursor(std::span(static_cast<const uint8_t *>(blob), blob == nullptr ? 0 : size));
    for (uint32_t i = 0; i < count; ++i) {
        ParameterChange change;
        if (!readChange(cursor, change)) break;
        changes.push_back(std::move(change));
    }
    return changes;
}

ChangeStream::ChangeStream(const Session &session, ChangeListener &listener)
    : session_(session),
      listener_(listener),
      initial_(readSelections(session)),
      selections_(initial_),
      state_(endpointState(session)) {}

void ChangeStream::start() {
    deliver(0);
    parameters_ = std::thread([this] { guarded(&ChangeStream::receiveParameters); });
    selectionsThread_ = std::thread([this] { guarded(&ChangeStream::receiveSelections); });
}

ChangeStream::~ChangeStream() {
    stopping_ = true;
    wake();
    if (parameters_.joinable()) parameters_.join();
    if (selectionsThread_.joinable()) selectionsThread_.join();
}

void ChangeStream::wake() {
    {
        const std::lock_guard lock(mutex_);
        taken_.notify_all();
    }
    VXAPOCOMAPI_CancelReceiveConfigChange(session_.handle());
    VXAPOCOMAPI_CancelReceiveParamChange(session_.handle());
}

void ChangeStream::check() {
    const std::lock_guard lock(mutex_);
    if (failure_) std::rethrow_exception(failure_);
}

void ChangeStream::guarded(void (ChangeStream::*loop)()) {
    initializeCom();
    try {
        (this->*loop)();
    } catch (...) {
        {
            const std::lock_guard lock(mutex_);
            if (!failure_) failure_ = std::current_exception();
        }
        stopping_ = true;
        wake();
    }
}

void ChangeStream::deliver(uint32_t milliseconds) {
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    const bool all = force_;
    const auto begin = std::chrono::steady_clock::now();
    force_ = false;
    const bool news =
        VXAPOCOMAPI_ReceiveParamChange(session_.handle(), &blob, &size, &count, all ? 0 : milliseconds, all ? 1 : 0) == 1;
    if (news) listener_.onParameters(parseChanges(blob, size, count), all);
    const bool waited = news || all || std::chrono::steady_clock::now() - begin >= kNoWait;
    idleWaits_ = waited ? 0 : idleWaits_ + 1;
    // One such wait may be a cancel that found nobody waiting.
    if (idleWaits_ < 2) return;
    std::unique_lock lock(mutex_);
    taken_.wait_for(lock, kPoll, [this] { return selectionWaits_ || stopping_.load(); });
}

void ChangeStream::receiveParameters() {
    auto looked = std::chrono::steady_clock::now();
    while (!stopping_) {
        deliver(kWait);
        bool waits = false;
        {
            const std::lock_guard lock(mutex_);
            waits = selectionWaits_;
        }
        const auto now = std::chrono::steady_clock::now();
        const bool due = now - looked >= std::chrono::milliseconds(kWait);
        if (waits || due) takeSelections();
        if (due) {
            lookAtEndpoint();
            looked = now;
        }
        if (!waits) continue;
        const std::lock_guard lock(mutex_);
        selectionWaits_ = false;
        taken_.notify_all();
    }
}

void ChangeStream::takeSelections() {
    Selections now = readSelections(session_);
    if (now == selections_) return;
    listener_.onSelections(selections_, now);
    selections_ = std::move(now);
    // Another preset or another engine: what stands in the store now is all new to the listener.
    force_ = true;
}

void ChangeStream::lookAtEndpoint() {
    const std::string now = endpointState(session_);
    if (now == state_) return;
    state_ = now;
    listener_.onEndpoint(state_);
}

void ChangeStream::receiveSelections() {
    while (!stopping_) {
        const VXWCHAR *name = nullptr;
        const void *data = nullptr;
        uint32_t size = 0;
        const auto begin = std::chrono::steady_clock::now();
        const bool news = VXAPOCOMAPI_ReceiveConfigChange(session_.handle(), &name, &data, &size, kWait, 0) == 1;
        std::unique_lock lock(mutex_);
        if (!news) {
            if (std::chrono::steady_clock::now() - begin < kNoWait)
                taken_.wait_for(lock, kPoll, [this] { return stopping_.load(); });
            continue;
        }
        // The other thread takes it over: only one of them calls into the session's properties.
        selectionWaits_ = true;
        lock.unlock();
        VXAPOCOMAPI_CancelReceiveParamChange(session_.handle());
        lock.lock();
        taken_.wait(lock, [this] { return !selectionWaits_ || stopping_.load(); });
    }
}

}  // namespace vx::client
