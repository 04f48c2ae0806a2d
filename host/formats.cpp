// SPDX-License-Identifier: MIT
//
// Format negotiation: asking the engine what it supports, and making the measuring objects anew for each format. Control threads;
// VXDSPAPI_SetIOFormat while no block runs.
#include "VXDSPAPI.h"
#include "host/channel_mixer.h"
#include "host/handshake.h"
#include "host/host_context.h"
#include "host/isst_module.h"
#include "host/measuring_objects.h"

namespace vxcomn {

namespace {

constexpr int kStereoChannels = 2;
constexpr uint32_t kStereoMask = VX_SPEAKER_FRONT_LEFT | VX_SPEAKER_FRONT_RIGHT;

// The four words that make a format; the slot tables take no part.
bool sameFormat(const IOFormat &a, const IOFormat &b) {
    return a.channels == b.channels && a.channelMask == b.channelMask && a.frames == b.frames && a.sampleRate == b.sampleRate;
}

bool isZero(const IOFormat &format) {
    return sameFormat(format, IOFormat{});
}

uint32_t setIOFormat(VXHandle handle, IOFormat *input, IOFormat *output) {
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_SetIOFormat"));
    // The caller keeps blocks out; other control calls, such as the readout of an analyser, are kept out here.
    const std::lock_guard lock(controlLock(&context));
    if (sameFormat(*input, context.inputFormat) && sameFormat(*output, context.outputFormat)) {
        hostLog(context, VX_TEXT("Format hasn't changed\n"));
        return 0;
    }
    if (!isZero(context.inputFormat) || !isZero(context.outputFormat)) disposeMeasuringObjects(context);
    context.inputFormat = *input;
    context.outputFormat = *output;
    if (isZero(*input) && isZero(*output)) return 0;
    storeShared(context.sampleRate, context.outputFormat.sampleRate);
    createMeasuringObjects(context);
    uint32_t result = 0;
    if (context.engineSetIOFormat != nullptr) result = context.engineSetIOFormat(handle, input, output);
    if (isstInUse(context) && context.isstModule->engineSetIOFormat != nullptr) {
        result = context.isstModule->engineSetIOFormat(context.isstHandle, input, output);
    }
    return result;
}

using FormatQuery = VXEngineIsInputFormatSupported LibraryContext::*;

// Kept: the two sides differ in what they return for a rewritten format, so that the caller can tell which it was.
uint32_t isFormatSupported(VXHandle handle, FormatQuery query, const VXWCHAR *name, uint32_t rewritten, IOFormat *tested,
                           IOFormat *other) {
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), name);
    tested->frames = VX_MAX_FRAMES;
    other->frames = VX_MAX_FRAMES;
    if (context.*query != nullptr) return (context.*query)(handle, tested, other);
    if (tested->channels == kStereoChannels) return 0;
    tested->channels = kStereoChannels;
    setChannelMask(tested, kStereoMask);
    return rewritten;
}

}  // namespace

}  // namespace vxcomn

uint32_t VXDSPAPI_SetIOFormat(VXHandle handle, IOFormat *input, IOFormat *output) {
    return vxcomn::setIOFormat(handle, input, output);
}

uint32_t VXDSPAPI_IsInputFormatSupported(VXHandle handle, IOFormat *tested, IOFormat *other) {
    return vxcomn::isFormatSupported(handle, &LibraryContext::engineIsInputFormatSupported,
                                     VX_TEXT("VXDSPAPI_IsInputFormatSupported"), 1, tested, other);
}

uint32_t VXDSPAPI_IsOutputFormatSupported(VXHandle handle, IOFormat *tested, IOFormat *other) {
    return vxcomn::isFormatSupported(handle, &LibraryContext::engineIsOutputFormatSupported,
                                     VX_TEXT("VXDSPAPI_IsOutputFormatSupported"), 2, tested, other);
}
