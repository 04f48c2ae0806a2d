// SPDX-License-Identifier: MIT
//
// vx props: the properties of an endpoint that the library knows by number, or any of its property store by key.
#include <vxcomn/com_memory.h>

#include <iostream>
#include <memory>

#include "platform/guid.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_choice.h"
#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

namespace {

struct PropsOptions : SlotOptions {
    std::vector<std::string> keys;
};

struct KnownProperty {
    uint32_t id;
    const char *name;
};
constexpr KnownProperty kKnown[] = {
    {VXAPOCOMAPI_EndpointPropID_DeviceID, "DeviceID"},           {VXAPOCOMAPI_EndpointPropID_SSID, "SSID"},
    {VXAPOCOMAPI_EndpointPropID_FriendlyName, "FriendlyName"},   {VXAPOCOMAPI_EndpointPropID_EngineName, "EngineName"},
    {VXAPOCOMAPI_EndpointPropID_EndpointIndex, "EndpointIndex"}, {VXAPOCOMAPI_EndpointPropID_EndpointState, "EndpointState"},
    {VXAPOCOMAPI_EndpointPropID_PresetZipPath, "PresetZipPath"}, {VXAPOCOMAPI_EndpointPropID_PresetFilePath, "PresetFilePath"},
};

class OwnedVariant {
  public:
    OwnedVariant() { VariantInit(&value_); }
    ~OwnedVariant() { VariantClear(&value_); }
    OwnedVariant(const OwnedVariant &) = delete;
    OwnedVariant &operator=(const OwnedVariant &) = delete;

    VARIANT *get() { return &value_; }

    Json json() const {
        switch (value_.vt) {
            case VT_BSTR:
                return value_.bstrVal == nullptr
                           ? Json("")
                           : Json(vxcomn::toUtf8(vxcomn::WideView(value_.bstrVal, SysStringLen(value_.bstrVal))));
            case VT_I1:
                return static_cast<int8_t>(value_.bVal);
            case VT_UI1:
                return value_.bVal;
            case VT_I2:
                return value_.iVal;
            case VT_UI2:
                return value_.uiVal;
            case VT_I4:
                return value_.lVal;
            case VT_UI4:
                return value_.ulVal;
            case VT_I8:
                return value_.llVal;
            case VT_UI8:
                return value_.ullVal;
            case VT_R4:
                return value_.fltVal;
            case VT_R8:
                return value_.dblVal;
            case VT_BOOL:
                return value_.boolVal != 0;
            default:
                return {};
        }
    }
    uint16_t type() const { return value_.vt; }

  private:
    VARIANT value_;
};

// "{GUID},ID"
std::pair<GUID, uint32_t> parseKey(const std::string &text) {
    const size_t comma = text.find(',');
    GUID guid = {};
    const auto id = comma == std::string::npos ? std::nullopt : parseInteger(text.substr(comma + 1), 0, UINT32_MAX);
    if (!id || !vxcomn::parseGuidText(vxcomn::toWide(text.substr(0, comma)), guid))
        throw Failure(ExitStatus::usage,
                      "--key " + text + ": expected {GUID},NUMBER, such as {A45C254E-DF1C-4EFD-8020-67D146A850E0},14");
    return {guid, static_cast<uint32_t>(*id)};
}

Json readKnown(const Session &session, uint32_t id) {
    OwnedVariant value;
    // The result tells nothing without a GUID, the last error does.
    VXAPOCOMAPI_GetEndpointPropertyValue(session.handle(), nullptr, id, value.get());
    return VXAPOCOMAPI_GetLastError(session.handle()) == VXAPOCOMAPI_ERROR_NONE ? value.json() : Json();
}

Json readKey(const Session &session, const std::string &text) {
    const auto [guid, id] = parseKey(text);
    OwnedVariant value;
    if (VXAPOCOMAPI_GetEndpointPropertyValue(session.handle(), &guid, id, value.get()) != 1) session.fail("property " + text);
    if (value.type() == VT_EMPTY)
        throw Failure(ExitStatus::input, session.device().name + ": property " + text + ": " +
                                             errorSentence(VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE, 0));
    return value.json();
}

std::string valueText(const Json &value) {
    if (value.is_null()) return "-";
    return value.is_string() ? printable(value.get<std::string>()) : value.dump();
}

void props(const PropsOptions &options) {
    for (const std::string &key : options.keys) parseKey(key);
    const Session session = openSlot(options.slot, SessionKind::observer);
    Json properties = Json::object();
    if (options.keys.empty())
        for (const KnownProperty &known : kKnown) properties[known.name] = readKnown(session, known.id);
    for (const std::string &key : options.keys) properties[key] = readKey(session, key);
    if (options.common.json) {
        std::cout << documentText(
            {{"endpoint", deviceJson(session.device())}, {"apo", textOrNull(session.apo())}, {"properties", properties}});
        return;
    }
    for (const auto &[name, value] : properties.items())
        std::cout << (options.keys.size() == 1 ? "" : textf("%-15s ", name.c_str())) << valueText(value) << "\n";
}

}  // namespace

void addPropsVerb(CLI::App &app) {
    auto options = std::make_shared<PropsOptions>();
    CLI::App *verb = app.add_subcommand("props", "The properties of an endpoint");
    addSlotOptions(*verb, *options);
    verb->add_option("--key", options->keys, "This property of the endpoint's store instead; may be repeated")
        ->allow_extra_args(false)
        ->type_name("{GUID},ID");
    verb->footer(
        "The engine and the preset are those of the slot.\n"
        "Examples:\n"
        "  vx props speakers\n"
        "  vx props speakers --key '{A45C254E-DF1C-4EFD-8020-67D146A850E0},2'");
    verb->callback([options] { props(*options); });
}

}  // namespace vx::client
