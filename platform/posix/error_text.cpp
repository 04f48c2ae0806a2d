// SPDX-License-Identifier: MIT
#include "platform/error_text.h"

#include <algorithm>
#include <iterator>

namespace vxcomn {

namespace {

struct Words {
    Status error;
    const VXWCHAR *text;
};

constexpr Words kWords[] = {
    {status::ok, VX_TEXT("Success.")},
    {status::fileNotFound, VX_TEXT("No such value, key or file.")},
    {status::pathNotFound, VX_TEXT("No such path.")},
    {status::accessDenied, VX_TEXT("Access is denied.")},
    {status::invalidHandle, VX_TEXT("The handle is none.")},
    {status::notEnoughMemory, VX_TEXT("Memory is short.")},
    {status::genFailure, VX_TEXT("The system failed.")},
    {status::sharingViolation, VX_TEXT("Somebody else is using it.")},
    {status::notSupported, VX_TEXT("That is not supported.")},
    {status::invalidParameter, VX_TEXT("An argument is wrong.")},
    {status::diskFull, VX_TEXT("The disk is full.")},
    {status::insufficientBuffer, VX_TEXT("The buffer is too small.")},
    {status::invalidName, VX_TEXT("The name is none.")},
    {status::moreData, VX_TEXT("There is more data than room.")},
    {status::notOwner, VX_TEXT("The caller does not own it.")},
    {status::badDb, VX_TEXT("The registry is damaged.")},
    {status::keyDeleted, VX_TEXT("The key has been deleted.")},
};

}  // namespace

WideString errorText(Status error) {
    const auto *const found = std::find_if(std::begin(kWords), std::end(kWords), [&](const Words &w) { return w.error == error; });
    return found != std::end(kWords) ? found->text : WideString();
}

}  // namespace vxcomn
