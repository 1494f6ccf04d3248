// dialog_answer CAPTION BUTTON_ID TIMEOUT_MS: waits for a dialog box (class #32770) with that caption, prints its
// message text (UTF-8), then "[button] " and the label of that button, and presses it (id 0: none, the box stays for
// a later call). Exit 0 once a pressed box has closed, 2 when none appeared.
#include <windows.h>

#include <cstdio>
#include <string>

namespace {

std::string TextOf(HWND window) {
    wchar_t text[8192];
    const int length = window != nullptr ? GetWindowTextW(window, text, 8192) : 0;
    std::string out(static_cast<size_t>(length) * 3, '\0');
    out.resize(static_cast<size_t>(
        WideCharToMultiByte(CP_UTF8, 0, text, length, out.data(), static_cast<int>(out.size()), nullptr, nullptr)));
    return out;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc != 4) return 1;
    const int buttonId = _wtoi(argv[2]);
    const DWORD timeout = static_cast<DWORD>(_wtoi(argv[3]));
    HWND dialog = nullptr;
    for (DWORD waited = 0; waited < timeout && dialog == nullptr; waited += 50) {
        dialog = FindWindowW(L"#32770", argv[1]);
        if (dialog == nullptr) Sleep(50);
    }
    if (dialog == nullptr) {
        std::fprintf(stderr, "dialog_answer: no dialog with that caption appeared\n");
        return 2;
    }
    // Give the box a moment to finish its initialisation (button labels).
    // The message of a system message box is its static control 0xFFFF.
    Sleep(200);
    HWND button = GetDlgItem(dialog, buttonId);
    const std::string out = TextOf(GetDlgItem(dialog, 0xFFFF)) + "\n[button] " + TextOf(button) + "\n";
    std::fwrite(out.data(), 1, out.size(), stdout);
    std::fflush(stdout);
    if (buttonId == 0) return 0;
    PostMessageW(dialog, WM_COMMAND, MAKEWPARAM(buttonId, BN_CLICKED), reinterpret_cast<LPARAM>(button));
    // Gone before we return, so that the next box a caller waits for is
    // never this one again.
    for (int waited = 0; waited < 5000 && IsWindow(dialog); waited += 20) Sleep(20);
    return 0;
}
