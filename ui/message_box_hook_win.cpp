#include <windows.h>

#include "ui/message_box_hook_win.h"

#include <atomic>
#include <cwchar>

#include "text/localization.h"
#include "ui/fonts_win.h"

namespace {

std::atomic<DWORD> slot{TLS_OUT_OF_INDEXES};

HHOOK ThreadHook() {
    const DWORD index = slot;
    return index == TLS_OUT_OF_INDEXES ? nullptr : static_cast<HHOOK>(TlsGetValue(index));
}

bool HasClass(HWND window, const wchar_t* className) {
    wchar_t name[16] = {};
    GetClassNameW(window, name, 16);
    return std::wcscmp(name, className) == 0;
}

const char* ButtonTextKey(int id) {
    switch (id) {
        case IDOK:
            return "INSTALLER_DIALOG_OK";
        case IDCANCEL:
            return "INSTALLER_DIALOG_CANCEL";
        case IDRETRY:
            return "INSTALLER_DIALOG_RETRY";
        case IDYES:
            return "INSTALLER_DIALOG_YES";
        case IDNO:
            return "INSTALLER_DIALOG_NO";
        default:
            return nullptr;
    }
}

BOOL CALLBACK RelabelButton(HWND child, LPARAM) {
    if (HasClass(child, L"Button")) {
        const char* key = ButtonTextKey(GetDlgCtrlID(child));
        if (key != nullptr) SetWindowTextW(child, Localize(key).c_str());
    }
    return TRUE;
}

// Sees each message sent to a window of the thread before its window
// procedure does, so the labels are set before the box first paints.
LRESULT CALLBACK MessageBoxHookProcedure(int code, WPARAM wParam, LPARAM lParam) {
    HHOOK hook = ThreadHook();
    if (code >= 0) {
        const auto* message = reinterpret_cast<const CWPSTRUCT*>(lParam);
        if (message->message == WM_INITDIALOG && HasClass(message->hwnd, L"#32770")) {
            ApplyDialogFont(message->hwnd);
            EnumChildWindows(message->hwnd, RelabelButton, 0);
        }
    }
    if (hook == nullptr) return 0;
    return CallNextHookEx(hook, code, wParam, lParam);
}

}  // namespace

bool InstallMessageBoxHook() {
    if (slot == TLS_OUT_OF_INDEXES) {
        const DWORD index = TlsAlloc();
        DWORD expected = TLS_OUT_OF_INDEXES;
        // Two threads may get here at once; the loser gives its slot back.
        if (!slot.compare_exchange_strong(expected, index) && index != TLS_OUT_OF_INDEXES) TlsFree(index);
    }
    if (slot == TLS_OUT_OF_INDEXES) return false;
    HHOOK hook = SetWindowsHookExW(WH_CALLWNDPROC, MessageBoxHookProcedure, nullptr, GetCurrentThreadId());
    if (hook == nullptr) return false;
    TlsSetValue(slot, hook);
    return true;
}

void RemoveMessageBoxHook() {
    HHOOK hook = ThreadHook();
    if (hook == nullptr) return;
    UnhookWindowsHookEx(hook);
    TlsSetValue(slot, nullptr);
}

void FreeMessageBoxHookSlot() {
    const DWORD index = slot.exchange(TLS_OUT_OF_INDEXES);
    if (index != TLS_OUT_OF_INDEXES) TlsFree(index);
}
