// dialog_answer CAPTION BUTTON_ID TIMEOUT_MS [CHOICE]: plays the player at the next dialog box (class #32770) with
// that caption. Prints its message text, then a line with "[ID LABEL]" per button and "{ENTRIES} SELECTED" for a list
// (UTF-8); chooses CHOICE in the list if given and presses the button (id 0: none, the box stays for a later call).
// Exit 0 once a pressed box has closed, 2 when none appeared.
#include <windows.h>

#include <cstdio>
#include <string>

namespace {

// WM_GETTEXT, as GetWindowText does not ask the controls of another process.
std::wstring TextOf(HWND window) {
    wchar_t text[8192] = {};
    if (window != nullptr) SendMessageW(window, WM_GETTEXT, 8192, reinterpret_cast<LPARAM>(text));
    return text;
}

BOOL CALLBACK DescribeControl(HWND control, LPARAM description) {
    std::wstring& seen = *reinterpret_cast<std::wstring*>(description);
    wchar_t kind[16] = {};
    GetClassNameW(control, kind, 16);
    if (std::wstring(kind) == L"Button")
        seen += L"[" + std::to_wstring(GetDlgCtrlID(control)) + L" " + TextOf(control) + L"] ";
    if (std::wstring(kind) != L"ComboBox") return TRUE;
    const LRESULT count = SendMessageW(control, CB_GETCOUNT, 0, 0);
    for (LRESULT i = 0; i < count; ++i) {
        wchar_t entry[64] = {};
        SendMessageW(control, CB_GETLBTEXT, static_cast<WPARAM>(i), reinterpret_cast<LPARAM>(entry));
        seen += (i == 0 ? L"{" : L" ") + std::wstring(entry);
    }
    seen += L"} " + TextOf(control) + L" ";
    return TRUE;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc != 4 && argc != 5) return 1;
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
    // The box finishes its initialisation (labels, list) first. A message box's text is its static control 0xFFFF.
    Sleep(200);
    std::wstring seen = TextOf(GetDlgItem(dialog, 0xFFFF)) + L"\n";
    EnumChildWindows(dialog, DescribeControl, reinterpret_cast<LPARAM>(&seen));
    seen += L"\n";
    std::string out(seen.size() * 3, '\0');
    out.resize(static_cast<size_t>(WideCharToMultiByte(CP_UTF8, 0, seen.data(), static_cast<int>(seen.size()),
                                                       out.data(), static_cast<int>(out.size()), nullptr, nullptr)));
    std::fwrite(out.data(), 1, out.size(), stdout);
    std::fflush(stdout);
    if (argc == 5) {
        SendMessageW(FindWindowExW(dialog, nullptr, L"ComboBox", nullptr), CB_SELECTSTRING, static_cast<WPARAM>(-1),
                     reinterpret_cast<LPARAM>(argv[4]));
    }
    if (buttonId == 0) return 0;
    PostMessageW(dialog, WM_COMMAND, MAKEWPARAM(buttonId, BN_CLICKED), 0);
    // Gone before we return, so that the next box a caller waits for is never this one again.
    for (int waited = 0; waited < 5000 && IsWindow(dialog); waited += 20) Sleep(20);
    return 0;
}
