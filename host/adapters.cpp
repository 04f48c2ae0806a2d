// SPDX-License-Identifier: MIT
#include "host/adapters.h"

#include <cstring>

#include "host/host_context.h"
#include "host/kernels.h"

namespace vxcomn {

namespace {

// The private record that a fixed-point engine sees: the caller's, with the process bank for its buffers.
VXCOMN_RT_INLINE ProcessBuffers onProcessBank(LibraryContext &context, const ProcessBuffers &buffers) noexcept {
    ProcessBuffers words = buffers;
    words.channels = reinterpret_cast<float **>(context.processFixedPointers);
    return words;
}

VXCOMN_RT_INLINE int heldTo(int value, int limit) noexcept {
    return value < limit ? value : limit;
}

}  // namespace

bool chooseAdapters(LibraryContext &context, const char *PlatformName) noexcept {
    const auto is = [PlatformName](const char *name) { return std::strcmp(PlatformName, name) == 0; };
    if (PlatformName == nullptr || is("Float")) {
        context.processAdapter = passThroughProcess;
        context.recordAdapter = passThroughRecord;
        return true;
    }
    if (is("HiFi2") || is("iSST") || is("AIC326x")) {
        context.processAdapter = fixedPointProcess;
        context.recordAdapter = fixedPointRecord;
        return true;
    }
    return false;
}

void passThroughProcess(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output) {
    const VXEngineProcess process = contextOf(handle).engineProcess;
    if (process != nullptr) process(handle, buffers, input, output);
}

void passThroughRecord(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format) {
    const VXEngineRecord record = contextOf(handle).engineRecord;
    if (record != nullptr) record(handle, buffers, format);
}

void fixedPointProcess(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output) {
    LibraryContext &context = contextOf(handle);
    const HostKernels &kernels = hostKernels();
    const int channels = heldTo(output->channels, VX_SLOT_COUNT);
    const int frames = heldTo(output->frames, VX_MAX_FRAMES);
    ProcessBuffers words = onProcessBank(context, *buffers);
    for (int i = 0; i < channels; ++i) kernels.toProcessWords(buffers->channels[i], context.processFixedPointers[i], frames);
    if (context.engineProcess != nullptr) context.engineProcess(handle, &words, input, output);
    for (int i = 0; i < channels; ++i) kernels.fromProcessWords(context.processFixedPointers[i], buffers->channels[i], frames);
}

void fixedPointRecord(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format) {
    LibraryContext &context = contextOf(handle);
    const HostKernels &kernels = hostKernels();
    const int channels = heldTo(format->channels, VX_SLOT_COUNT);
    const int frames = heldTo(format->frames, VX_MAX_FRAMES);
    ProcessBuffers words = onProcessBank(context, *buffers);
    for (int i = 0; i < channels; ++i) kernels.toRecordWords(buffers->channels[i], context.recordFixedPointers[i], frames);
    if (context.engineRecord != nullptr) context.engineRecord(handle, &words, format);
}

}  // namespace vxcomn
