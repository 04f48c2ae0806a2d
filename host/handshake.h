// SPDX-License-Identifier: MIT
//
// How a control call keeps the block functions out of what it changes. Each block function has a stop byte and a busy byte. The
// control call raises stop and waits for busy to fall; the block function raises busy and then looks at stop. The four accesses are
// sequentially consistent: with anything less a processor may let the load overtake the store before it, and both sides would go
// on.
//
// The waits are bare spins without a time-out: a block is short.
//
// Blocks are kept out by one stop byte however many control calls there are, so calls that hold it are serialised: a second one
// must not find the byte lowered by the first. The record has no room for a lock; controlLock keeps them aside.
#pragma once

#include <emmintrin.h>

#include <mutex>

#include "vxcomn/library_context.h"

namespace vxcomn {

// The lock of a context's control calls. Recursive, since an engine may call back into the host. Contexts may share one.
std::recursive_mutex &controlLock(const LibraryContext *context) noexcept;

// Waits until a block function has left.
inline void waitUntilIdle(const VXAtomicByte &busy) noexcept {
    while (busy.load(std::memory_order_seq_cst) != 0) _mm_pause();
}

// Raises a stop byte and waits; leaves it up.
inline void stopBlocks(VXAtomicByte &stop, const VXAtomicByte &busy) noexcept {
    stop.store(1, std::memory_order_seq_cst);
    waitUntilIdle(busy);
}

// Keeps VXDSPAPI_Process out for a scope.
class ProcessHold {
  public:
    explicit ProcessHold(LibraryContext &context) noexcept : lock_(controlLock(&context)), context_(context) {
        stopBlocks(context.processStop, context.processBusy);
    }
    ~ProcessHold() { context_.processStop.store(0, std::memory_order_release); }
    ProcessHold(const ProcessHold &) = delete;
    ProcessHold &operator=(const ProcessHold &) = delete;

  private:
    std::lock_guard<std::recursive_mutex> lock_;
    LibraryContext &context_;
};

// Keeps one block function off a group of fields for a scope: it goes on, and leaves out what the byte stands for.
class FieldHold {
  public:
    FieldHold(LibraryContext &context, VXAtomicByte &stop, const VXAtomicByte &busy) noexcept
        : lock_(controlLock(&context)), byte_(stop) {
        stopBlocks(stop, busy);
    }
    ~FieldHold() { byte_.store(0, std::memory_order_release); }
    FieldHold(const FieldHold &) = delete;
    FieldHold &operator=(const FieldHold &) = delete;

  private:
    std::lock_guard<std::recursive_mutex> lock_;
    VXAtomicByte &byte_;
};

// Keeps both block functions out for a scope, as the measuring commands do: render first, then capture, and released in the same
// order.
class MeasuringHold {
  public:
    explicit MeasuringHold(LibraryContext &context) noexcept : lock_(controlLock(&context)), context_(context) {
        stopBlocks(context.processStop, context.processBusy);
        stopBlocks(context.recordStop, context.recordBusy);
    }
    ~MeasuringHold() {
        context_.processStop.store(0, std::memory_order_release);
        context_.recordStop.store(0, std::memory_order_release);
    }
    MeasuringHold(const MeasuringHold &) = delete;
    MeasuringHold &operator=(const MeasuringHold &) = delete;

  private:
    std::lock_guard<std::recursive_mutex> lock_;
    LibraryContext &context_;
};

// Keeps both block functions out for a scope, as the component calls do: capture first, then render, and released in the same
// order.
class BlockHold {
  public:
    explicit BlockHold(LibraryContext &context) noexcept : lock_(controlLock(&context)), context_(context) {
        stopBlocks(context.recordStop, context.recordBusy);
        stopBlocks(context.processStop, context.processBusy);
    }
    ~BlockHold() {
        context_.recordStop.store(0, std::memory_order_release);
        context_.processStop.store(0, std::memory_order_release);
    }
    BlockHold(const BlockHold &) = delete;
    BlockHold &operator=(const BlockHold &) = delete;

  private:
    std::lock_guard<std::recursive_mutex> lock_;
    LibraryContext &context_;
};

}  // namespace vxcomn
