// dialog_answer CAPTION BUTTON_ID [TIMEOUT_MS]
//
// Waits for a dialog box (class #32770) with the given caption, prints its
// message text (UTF-8) and presses the button with the given control id.
// Exit 0 when pressed, 2 when no dialog appeared.
#include <windows.h>

#include <cstdio>

int wmain(int argc, wchar_t** argv) {
    if (argc < 3) {
        std::fprintf(stderr, "usage: dialog_answer CAPTION BUTTON_ID [TIMEOUT_MS]\n");
        return 1;
    }
    const int timeout = argc > 3 ? _wtoi(argv[3]) : 20000;
    HWND dialog = nullptr;
    for (int waited = 0; waited < timeout && dialog == nullptr; waited += 50) {
        dialog = FindWindowW(L"#32770", argv[1]);
        if (dialog == nullptr) Sleep(50);
    }
    if (dialog == nullptr) {
        std::fprintf(stderr, "dialog_answer: no dialog with that caption appeared\n");
        return 2;
    }
    // Give the box a moment to finish its initialisation (button labels).
    Sleep(200);
    // The message of a system message box is the static control 0xFFFF.
    static wchar_t text[8192];
    static char utf8[4 * 8192];
    const int length = GetDlgItemTextW(dialog, 0xFFFF, text, 8192);
    const int size = WideCharToMultiByte(CP_UTF8, 0, text, length, utf8, sizeof utf8, nullptr, nullptr);
    std::printf("%.*s\n", size, utf8);
    std::fflush(stdout);
    const int button = _wtoi(argv[2]);
    PostMessageW(dialog, WM_COMMAND, MAKEWPARAM(button, BN_CLICKED),
                 reinterpret_cast<LPARAM>(GetDlgItem(dialog, button)));
    return 0;
}
