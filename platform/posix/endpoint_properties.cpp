// SPDX-License-Identifier: MIT
#include "platform/posix/endpoint_properties.h"

#include <cstring>

#include "platform/posix/com_object.h"

namespace vxcomn {
namespace {

HRESULT becomeText(WideView text, PROPVARIANT &value) noexcept {
    value.pwszVal = taskMemText(text);
    if (value.pwszVal == nullptr) return E_OUTOFMEMORY;
    value.vt = VT_LPWSTR;
    return S_OK;
}

HRESULT becomeBlob(const std::vector<uint8_t> &bytes, PROPVARIANT &value) noexcept {
    value.blob.pBlobData = static_cast<BYTE *>(CoTaskMemAlloc(bytes.size()));
    if (value.blob.pBlobData == nullptr) return E_OUTOFMEMORY;
    if (!bytes.empty()) std::memcpy(value.blob.pBlobData, bytes.data(), bytes.size());
    value.blob.cbSize = static_cast<ULONG>(bytes.size());
    value.vt = VT_BLOB;
    return S_OK;
}

class PropertyStore final : public ComObject<IPropertyStore> {
  public:
    // The key is none if there are no properties.
    PropertyStore(WideString guid, RegistryKey key, bool writable)
        : ComObject(kIidPropertyStore), guid_(std::move(guid)), key_(std::move(key)), writable_(writable) {}

    HRESULT GetCount(DWORD *count) override {
        if (count == nullptr) return E_POINTER;
        std::vector<PROPERTYKEY> keys;
        const HRESULT result = list(keys);
        *count = static_cast<DWORD>(keys.size());
        return result;
    }

    HRESULT GetAt(DWORD index, PROPERTYKEY *key) override {
        if (key == nullptr) return E_POINTER;
        std::vector<PROPERTYKEY> keys;
        if (const HRESULT result = list(keys); FAILED(result)) return result;
        if (index >= keys.size()) return E_INVALIDARG;
        *key = keys[index];
        return S_OK;
    }

    HRESULT GetValue(REFPROPERTYKEY key, PROPVARIANT *value) override {
        if (value == nullptr) return E_POINTER;
        PropVariantInit(value);
        RegistryValue found;
        const Status status = key_ ? key_.query(propertyName(key), found) : status::fileNotFound;
        if (status == status::fileNotFound) {
            const bool isGuid = key.fmtid == kEndpointGuidKey.fmtid && key.pid == kEndpointGuidKey.pid;
            return isGuid ? becomeText(guid_, *value) : S_OK;
        }
        if (status != status::ok) return resultOf(status);
        switch (found.type) {
            case RegistryType::sz: {
                WideString text(found.data.size() / sizeof(VXWCHAR), VXWCHAR{0});
                if (!text.empty()) std::memcpy(text.data(), found.data.data(), text.size() * sizeof(VXWCHAR));
                return becomeText(WideView(text).substr(0, text.find(VXWCHAR{0})), *value);
            }
            case RegistryType::dword:
                if (found.data.size() != sizeof value->ulVal) return S_OK;
                std::memcpy(&value->ulVal, found.data.data(), sizeof value->ulVal);
                value->vt = VT_UI4;
                return S_OK;
            case RegistryType::binary:
                return becomeBlob(found.data, *value);
            default:
                return S_OK;
        }
    }

    HRESULT SetValue(REFPROPERTYKEY key, REFPROPVARIANT value) override {
        if (!writable_) return STG_E_ACCESSDENIED;
        const WideString name = propertyName(key);
        switch (value.vt) {
            case VT_LPWSTR:
                return value.pwszVal != nullptr ? resultOf(key_.setText(name, value.pwszVal)) : E_INVALIDARG;
            case VT_UI4:
                return resultOf(key_.setU32(name, value.ulVal));
            case VT_BLOB:
                if (value.blob.cbSize != 0 && value.blob.pBlobData == nullptr) return E_INVALIDARG;
                return resultOf(key_.setBytes(name, {value.blob.pBlobData, value.blob.cbSize}));
            case VT_EMPTY: {
                const Status status = key_.deleteValue(name);
                return resultOf(status == status::fileNotFound ? status::ok : status);
            }
            default:
                return E_INVALIDARG;
        }
    }

    // Values hold from the moment they are set.
    HRESULT Commit() override { return writable_ ? S_OK : STG_E_ACCESSDENIED; }

  private:
    HRESULT list(std::vector<PROPERTYKEY> &keys) const {
        std::vector<WideString> names;
        if (!key_) return S_OK;
        if (const Status status = key_.values(names); status != status::ok) return resultOf(status);
        for (const WideString &name : names) {
            if (const auto key = propertyOfName(name)) keys.push_back(*key);
        }
        return S_OK;
    }

    const WideString guid_;
    RegistryKey key_;
    const bool writable_;
};

}  // namespace

HRESULT openPropertyStore(const Endpoint &endpoint, DWORD access, IPropertyStore **store) noexcept {
    if (access != STGM_READ && access != STGM_WRITE && access != STGM_READWRITE) return E_INVALIDARG;
    const bool writable = access != STGM_READ;
    RegistryKey device, properties;
    Status status = RegistryKey::open(RegistryRoot::localMachine, endpoint.path(), RegistryAccess::read, device);
    if (status == status::ok && writable) status = device.createBelow(VX_TEXT("Properties"), RegistryAccess::readWrite, properties);
    if (status == status::ok && !writable) {
        status = device.openBelow(VX_TEXT("Properties"), RegistryAccess::read, properties);
        if (status == status::fileNotFound) status = status::ok;
    }
    if (status != status::ok) return resultOf(status);
    return makeCom<PropertyStore>(store, endpoint.guid, std::move(properties), writable);
}

}  // namespace vxcomn
