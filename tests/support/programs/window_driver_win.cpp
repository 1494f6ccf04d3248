// window_driver: the updater's main window and boxes, driven by commands on stdin as the update run drives them, each
// answered by one line on stdout. A thread of its own answers a box (button ID) and describes it as BOX: its text's
// first line, "[ID LABEL]" per button, "{ENTRIES} SELECTED" for a list. Start-up is the updater's: the language from
// the game's registry key, the button hook on the main thread, GDI+; the log goes to window_driver.log in %TEMP%.
//   start              shows the window with a status line: "started"
//   rect               "LEFT TOP" of the window
//   progress N         overall and file progress: "ok"
//   confirm ID         answers the confirmation a click put up: "cancelled=0|1
//                      cancels=N quit=0|1 window=0|1 | BOX" once taken in
//   ask ID TEXT        a question owned by the window: "yes|no | BOX"
//   retry ID           the question after a failed move: "retry|cancel | BOX"
//   language ID NAME   the language dialog, NAME chosen and stored: "NAME|cancelled | BOX"
//   dialogfont         the Japanese dialog font: "none" or "'FACE' HEIGHT WEIGHT"
#include <windows.h>

#include <atomic>
#include <iostream>
#include <sstream>
#include <string>
#include <thread>

#include "base/encoding.h"
#include "base/log.h"
#include "resources/resource_ids.h"
#include "state/configuration.h"
#include "state/registry_manager.h"
#include "text/localization.h"
#include "ui/fonts_win.h"
#include "ui/gui_manager.h"
#include "ui/language_dialog.h"
#include "ui/retry_box.h"
#include "ui/ui_services.h"

namespace {

class CountingCancelable final : public ICancelable {
public:
    void Cancel() override { ++calls; }
    std::atomic<int> calls{0};
};

std::wstring TextOf(HWND window) {
    wchar_t text[512] = {};
    GetWindowTextW(window, text, 512);
    return text;
}

BOOL CALLBACK DescribeControl(HWND control, LPARAM description) {
    std::wstring& seen = *reinterpret_cast<std::wstring*>(description);
    wchar_t kind[16] = {};
    GetClassNameW(control, kind, 16);
    const int id = GetDlgCtrlID(control);
    if (std::wstring(kind) == L"Static" && id == 0xFFFF) {  // a message box's text
        const std::wstring text = TextOf(control);
        seen = L" " + text.substr(0, text.find(L'\n')) + seen;
    } else if (std::wstring(kind) == L"Button") {
        seen += L" [" + std::to_wstring(id) + L" " + TextOf(control) + L"]";
    } else if (std::wstring(kind) == L"ComboBox") {
        wchar_t entry[64] = {};
        const LRESULT count = SendMessageW(control, CB_GETCOUNT, 0, 0);
        for (LRESULT i = 0; i < count; ++i) {
            SendMessageW(control, CB_GETLBTEXT, static_cast<WPARAM>(i), reinterpret_cast<LPARAM>(entry));
            seen += (i == 0 ? L" {" : L" ") + std::wstring(entry);
        }
        seen += L"} " + TextOf(control);
    }
    return TRUE;
}

// Plays the player at the next box of the program: describes it, chooses
// choice in its list if given, presses the button and returns once the box
// is gone.
std::string Answer(int button, const std::wstring& choice) {
    HWND box = nullptr;
    for (int waited = 0; box == nullptr && waited < 20000; waited += 50) {
        Sleep(50);
        box = FindWindowW(L"#32770", GetWindowTitle().c_str());
    }
    if (box == nullptr) return "no box";
    Sleep(200);  // the box finishes its initialisation (labels, list)
    std::wstring seen;
    EnumChildWindows(box, DescribeControl, reinterpret_cast<LPARAM>(&seen));
    if (!choice.empty()) {
        SendDlgItemMessageW(box, IDC_LANGUAGE_LIST, CB_SELECTSTRING, static_cast<WPARAM>(-1),
                            reinterpret_cast<LPARAM>(choice.c_str()));
    }
    PostMessageW(box, WM_COMMAND, MAKEWPARAM(button, BN_CLICKED), 0);
    for (int waited = 0; IsWindow(box) && waited < 5000; waited += 20) Sleep(20);
    return NarrowToUtf8(seen);
}

// show() puts up a box and returns the answer it got from Answer.
template <typename Show>
std::string Answered(int button, const std::wstring& choice, Show show) {
    std::string seen;
    std::thread player([&] { seen = Answer(button, choice); });
    const std::string result = show();
    player.join();
    return result + " |" + seen;
}

}  // namespace

int main() {
    Localization::Initialize();
    Log::Open("window_driver.log");
    Configuration configuration;
    configuration.SetDefaults();
    RegistryManager registry;
    registry.Locate(configuration.GetRegistryKey(), "");
    if (!registry.GetLanguage().empty()) Localization::SetLanguage(registry.GetLanguage());
    UiServices services;
    services.InstallMessageBoxHook();
    services.StartGraphics();
    CountingCancelable cancelable;
    GuiManager gui;
    const auto window = [&gui] { return static_cast<HWND>(gui.GetWindowHandle()); };
    std::string line;
    while (std::getline(std::cin, line)) {
        std::istringstream words(line);
        std::string command, text;
        int number = 0;
        words >> command >> number;
        std::getline(words >> std::ws, text);
        std::string reply = "unknown command";
        if (command == "start") {
            gui.Start(&cancelable);
            gui.SetStatusText(L"File: data/levels/level2.map");
            gui.Show();
            // The window's own thread shows it.
            for (int waited = 0; !IsWindowVisible(window()) && waited < 10000; waited += 20) Sleep(20);
            reply = "started";
        } else if (command == "rect") {
            RECT rect = {};
            GetWindowRect(window(), &rect);
            reply = std::to_string(rect.left) + " " + std::to_string(rect.top);
        } else if (command == "progress") {
            gui.SetOverallProgress(number);
            gui.SetFileProgress(number);
            reply = "ok";
        } else if (command == "confirm") {
            const std::string seen = Answer(number, L"");
            gui.WaitWhileConfirming();
            // After Yes the window's thread ends and takes the window.
            for (int waited = 0; cancelable.calls > 0 && IsWindow(window()) && waited < 5000; waited += 20) Sleep(20);
            reply = "cancels=" + std::to_string(cancelable.calls) + " window=" + std::to_string(IsWindow(window())) +
                    " |" + seen;
        } else if (command == "ask") {
            reply = Answered(number, L"", [&] { return gui.AskYesNo(WidenFromCodePage(text)) ? "yes" : "no"; });
        } else if (command == "retry") {
            reply = Answered(number, L"", [] {
                return RetryBox().AskRetryMove("C:\\Patched\\a.pak", "C:\\Games\\a.pak") ? "retry" : "cancel";
            });
        } else if (command == "language") {
            reply = Answered(number, WidenFromCodePage(text), [&] {
                std::string chosen;
                if (!LanguageDialog().Run(chosen)) return std::string("cancelled");
                registry.SetLanguage(chosen);
                return chosen;
            });
        } else if (command == "dialogfont") {
            LOGFONTA font = {};
            const bool made = GetObjectA(GetDialogFont(), sizeof(font), &font) != 0;
            reply = made ? "'" + std::string(font.lfFaceName) + "' " + std::to_string(font.lfHeight) + " " +
                               std::to_string(font.lfWeight)
                         : "none";
        }
        std::cout << reply << std::endl;
    }
    return 0;
}
