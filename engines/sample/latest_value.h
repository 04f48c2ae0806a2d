// SPDX-License-Identifier: MIT
//
// Hands the latest value of a record from control threads to the render thread without a lock: a triple buffer. Writers take turns
// under a lock of their own; the reader waits for nobody. Values between two looks of the reader are skipped. A sequence lock was
// turned down because its reader would have to try again while a writer writes.
#pragma once

#include <atomic>
#include <cstdint>

namespace sample_engine {

template <class Record>
class LatestValue {
  public:
    // [control, one at a time]
    void publish(const Record &record) {
        records_[back_] = record;
        // control: exchange release publishes the record, acquire takes over the one that the reader gave back.
        back_ = middle_.exchange(static_cast<uint8_t>(back_ | kFresh), std::memory_order_acq_rel) & kIndex;
    }

    // [render] The newest record if one came since the last call, else null. Valid until the next call.
    const Record *take() {
        if ((middle_.load(std::memory_order_relaxed) & kFresh) == 0) return nullptr;
        // render: exchange acquire sees the record, release gives the old one back.
        front_ = middle_.exchange(front_, std::memory_order_acq_rel) & kIndex;
        return &records_[front_];
    }

    // [render] What the last successful take() gave, or the default record.
    const Record &current() const { return records_[front_]; }

  private:
    static constexpr uint8_t kIndex = 3;
    static constexpr uint8_t kFresh = 4;

    Record records_[3];
    std::atomic<uint8_t> middle_ = 1;
    uint8_t back_ = 0;   // control's
    uint8_t front_ = 2;  // render's
};

}  // namespace sample_engine
