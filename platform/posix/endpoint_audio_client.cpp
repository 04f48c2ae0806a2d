// SPDX-License-Identifier: MIT
#include "platform/posix/endpoint_audio_client.h"

#include <algorithm>
#include <cstring>
#include <mutex>

#include "platform/posix/com_object.h"
#include "platform/posix/endpoint_properties.h"
#include "platform/variant.h"

namespace vxcomn {
namespace {

constexpr REFERENCE_TIME kSecond = 10000000, kPeriod = 100000;          // 100 ns; 10 ms
constexpr HRESULT kHandleSetBefore = static_cast<HRESULT>(0x8007007B);  // what the real one says then

// 48 kHz, stereo, float.
WAVEFORMATEXTENSIBLE standardFormat() noexcept {
    WAVEFORMATEXTENSIBLE format = {};
    format.Format = {WAVE_FORMAT_EXTENSIBLE, 2, 48000, 48000 * 8, 8, 32, sizeof format - sizeof format.Format};
    format.Samples.wValidBitsPerSample = 32;
    format.dwChannelMask = 3;
    format.SubFormat = {WAVE_FORMAT_IEEE_FLOAT, 0, 0x0010, {0x80, 0x00, 0x00, 0xAA, 0x00, 0x38, 0x9B, 0x71}};
    return format;
}

// The bytes of a format: the record and what its own size says follows. Empty if that is not all there, or the record makes no
// sense.
std::vector<uint8_t> wholeFormat(const void *bytes, size_t size) {
    WAVEFORMATEX format;
    if (size < sizeof format) return {};
    std::memcpy(&format, bytes, sizeof format);
    if (format.cbSize > size - sizeof format) return {};
    if (format.nChannels == 0 || format.nSamplesPerSec == 0 || format.nBlockAlign == 0) return {};
    const auto *first = static_cast<const uint8_t *>(bytes);
    return {first, first + sizeof format + format.cbSize};
}

std::vector<uint8_t> mixFormatOf(const Endpoint &endpoint) {
    ComPtr<IPropertyStore> properties;
    OwnedPropVariant value;
    if (SUCCEEDED(openPropertyStore(endpoint, STGM_READ, properties.put())) &&
        SUCCEEDED(properties->GetValue(kDeviceFormatKey, value.put())) && value->vt == VT_BLOB) {
        auto format = wholeFormat(value->blob.pBlobData, value->blob.cbSize);
        if (!format.empty()) return format;
    }
    const WAVEFORMATEXTENSIBLE standard = standardFormat();
    return wholeFormat(&standard, sizeof standard);
}

class AudioClient final : public ComObject<IAudioClient> {
  public:
    explicit AudioClient(const Endpoint &endpoint) : ComObject(kIidAudioClient), endpoint_(endpoint), mix_(mixFormatOf(endpoint)) {}

    HRESULT Initialize(AUDCLNT_SHAREMODE mode, DWORD flags, REFERENCE_TIME duration, REFERENCE_TIME, const WAVEFORMATEX *format,
                       const GUID *) override {
        if (format == nullptr) return E_POINTER;
        if (mode != AUDCLNT_SHAREMODE_SHARED && mode != AUDCLNT_SHAREMODE_EXCLUSIVE) return E_INVALIDARG;
        if (duration < 0) return E_INVALIDARG;
        const std::lock_guard lock(mutex_);
        if (initialized_) return AUDCLNT_E_ALREADY_INITIALIZED;
        if (!isActive()) return AUDCLNT_E_DEVICE_INVALIDATED;
        if (mode == AUDCLNT_SHAREMODE_EXCLUSIVE) return AUDCLNT_E_EXCLUSIVE_MODE_NOT_ALLOWED;
        if (!isMixFormat(*format)) return AUDCLNT_E_UNSUPPORTED_FORMAT;
        flags_ = flags;
        duration_ = std::clamp(duration, kPeriod, kSecond * 10);
        initialized_ = true;
        return S_OK;
    }

    HRESULT GetBufferSize(UINT32 *frames) override {
        if (frames == nullptr) return E_POINTER;
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        *frames = static_cast<UINT32>(
            std::min<uint64_t>(static_cast<uint64_t>(duration_) * format().nSamplesPerSec / kSecond, UINT32_MAX));
        return S_OK;
    }
    HRESULT GetStreamLatency(REFERENCE_TIME *latency) override {
        if (latency == nullptr) return E_POINTER;
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        *latency = 0;
        return S_OK;
    }
    HRESULT GetCurrentPadding(UINT32 *frames) override {
        if (frames == nullptr) return E_POINTER;
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        *frames = 0;
        return S_OK;
    }
    HRESULT IsFormatSupported(AUDCLNT_SHAREMODE mode, const WAVEFORMATEX *format, WAVEFORMATEX **closest) override {
        if (format == nullptr || (mode == AUDCLNT_SHAREMODE_SHARED && closest == nullptr)) return E_POINTER;
        if (closest != nullptr) *closest = nullptr;
        if (mode != AUDCLNT_SHAREMODE_SHARED) return AUDCLNT_E_UNSUPPORTED_FORMAT;
        if (isMixFormat(*format)) return S_OK;
        const HRESULT result = GetMixFormat(closest);
        return SUCCEEDED(result) ? S_FALSE : result;
    }
    HRESULT GetMixFormat(WAVEFORMATEX **format) override {
        if (format == nullptr) return E_POINTER;
        *format = static_cast<WAVEFORMATEX *>(CoTaskMemAlloc(mix_.size()));
        if (*format == nullptr) return E_OUTOFMEMORY;
        std::memcpy(*format, mix_.data(), mix_.size());
        return S_OK;
    }
    HRESULT GetDevicePeriod(REFERENCE_TIME *standard, REFERENCE_TIME *shortest) override {
        if (standard == nullptr && shortest == nullptr) return E_POINTER;
        if (standard != nullptr) *standard = kPeriod;
        if (shortest != nullptr) *shortest = kPeriod;
        return S_OK;
    }

    HRESULT Start() override {
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        if (started_) return AUDCLNT_E_NOT_STOPPED;
        if ((flags_ & AUDCLNT_STREAMFLAGS_EVENTCALLBACK) != 0 && event_ == nullptr) return AUDCLNT_E_EVENTHANDLE_NOT_SET;
        if (!isActive()) return AUDCLNT_E_DEVICE_INVALIDATED;
        started_ = true;
        return S_OK;
    }
    HRESULT Stop() override {
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        return std::exchange(started_, false) ? S_OK : S_FALSE;
    }
    HRESULT Reset() override {
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        return started_ ? AUDCLNT_E_NOT_STOPPED : S_OK;
    }
    HRESULT SetEventHandle(HANDLE event) override {
        if (event == nullptr) return E_INVALIDARG;
        const std::lock_guard lock(mutex_);
        if (!initialized_) return AUDCLNT_E_NOT_INITIALIZED;
        if ((flags_ & AUDCLNT_STREAMFLAGS_EVENTCALLBACK) == 0) return AUDCLNT_E_EVENTHANDLE_NOT_EXPECTED;
        if (event_ != nullptr) return kHandleSetBefore;
        event_ = event;
        return S_OK;
    }
    // There is nothing to render to and nothing to capture from.
    HRESULT GetService(REFIID, void **object) override {
        if (object == nullptr) return E_POINTER;
        *object = nullptr;
        return E_NOINTERFACE;
    }

  private:
    WAVEFORMATEX format() const noexcept {
        WAVEFORMATEX format;
        std::memcpy(&format, mix_.data(), sizeof format);
        return format;
    }
    bool isMixFormat(const WAVEFORMATEX &given) const noexcept {
        return format().cbSize == given.cbSize && std::memcmp(mix_.data(), &given, mix_.size()) == 0;
    }
    bool isActive() const { return endpointState(endpoint_) == uint32_t{DEVICE_STATE_ACTIVE}; }

    const Endpoint endpoint_;
    const std::vector<uint8_t> mix_;
    std::mutex mutex_;  // guards what follows
    DWORD flags_ = 0;
    REFERENCE_TIME duration_ = 0;
    HANDLE event_ = nullptr;
    bool initialized_ = false, started_ = false;
};

}  // namespace

HRESULT makeAudioClient(const Endpoint &endpoint, IAudioClient **client) noexcept {
    if (endpointState(endpoint) != uint32_t{DEVICE_STATE_ACTIVE}) return AUDCLNT_E_DEVICE_INVALIDATED;
    return makeCom<AudioClient>(client, endpoint);
}

}  // namespace vxcomn
