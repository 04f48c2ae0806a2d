// SPDX-License-Identifier: MIT
#include "platform/power_events.h"

#include <atomic>

#include "platform/windows/sdk.h"

namespace vxcomn {

struct PowerEvents::Impl {
    PowerListener &listener;
    std::atomic<HWND> window{nullptr};  // set by the thread that runs, read by those who close and inject

    static LRESULT CALLBACK procedure(HWND window, UINT message, WPARAM word, LPARAM extra) {
        if (message == WM_CREATE) {
            const auto *creation = reinterpret_cast<const CREATESTRUCTW *>(extra);
            SetWindowLongPtrW(window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(creation->lpCreateParams));
        }
        auto *self = reinterpret_cast<Impl *>(GetWindowLongPtrW(window, GWLP_USERDATA));
        if (self == nullptr) return DefWindowProcW(window, message, word, extra);
        if (message == WM_DESTROY) {
            self->window = nullptr;
            PostQuitMessage(0);
            return 0;
        }
        if (message == WM_POWERBROADCAST && word == PBT_APMSUSPEND) self->listener.powerChanged(PowerEvent::suspend);
        if (message == WM_POWERBROADCAST && word == PBT_APMRESUMEAUTOMATIC) self->listener.powerChanged(PowerEvent::resume);
        return DefWindowProcW(window, message, word, extra);
    }
};

PowerEvents::PowerEvents(PowerListener &listener) : impl_(std::make_unique<Impl>(listener)) {}
PowerEvents::~PowerEvents() = default;

PowerEvents::Opened PowerEvents::open(const VXWCHAR *windowClass) {
    Opened opened;
    HMODULE module = nullptr;
    GetModuleHandleExW(GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS | GET_MODULE_HANDLE_EX_FLAG_UNCHANGED_REFCOUNT,
                       reinterpret_cast<LPCWSTR>(&Impl::procedure), &module);
    WNDCLASSW info = {};
    if (!GetClassInfoW(module, windowClass, &info)) {
        info = {};
        info.lpfnWndProc = &Impl::procedure;
        info.hInstance = module;
        info.hbrBackground = reinterpret_cast<HBRUSH>(static_cast<INT_PTR>(COLOR_WINDOW + 1));
        info.lpszClassName = windowClass;
        if (RegisterClassW(&info) == 0) opened.registered = GetLastError();
    }
    if (!GetClassInfoW(module, windowClass, &info)) {
        opened.found = GetLastError();
        return opened;
    }
    impl_->window = CreateWindowExW(0, windowClass, windowClass, WS_POPUP, 0, 0, 0, 0, nullptr, nullptr, module, impl_.get());
    return opened;
}

void PowerEvents::run() {
    if (impl_->window == nullptr) return;
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0 && message.message != WM_QUIT) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
}

void PowerEvents::close() {
    if (const HWND window = impl_->window) PostMessageW(window, WM_CLOSE, 0, 0);
}

void PowerEvents::inject(PowerEvent event) {
    const WPARAM word = event == PowerEvent::suspend ? PBT_APMSUSPEND : PBT_APMRESUMEAUTOMATIC;
    if (const HWND window = impl_->window) PostMessageW(window, WM_POWERBROADCAST, word, 0);
}

}  // namespace vxcomn
