// SPDX-License-Identifier: MIT
#include "tools/vx_client/session.h"

#include <algorithm>
#include <vector>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

struct Sentence {
    int32_t code;
    const char *text;
};
constexpr Sentence kSentences[] = {
    {VXAPOCOMAPI_ERROR_INVALID_APO_TYPE, "this is no effect slot; expected EFX, MFX, SFX, LFX or GFX"},
    {VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID, "the slot's engine has no such parameter; vx get shows those that it has"},
    {VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE,
     "the stored level lies below the slider's range; set it anew or take the preset's with vx reset"},
    {VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET, "no effect slot is chosen; choose one with --apo"},
    {VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED, "the preset leaves this equaliser band out; use another band"},
    {VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND, "no endpoint has this index; vx list shows them"},
    {VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE, "the endpoint is gone or cannot be opened; vx list shows what is there"},
    {VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE, "the endpoint has no such property, or one of a kind that cannot be told"},
};

constexpr uint32_t kFileNotFound = 2, kAccessDenied = 5;

}  // namespace

std::string errorSentence(int32_t code, uint32_t windowsError) {
    if (code == VXAPOCOMAPI_ERROR_NONE) return {};
    if (code == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE) {
        if (windowsError == kFileNotFound)
            return "the store has no such value and neither has the preset; vx doctor tells which preset is in use";
        if (windowsError == kAccessDenied)
            return "the registry refuses access; check the rights of the machine folder or registry key";
        return textf("the system refused with Windows error %u; vx doctor looks for the reason", windowsError);
    }
    for (const Sentence &sentence : kSentences)
        if (sentence.code == code) return sentence.text;
    return textf("the library answered with code %d, which is none of its own", code);
}

Session::Session(const Device &device, const std::string &apo, SessionKind kind) : device_(device), apo_(apo) {
    api_ = VXAPOCOMAPI_InitializeAPI();
    if (api_ == nullptr)
        throw Failure(ExitStatus::system, "the library cannot reach the system's audio endpoints; is its audio service running?");
    endpoint_ = kind == SessionKind::control ? VXAPOCOMAPI_GetEndpointEx(api_, device.id.c_str(), 1, &instance_)
                                             : _VXAPOCOMAPI_GetEndpoint(api_, device.id.c_str(), 0, 0, &instance_);
    const bool opened = endpoint_ != nullptr;
    if (opened && (apo.empty() || VXAPOCOMAPI_SetAPOType(endpoint_, apo.c_str()) == 1)) return;
    const std::string why =
        opened ? lastError() : errorSentence(VXAPOCOMAPI_GetLastError(api_), VXAPOCOMAPI_GetWindowsLastError(api_));
    VXAPOCOMAPI_FreeAPI(api_);
    throw Failure(ExitStatus::input, "endpoint " + device.name + ": " + why);
}

Session::~Session() {
    VXAPOCOMAPI_FreeEndpoint(endpoint_);
    VXAPOCOMAPI_FreeAPI(api_);
}

std::string Session::lastError() const {
    return errorSentence(VXAPOCOMAPI_GetLastError(endpoint_), VXAPOCOMAPI_GetWindowsLastError(endpoint_));
}

void Session::fail(const std::string &what) const {
    const int32_t code = VXAPOCOMAPI_GetLastError(endpoint_);
    const std::string why = lastError();
    const bool refused = code == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE && VXAPOCOMAPI_GetWindowsLastError(endpoint_) != kFileNotFound;
    throw Failure(refused ? ExitStatus::system : ExitStatus::input,
                  device_.name + (apo_.empty() ? "" : ", " + apo_) + ": " + what + ": " +
                      (why.empty() ? "the library does not say why; vx doctor looks for the reason" : why));
}

std::string Session::selection(int32_t (*getter)(VXAPOHandle, char *), size_t room) const {
    // A name that fills the room comes without its end.
    std::vector<char> name(room + 1, '\0');
    getter(endpoint_, name.data());
    return printable(std::string(name.begin(), std::find(name.begin(), name.begin() + static_cast<long>(room), '\0')));
}

}  // namespace vx::client
