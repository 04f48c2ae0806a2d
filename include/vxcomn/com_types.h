/* SPDX-License-Identifier: MIT
 *
 * The COM-shaped records that cross the library's interface: GUID, PROPERTYKEY, PROPVARIANT, VARIANT, the device interfaces and
 * the audio client. On Windows they are the SDK's. Elsewhere this header declares the part of them that is in use, with the same
 * layout and the same order of slots, so that code which speaks to them reads the same on both. Memory that changes hands follows
 * com_memory.h. Compiles as C11 and C++17; in C the interfaces are opaque.
 */
#ifndef VXCOMN_COM_TYPES_H
#define VXCOMN_COM_TYPES_H

#include "vxcomn/types.h"

#if VXCOMN_SYSTEM_HAS_COM
#ifndef WIN32_LEAN_AND_MEAN
#define WIN32_LEAN_AND_MEAN
#endif
#ifndef NOMINMAX
#define NOMINMAX
#endif
/* clang-format off: windows.h comes first, the others lean on it */
#include <audioclient.h>
#include <mmdeviceapi.h>
#include <mmreg.h>
#include <objbase.h>
#include <oleauto.h>
#include <propidl.h>
#include <propsys.h>
#include <windows.h>
/* clang-format on */
#else

typedef int32_t HRESULT;
typedef int32_t LONG;
typedef int32_t BOOL;
typedef uint32_t DWORD;
typedef uint32_t UINT;
typedef uint32_t UINT32;
typedef uint32_t ULONG;
typedef uint16_t WORD;
typedef uint16_t VARTYPE;
typedef uint8_t BYTE;
typedef int16_t VARIANT_BOOL;   /* -1 is true */
typedef int64_t REFERENCE_TIME; /* in units of 100 ns */
typedef void *HANDLE;
typedef VXWCHAR *LPWSTR;
typedef const VXWCHAR *LPCWSTR;
typedef VXWCHAR *BSTR; /* its size in bytes stands in the four bytes before it */

typedef struct GUID {
    uint32_t Data1;
    uint16_t Data2;
    uint16_t Data3;
    uint8_t Data4[8];
} GUID;
typedef GUID IID;
typedef GUID CLSID;

typedef struct PROPERTYKEY {
    GUID fmtid;
    DWORD pid;
} PROPERTYKEY;

enum VARENUM {
    VT_EMPTY = 0,
    VT_NULL = 1,
    VT_I2 = 2,
    VT_I4 = 3,
    VT_R4 = 4,
    VT_R8 = 5,
    VT_BSTR = 8,
    VT_BOOL = 11,
    VT_I1 = 16,
    VT_UI1 = 17,
    VT_UI2 = 18,
    VT_UI4 = 19,
    VT_I8 = 20,
    VT_UI8 = 21,
    VT_LPSTR = 30,
    VT_LPWSTR = 31,
    VT_BLOB = 65,
    VT_CLSID = 72
};

typedef struct BLOB {
    ULONG cbSize;
    BYTE *pBlobData;
} BLOB;

typedef struct PROPVARIANT {
    VARTYPE vt;
    WORD wReserved1, wReserved2, wReserved3;
    union {
        int8_t cVal;
        uint8_t bVal;
        int16_t iVal;
        uint16_t uiVal;
        int32_t lVal;
        uint32_t ulVal;
        int64_t hVal;
        uint64_t uhVal;
        float fltVal;
        double dblVal;
        VARIANT_BOOL boolVal;
        CLSID *puuid;
        BLOB blob;
        BSTR bstrVal;
        char *pszVal;
        LPWSTR pwszVal;
    };
} PROPVARIANT;

typedef struct VARIANT {
    VARTYPE vt;
    WORD wReserved1, wReserved2, wReserved3;
    union {
        int8_t cVal;
        uint8_t bVal;
        int16_t iVal;
        uint16_t uiVal;
        int32_t lVal;
        uint32_t ulVal;
        int64_t llVal;
        uint64_t ullVal;
        float fltVal;
        double dblVal;
        VARIANT_BOOL boolVal;
        BSTR bstrVal;
        void *byref;
        void *record[2]; /* only for the size */
    };
} VARIANT;

#pragma pack(push, 1)
typedef struct WAVEFORMATEX {
    WORD wFormatTag;
    WORD nChannels;
    DWORD nSamplesPerSec;
    DWORD nAvgBytesPerSec;
    WORD nBlockAlign;
    WORD wBitsPerSample;
    WORD cbSize; /* bytes that follow */
} WAVEFORMATEX;

typedef struct WAVEFORMATEXTENSIBLE {
    WAVEFORMATEX Format;
    union {
        WORD wValidBitsPerSample;
        WORD wSamplesPerBlock;
        WORD wReserved;
    } Samples;
    DWORD dwChannelMask;
    GUID SubFormat;
} WAVEFORMATEXTENSIBLE;
#pragma pack(pop)

#define WAVE_FORMAT_PCM 1
#define WAVE_FORMAT_IEEE_FLOAT 3
#define WAVE_FORMAT_EXTENSIBLE 0xFFFE

typedef enum EDataFlow { eRender = 0, eCapture = 1, eAll = 2 } EDataFlow;
typedef enum ERole { eConsole = 0, eMultimedia = 1, eCommunications = 2 } ERole;
typedef enum AUDCLNT_SHAREMODE { AUDCLNT_SHAREMODE_SHARED = 0, AUDCLNT_SHAREMODE_EXCLUSIVE = 1 } AUDCLNT_SHAREMODE;

#define DEVICE_STATE_ACTIVE 0x1
#define DEVICE_STATE_DISABLED 0x2
#define DEVICE_STATE_NOTPRESENT 0x4
#define DEVICE_STATE_UNPLUGGED 0x8
#define DEVICE_STATEMASK_ALL 0xF

#define STGM_READ 0
#define STGM_WRITE 1
#define STGM_READWRITE 2

#define CLSCTX_INPROC_SERVER 0x1
#define CLSCTX_ALL 0x17

#define AUDCLNT_STREAMFLAGS_EVENTCALLBACK 0x00040000

#define SUCCEEDED(result) (((HRESULT)(result)) >= 0)
#define FAILED(result) (((HRESULT)(result)) < 0)

#define S_OK ((HRESULT)0)
#define S_FALSE ((HRESULT)1)
#define E_NOTIMPL ((HRESULT)0x80004001)
#define E_NOINTERFACE ((HRESULT)0x80004002)
#define E_POINTER ((HRESULT)0x80004003)
#define E_FAIL ((HRESULT)0x80004005)
#define E_ACCESSDENIED ((HRESULT)0x80070005)
#define E_OUTOFMEMORY ((HRESULT)0x8007000E)
#define E_INVALIDARG ((HRESULT)0x80070057)
#define STG_E_ACCESSDENIED ((HRESULT)0x80030005)
#define CO_E_CLASSSTRING ((HRESULT)0x800401F3)
#define DISP_E_BADVARTYPE ((HRESULT)0x80020008)
#define AUDCLNT_E_NOT_INITIALIZED ((HRESULT)0x88890001)
#define AUDCLNT_E_ALREADY_INITIALIZED ((HRESULT)0x88890002)
#define AUDCLNT_E_DEVICE_INVALIDATED ((HRESULT)0x88890004)
#define AUDCLNT_E_NOT_STOPPED ((HRESULT)0x88890005)
#define AUDCLNT_E_UNSUPPORTED_FORMAT ((HRESULT)0x88890008)
#define AUDCLNT_E_EVENTHANDLE_NOT_EXPECTED ((HRESULT)0x88890011)
#define AUDCLNT_E_EXCLUSIVE_MODE_NOT_ALLOWED ((HRESULT)0x8889000E)
#define AUDCLNT_E_EVENTHANDLE_NOT_SET ((HRESULT)0x88890014)

#ifdef __cplusplus

typedef const GUID &REFGUID;
typedef const IID &REFIID;
typedef const CLSID &REFCLSID;
typedef const PROPERTYKEY &REFPROPERTYKEY;
typedef const PROPVARIANT &REFPROPVARIANT;

inline bool operator==(const GUID &left, const GUID &right) noexcept {
    bool equal = left.Data1 == right.Data1 && left.Data2 == right.Data2 && left.Data3 == right.Data3;
    for (int i = 0; i < 8; ++i) equal = equal && left.Data4[i] == right.Data4[i];
    return equal;
}
inline bool operator!=(const GUID &left, const GUID &right) noexcept {
    return !(left == right);
}

/* What implements one of these frees itself in Release, so nobody deletes one from outside. */
struct IUnknown {
    virtual HRESULT QueryInterface(REFIID iid, void **object) = 0;
    virtual ULONG AddRef() = 0;
    virtual ULONG Release() = 0;

  protected:
    ~IUnknown() = default;
};

struct IPropertyStore : IUnknown {
    virtual HRESULT GetCount(DWORD *count) = 0;
    virtual HRESULT GetAt(DWORD index, PROPERTYKEY *key) = 0;
    virtual HRESULT GetValue(REFPROPERTYKEY key, PROPVARIANT *value) = 0;
    virtual HRESULT SetValue(REFPROPERTYKEY key, REFPROPVARIANT value) = 0;
    virtual HRESULT Commit() = 0;

  protected:
    ~IPropertyStore() = default;
};

struct IMMDevice : IUnknown {
    virtual HRESULT Activate(REFIID iid, DWORD context, PROPVARIANT *parameters, void **object) = 0;
    virtual HRESULT OpenPropertyStore(DWORD access, IPropertyStore **store) = 0;
    virtual HRESULT GetId(LPWSTR *id) = 0;
    virtual HRESULT GetState(DWORD *state) = 0;

  protected:
    ~IMMDevice() = default;
};

struct IMMDeviceCollection : IUnknown {
    virtual HRESULT GetCount(UINT *count) = 0;
    virtual HRESULT Item(UINT index, IMMDevice **device) = 0;

  protected:
    ~IMMDeviceCollection() = default;
};

struct IMMNotificationClient : IUnknown {
    virtual HRESULT OnDeviceStateChanged(LPCWSTR id, DWORD state) = 0;
    virtual HRESULT OnDeviceAdded(LPCWSTR id) = 0;
    virtual HRESULT OnDeviceRemoved(LPCWSTR id) = 0;
    virtual HRESULT OnDefaultDeviceChanged(EDataFlow flow, ERole role, LPCWSTR id) = 0;
    virtual HRESULT OnPropertyValueChanged(LPCWSTR id, const PROPERTYKEY key) = 0;

  protected:
    ~IMMNotificationClient() = default;
};

struct IMMDeviceEnumerator : IUnknown {
    virtual HRESULT EnumAudioEndpoints(EDataFlow flow, DWORD stateMask, IMMDeviceCollection **devices) = 0;
    virtual HRESULT GetDefaultAudioEndpoint(EDataFlow flow, ERole role, IMMDevice **device) = 0;
    virtual HRESULT GetDevice(LPCWSTR id, IMMDevice **device) = 0;
    virtual HRESULT RegisterEndpointNotificationCallback(IMMNotificationClient *client) = 0;
    virtual HRESULT UnregisterEndpointNotificationCallback(IMMNotificationClient *client) = 0;

  protected:
    ~IMMDeviceEnumerator() = default;
};

struct IAudioClient : IUnknown {
    virtual HRESULT Initialize(AUDCLNT_SHAREMODE mode, DWORD flags, REFERENCE_TIME duration, REFERENCE_TIME period,
                               const WAVEFORMATEX *format, const GUID *session) = 0;
    virtual HRESULT GetBufferSize(UINT32 *frames) = 0;
    virtual HRESULT GetStreamLatency(REFERENCE_TIME *latency) = 0;
    virtual HRESULT GetCurrentPadding(UINT32 *frames) = 0;
    virtual HRESULT IsFormatSupported(AUDCLNT_SHAREMODE mode, const WAVEFORMATEX *format, WAVEFORMATEX **closest) = 0;
    virtual HRESULT GetMixFormat(WAVEFORMATEX **format) = 0;
    virtual HRESULT GetDevicePeriod(REFERENCE_TIME *standard, REFERENCE_TIME *shortest) = 0;
    virtual HRESULT Start() = 0;
    virtual HRESULT Stop() = 0;
    virtual HRESULT Reset() = 0;
    virtual HRESULT SetEventHandle(HANDLE event) = 0;
    virtual HRESULT GetService(REFIID iid, void **object) = 0;

  protected:
    ~IAudioClient() = default;
};

#else

typedef struct IUnknown IUnknown;
typedef struct IPropertyStore IPropertyStore;
typedef struct IMMDevice IMMDevice;
typedef struct IMMDeviceCollection IMMDeviceCollection;
typedef struct IMMNotificationClient IMMNotificationClient;
typedef struct IMMDeviceEnumerator IMMDeviceEnumerator;
typedef struct IAudioClient IAudioClient;

#endif
#endif

#ifdef __cplusplus
static_assert(sizeof(GUID) == 16 && sizeof(PROPERTYKEY) == 20, "as the system lays them out");
static_assert(sizeof(PROPVARIANT) == 24 && offsetof(PROPVARIANT, ulVal) == 8 && alignof(PROPVARIANT) == 8, "likewise");
static_assert(sizeof(VARIANT) == 24 && offsetof(VARIANT, ulVal) == 8 && alignof(VARIANT) == 8, "likewise");
static_assert(sizeof(BLOB) == 16 && offsetof(BLOB, pBlobData) == 8, "likewise");
static_assert(sizeof(WAVEFORMATEX) == 18 && sizeof(WAVEFORMATEXTENSIBLE) == 40, "likewise");
static_assert(offsetof(WAVEFORMATEXTENSIBLE, dwChannelMask) == 20 && offsetof(WAVEFORMATEXTENSIBLE, SubFormat) == 24, "likewise");
#endif

#endif
