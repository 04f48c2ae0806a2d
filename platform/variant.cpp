// SPDX-License-Identifier: MIT
#include "platform/variant.h"

#include <cstring>

#include "platform/guid.h"
#include "platform/text.h"

namespace vxcomn {
namespace {

HRESULT becomeText(const VXWCHAR *text, VARIANT &to) {
    const VXWCHAR nothing = 0;
    to.bstrVal = SysAllocString(text != nullptr ? text : &nothing);
    if (to.bstrVal == nullptr) return E_OUTOFMEMORY;
    to.vt = VT_BSTR;
    return S_OK;
}

}  // namespace

HRESULT convertVariant(const PROPVARIANT &from, VARIANT &to) {
    VariantInit(&to);
    switch (from.vt) {
        case VT_EMPTY:
        case VT_NULL:
        case VT_I1:
        case VT_UI1:
        case VT_I2:
        case VT_UI2:
        case VT_I4:
        case VT_UI4:
        case VT_I8:
        case VT_UI8:
        case VT_R4:
        case VT_R8:
        case VT_BOOL:
            to.vt = from.vt;
            std::memcpy(&to.ullVal, &from.uhVal, sizeof to.ullVal);
            return S_OK;
        case VT_LPWSTR:
            return becomeText(from.pwszVal, to);
        case VT_BSTR:
            return becomeText(from.bstrVal, to);
        case VT_LPSTR:
            return becomeText(from.pszVal != nullptr ? toWide(from.pszVal).c_str() : nullptr, to);
        case VT_CLSID:
            return from.puuid != nullptr ? becomeText(guidText(*from.puuid).c_str(), to) : DISP_E_BADVARTYPE;
        default:
            return DISP_E_BADVARTYPE;
    }
}

}  // namespace vxcomn
