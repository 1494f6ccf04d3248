// window_probe: plays the player at a dialog box (class #32770) found by
// its caption, for the checks the updater's window tests make.
//   window_probe buttons CAPTION          "ID LABEL" for every button
//   window_probe combo CAPTION ID         "item NAME" for every entry of
//                                         the combo box, then "selected NAME"
//   window_probe select CAPTION ID NAME   selects the entry NAME
// Waits up to 20 s for the box; exit 2 when none appeared, 3 when the
// control or entry is missing. Output is UTF-8.
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

void Print(const std::wstring& line) {
    const std::string out = ToUtf8(line) + "\n";
    std::fwrite(out.data(), 1, out.size(), stdout);
}

std::wstring WindowText(HWND window) {
    wchar_t buffer[512];
    const int length = GetWindowTextW(window, buffer, 512);
    return std::wstring(buffer, length > 0 ? static_cast<size_t>(length) : 0);
}

BOOL CALLBACK PrintButton(HWND child, LPARAM) {
    wchar_t className[32];
    GetClassNameW(child, className, 32);
    if (std::wcscmp(className, L"Button") == 0) {
        Print(std::to_wstring(GetDlgCtrlID(child)) + L" " + WindowText(child));
    }
    return TRUE;
}

std::wstring ComboEntry(HWND combo, LRESULT index) {
    const LRESULT length = SendMessageW(combo, CB_GETLBTEXTLEN, static_cast<WPARAM>(index), 0);
    if (length < 0) return std::wstring();
    std::wstring text(static_cast<size_t>(length) + 1, L'\0');
    SendMessageW(combo, CB_GETLBTEXT, static_cast<WPARAM>(index), reinterpret_cast<LPARAM>(&text[0]));
    text.resize(static_cast<size_t>(length));
    return text;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc < 3) {
        std::fprintf(stderr, "usage: window_probe buttons|combo|select CAPTION [ID [NAME]]\n");
        return 1;
    }
    _setmode(_fileno(stdout), _O_BINARY);
    const std::wstring command = argv[1];
    HWND dialog = nullptr;
    for (int waited = 0; waited < 20000 && dialog == nullptr; waited += 50) {
        dialog = FindWindowW(L"#32770", argv[2]);
        if (dialog == nullptr) Sleep(50);
    }
    if (dialog == nullptr) {
        std::fprintf(stderr, "window_probe: no dialog with that caption appeared\n");
        return 2;
    }
    // Let the box finish its initialisation (labels, list).
    Sleep(200);
    if (command == L"buttons") {
        EnumChildWindows(dialog, PrintButton, 0);
    } else if (argc >= 4) {
        HWND combo = GetDlgItem(dialog, _wtoi(argv[3]));
        if (combo == nullptr) return 3;
        if (command == L"combo") {
            const LRESULT count = SendMessageW(combo, CB_GETCOUNT, 0, 0);
            for (LRESULT i = 0; i < count; ++i) Print(L"item " + ComboEntry(combo, i));
            const LRESULT selected = SendMessageW(combo, CB_GETCURSEL, 0, 0);
            Print(L"selected " + (selected >= 0 ? ComboEntry(combo, selected) : std::wstring()));
        } else if (command == L"select" && argc >= 5) {
            const LRESULT index =
                SendMessageW(combo, CB_FINDSTRINGEXACT, static_cast<WPARAM>(-1), reinterpret_cast<LPARAM>(argv[4]));
            if (index < 0) return 3;
            SendMessageW(combo, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
        }
    }
    std::fflush(stdout);
    return 0;
}
