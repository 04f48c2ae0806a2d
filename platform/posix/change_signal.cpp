// SPDX-License-Identifier: MIT
//
// A watch compares the count in its key's slot (change_table.h) with what it was at the arming.
#include "platform/change_signal.h"

#include "platform/posix/change_table.h"
#include "platform/posix/registry_key.h"
#include "platform/posix/registry_store.h"
#include "platform/posix/wait_object.h"

namespace vxcomn {
namespace {

class SignalObject final : public WaitObject {
  public:
    SignalObject(ChangeTable &table, int64_t store, int64_t key, ChangeFilter filter) noexcept
        : table_(table),
          slot_(table.slot(key, filter == ChangeFilter::keysAndValues ? ChangeKind::keys : ChangeKind::values)),
          gone_(table.slot(key, ChangeKind::gone)),
          store_(store),
          key_(key) {}

    Status arm() noexcept {
        armed_ = false;
        // The store is asked whether the key is there only if one like it may have gone since it was asked last.
        const uint32_t gone = gone_.generation.load();
        if (!asked_ || gone != goneSeen_) {
            if (const Status status = askForKey(); status != status::ok) return status;
            asked_ = true;
            goneSeen_ = gone;
        }
        seen_ = slot_.generation.load();
        armed_ = true;
        return status::ok;
    }

    bool take() noexcept override {
        if (!armed_ || slot_.generation.load() == seen_) return false;
        armed_ = false;
        return true;
    }
    SleepWord sleepWord() noexcept override {
        if (!armed_) return {nullptr, 0, true};
        slot_.waiting.store(1);
        return {&slot_.generation, seen_, true};
    }
    bool needsCare() const noexcept override { return true; }
    void lookAfter() noexcept override { table_.finishForTheDead(); }

  private:
    Status askForKey() const noexcept {
        return runInStore(false, [this](StoreConnection &store) {
            const bool there = store.identity() == store_ && store(Query::keyExists).bind(1, key_).next();
            return there ? status::ok : status::keyDeleted;
        });
    }

    ChangeTable &table_;
    ChangeTable::Slot &slot_, &gone_;
    const int64_t store_, key_;
    uint32_t seen_ = 0, goneSeen_ = 0;
    bool asked_ = false;
    bool armed_ = false;
};

}  // namespace

ChangeSignal::ChangeSignal() noexcept = default;

Status ChangeSignal::open(const RegistryKey &key, ChangeFilter filter, ChangeSignal &signal) {
    if (!key) return status::invalidHandle;
    if (!key.impl_->may(kNotify)) return status::accessDenied;
    Status why;
    ChangeTable *const table = ChangeTable::get(why);
    if (table == nullptr) return why;
    signal.adopt(std::make_unique<SignalObject>(*table, key.impl_->store, key.impl_->key(), filter));
    return status::ok;
}

Status ChangeSignal::arm() noexcept {
    return object() != nullptr ? static_cast<SignalObject *>(object())->arm() : status::invalidHandle;
}

}  // namespace vxcomn
