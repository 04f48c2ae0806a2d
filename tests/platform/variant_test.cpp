// SPDX-License-Identifier: MIT
#include "platform/variant.h"

#include <doctest/doctest.h>

#include <cstring>

#include "platform/text.h"

using namespace vxcomn;

namespace {

struct OwnedVariant {
    VARIANT value;
    OwnedVariant() { VariantInit(&value); }
    ~OwnedVariant() { VariantClear(&value); }
};

LPWSTR taskText(WideView text) {
    auto *copy = static_cast<LPWSTR>(CoTaskMemAlloc((text.size() + 1) * sizeof(VXWCHAR)));
    std::memcpy(copy, text.data(), text.size() * sizeof(VXWCHAR));
    copy[text.size()] = 0;
    return copy;
}

}  // namespace

TEST_CASE("numbers keep their type and value when a property becomes a variant") {
    constexpr VARTYPE kNumbers[] = {VT_EMPTY, VT_NULL, VT_I1,  VT_UI1, VT_I2, VT_UI2, VT_I4,
                                    VT_UI4,   VT_I8,   VT_UI8, VT_R4,  VT_R8, VT_BOOL};
    for (const VARTYPE type : kNumbers) {
        PROPVARIANT from;
        PropVariantInit(&from);
        from.vt = type;
        std::memset(&from.blob, 0xA5, 8);
        OwnedVariant to;
        CHECK(convertVariant(from, to.value) == S_OK);
        CHECK(to.value.vt == type);
        CHECK(std::memcmp(&to.value.ulVal, &from.ulVal, 8) == 0);
    }
}

TEST_CASE("text of every kind and a GUID become a BSTR") {
    const auto textOf = [](PROPVARIANT *from) {
        OwnedVariant to;
        CHECK(convertVariant(*from, to.value) == S_OK);
        REQUIRE(to.value.vt == VT_BSTR);
        CHECK(SysStringLen(to.value.bstrVal) == std::char_traits<VXWCHAR>::length(to.value.bstrVal));
        return toUtf8(to.value.bstrVal);
    };
    OwnedPropVariant value;
    PROPVARIANT *from = value.put();
    from->vt = VT_LPWSTR;
    from->pwszVal = taskText(VX_TEXT("K\u00f6nig"));
    CHECK(textOf(from) == toUtf8(VX_TEXT("K\u00f6nig")));

    from = value.put();
    from->vt = VT_BSTR;
    from->bstrVal = SysAllocString(VX_TEXT("b"));
    CHECK(textOf(from) == "b");

    from = value.put();
    from->vt = VT_LPSTR;
    from->pszVal = static_cast<char *>(CoTaskMemAlloc(3));
    std::memcpy(from->pszVal, "ab", 3);
    CHECK(textOf(from) == "ab");

    from = value.put();
    from->vt = VT_CLSID;
    from->puuid = static_cast<CLSID *>(CoTaskMemAlloc(sizeof(CLSID)));
    *from->puuid = GUID{0x1DA5D803, 0xD492, 0x4EDD, {0x8C, 0x23, 0xE0, 0xC0, 0xFF, 0xEE, 0x7F, 0x0E}};
    CHECK(textOf(from) == "{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E}");
}

TEST_CASE("a blob has no counterpart among variants") {
    OwnedPropVariant from;
    PROPVARIANT *place = from.put();
    place->vt = VT_BLOB;
    place->blob.cbSize = 4;
    place->blob.pBlobData = static_cast<BYTE *>(CoTaskMemAlloc(4));
    OwnedVariant to;
    to.value.vt = VT_I4;
    CHECK(convertVariant(*from, to.value) == DISP_E_BADVARTYPE);
    CHECK(to.value.vt == VT_EMPTY);
}
