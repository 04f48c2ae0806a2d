// SPDX-License-Identifier: MIT
//
// Keeps a shared-mode stream open on an endpoint without a sound, so that the system has its chain of effects loaded. Nobody waits
// for the stream's event, and no buffer is ever written.
#include <memory>
#include <mutex>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "control/slot_call.h"
#include "platform/endpoints.h"
#include "vxcomn/com_memory.h"

namespace {

constexpr REFERENCE_TIME kBuffer = 10'000'000;  // of 100 ns: one second

struct TaskMemory {
    void operator()(void *memory) const noexcept { CoTaskMemFree(memory); }
};
using Format = std::unique_ptr<WAVEFORMATEX, TaskMemory>;

// The frame of the two calls. `work` runs under the state lock.
template <class Work>
int32_t callActivation(void *handle, const VXWCHAR *traceName, Work &&work) {
    VXAPOCOMAPI_EndpointContext *const endpoint = vxcomn::findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    const vxcomn::TraceScope scope(endpoint->TraceTarget, traceName, vxcomn::handleArgument(handle));
    const std::lock_guard state(endpoint->stateLock());
    vxcomn::succeed(*endpoint);
    return work(*endpoint) ? 1 : 0;
}

}  // namespace

bool VXAPOCOMAPI_EndpointContext::ActivateEndpoint() {
    const vxcomn::TraceScope scope(TraceTarget, VX_TEXT("VXAPOCOMAPI_EndpointContext::ActivateEndpoint"));
    const auto succeeded = [this](HRESULT result, const VXWCHAR *failure) {
        if (FAILED(result)) log(failure, result);
        return SUCCEEDED(result);
    };
    const vxcomn::ComRef<IMMDevice> device = Device.get();
    if (!device) return false;
    vxcomn::ComPtr<IAudioClient> made;
    void *object = nullptr;
    if (!succeeded(device->Activate(vxcomn::kIidAudioClient, CLSCTX_ALL, nullptr, &object),
                   VX_TEXT("Failed to retreive audio client interface with error code: %i.\n"))) {
        return false;
    }
    made.reset(static_cast<IAudioClient *>(object));
    const vxcomn::ComRef<IAudioClient> client(made.get());
    AudioClient.set(client);
    WAVEFORMATEX *mix = nullptr;
    if (!succeeded(client->GetMixFormat(&mix), VX_TEXT("Failed to get format with error code: %i.\n"))) return false;
    const Format format(mix);
    log(VX_TEXT("Audio format: Number of channels = %i, Sample rate = %i, Sample resolution = %i.\n"), uint32_t{format->nChannels},
        uint32_t{format->nSamplesPerSec}, uint32_t{format->wBitsPerSample});
    if (!succeeded(
            client->Initialize(AUDCLNT_SHAREMODE_SHARED, AUDCLNT_STREAMFLAGS_EVENTCALLBACK, kBuffer, 0, format.get(), nullptr),
            VX_TEXT("Failed to initialize IAudioClient: %i.\n"))) {
        return false;
    }
    AudioEvent.reset();
    return succeeded(client->SetEventHandle(AudioEvent.handle()), VX_TEXT("Failed to set audio callback event handle: %i.\n")) &&
           succeeded(client->Start(), VX_TEXT("Failed to start IAudioClient: %i.\n"));
}

void VXAPOCOMAPI_EndpointContext::DeactivateEndpoint() {
    const vxcomn::TraceScope scope(TraceTarget, VX_TEXT("VXAPOCOMAPI_EndpointContext::DeactivateEndpoint"));
    const vxcomn::ComRef<IAudioClient> client = AudioClient.get();
    if (!client) return;
    if (const HRESULT result = client->Stop(); FAILED(result)) {
        log(VX_TEXT("Failed to stop audio client with error code: %i.\n"), result);
    }
    AudioClient.setSilently({});
}

int32_t VXAPOCOMAPI_ActivateEndpoint(VXAPOHandle apoComHandle) {
    return vxcomn::guarded(0, [&] {
        return callActivation(apoComHandle, VX_TEXT("VXAPOCOMAPI_ActivateEndpoint"),
                              [](VXAPOCOMAPI_EndpointContext &endpoint) { return endpoint.ActivateEndpoint(); });
    });
}

int32_t VXAPOCOMAPI_DeactivateEndpoint(VXAPOHandle apoComHandle) {
    return vxcomn::guarded(0, [&] {
        return callActivation(apoComHandle, VX_TEXT("VXAPOCOMAPI_DeactivateEndpoint"), [](VXAPOCOMAPI_EndpointContext &endpoint) {
            endpoint.DeactivateEndpoint();
            return true;
        });
    });
}
