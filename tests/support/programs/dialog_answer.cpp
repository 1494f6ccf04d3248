// dialog_answer CAPTION BUTTON_ID [TIMEOUT_MS]
//
// Waits for a dialog box (class #32770) with the given caption, prints its
// message text (UTF-8), then "[button] " and the label of the button with
// the given control id, and presses that button (id 0: none, the box stays
// for a later call to answer). Exit 0 when done, 2 when no dialog
// appeared. Returns once a pressed dialog has closed.
#include <windows.h>

#include <fcntl.h>
#include <io.h>

#include <cstdio>
#include <cwchar>
#include <string>

namespace {

std::string ToUtf8(const std::wstring& text) {
    if (text.empty()) return std::string();
    const int size =
        WideCharToMultiByte(CP_UTF8, 0, text.c_str(), static_cast<int>(text.size()), nullptr, 0, nullptr, nullptr);
    std::string out(static_cast<size_t>(size), '\0');
    WideCharToMultiByte(CP_UTF8, 0, text.c_str(), static_cast<int>(text.size()), &out[0], size, nullptr, nullptr);
    return out;
}

std::wstring WindowText(HWND window) {
    wchar_t buffer[8192];
    const int length = GetWindowTextW(window, buffer, 8192);
    return std::wstring(buffer, length > 0 ? static_cast<size_t>(length) : 0);
}

BOOL CALLBACK CollectText(HWND child, LPARAM param) {
    wchar_t className[64];
    GetClassNameW(child, className, 64);
    // The message of a system message box is the static control 0xFFFF.
    if (std::wcscmp(className, L"Static") == 0 && GetDlgCtrlID(child) == 0xFFFF) {
        *reinterpret_cast<std::wstring*>(param) += WindowText(child);
    }
    return TRUE;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc < 3) {
        std::fprintf(stderr, "usage: dialog_answer CAPTION BUTTON_ID [TIMEOUT_MS]\n");
        return 1;
    }
    _setmode(_fileno(stdout), _O_BINARY);
    const std::wstring caption = argv[1];
    const int buttonId = _wtoi(argv[2]);
    const DWORD timeout = argc > 3 ? static_cast<DWORD>(_wtoi(argv[3])) : 20000;

    HWND dialog = nullptr;
    for (DWORD waited = 0; waited < timeout && dialog == nullptr; waited += 50) {
        dialog = FindWindowW(L"#32770", caption.c_str());
        if (dialog == nullptr) Sleep(50);
    }
    if (dialog == nullptr) {
        std::fprintf(stderr, "dialog_answer: no dialog with that caption appeared\n");
        return 2;
    }
    // Give the box a moment to finish its initialisation (button labels).
    Sleep(200);
    std::wstring text;
    EnumChildWindows(dialog, CollectText, reinterpret_cast<LPARAM>(&text));
    HWND button = GetDlgItem(dialog, buttonId);
    const std::wstring label = button != nullptr ? WindowText(button) : std::wstring();
    std::string out = ToUtf8(text);
    std::fwrite(out.data(), 1, out.size(), stdout);
    std::fputs("\n", stdout);
    std::string labelOut = "[button] " + ToUtf8(label) + "\n";
    std::fwrite(labelOut.data(), 1, labelOut.size(), stdout);
    std::fflush(stdout);
    if (buttonId == 0) return 0;
    PostMessageW(dialog, WM_COMMAND, MAKEWPARAM(buttonId, BN_CLICKED), reinterpret_cast<LPARAM>(button));
    // Gone before we return, so that the next box a caller waits for is
    // never this one again.
    for (int waited = 0; waited < 5000 && IsWindow(dialog); waited += 20) Sleep(20);
    return 0;
}
