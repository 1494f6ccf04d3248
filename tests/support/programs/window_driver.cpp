// window_driver: the updater's main window and boxes, driven by commands on
// stdin (one a line) the way the update run will drive them; each command
// is answered by one line on stdout. Start-up follows the updater's own:
// the language stored in the game's registry key, the button hook on the
// main thread, GDI+. The log goes to window_driver.log in the temporary
// folder.
//   start                 Start, show the window: "started" once it is shown
//   overall N | file N    progress reports from another thread: "ok"
//   status TEXT           the status line (UTF-8): "ok"
//   rect                  "rect LEFT TOP RIGHT BOTTOM", or "rect none"
//   wait                  WaitWhileConfirming, then the state line:
//                         "state cancelled=0|1 cancels=N quit=0|1 window=0|1"
//   stop                  Stop, then the state line
//   ask|error TEXT        a box owned by the window: "answer yes|no|ok"
//   retry                 the question after a failed move: "answer retry|cancel"
//   language              the language dialog; a choice is stored in the
//                         registry as the updater stores it:
//                         "language NAME" or "language cancelled"
//   dialogfont            "dialogfont none", or "dialogfont FACE HEIGHT
//                         WEIGHT REAL" (REAL: the face the system gave)
#include <windows.h>

#include <fcntl.h>
#include <io.h>

#include <atomic>
#include <iostream>
#include <string>
#include <thread>

#include "base/exception.h"
#include "base/log.h"
#include "patch/lzma_decoder.h"
#include "state/configuration.h"
#include "state/registry_manager.h"
#include "text/localization.h"
#include "ui/fonts_win.h"
#include "ui/gui_manager.h"
#include "ui/language_dialog.h"
#include "ui/move_retry_box.h"
#include "ui/ui_services.h"

namespace {

class CountingCancelable final : public ICancelable {
public:
    void Cancel() override { ++calls; }
    std::atomic<int> calls{0};
};

std::wstring FromUtf8(const std::string& text) {
    if (text.empty()) return std::wstring();
    const int size = MultiByteToWideChar(CP_UTF8, 0, text.c_str(), static_cast<int>(text.size()), nullptr, 0);
    std::wstring wide(static_cast<size_t>(size), L'\0');
    MultiByteToWideChar(CP_UTF8, 0, text.c_str(), static_cast<int>(text.size()), &wide[0], size);
    return wide;
}

void Reply(const std::string& line) { std::cout << line << "\n" << std::flush; }

std::string State(const GuiManager& gui, const CountingCancelable& cancelable) {
    return "state cancelled=" + std::to_string(gui.IsCancelled() ? 1 : 0) +
           " cancels=" + std::to_string(cancelable.calls.load()) + " quit=" + std::to_string(quitRequested ? 1 : 0) +
           " window=" + std::to_string(IsWindow(static_cast<HWND>(gui.GetWindowHandle())) ? 1 : 0);
}

std::string DescribeDialogFont() {
    HFONT font = GetDialogFont();
    if (font == nullptr) return "dialogfont none";
    LOGFONTA description = {};
    GetObjectA(font, sizeof(description), &description);
    HDC screen = GetDC(nullptr);
    HGDIOBJ previous = SelectObject(screen, font);
    char real[LF_FACESIZE] = {};
    GetTextFaceA(screen, LF_FACESIZE, real);
    SelectObject(screen, previous);
    ReleaseDC(nullptr, screen);
    return "dialogfont '" + std::string(description.lfFaceName) + "' " + std::to_string(description.lfHeight) + " " +
           std::to_string(description.lfWeight) + " '" + real + "'";
}

}  // namespace

int main() {
    _setmode(_fileno(stdout), _O_BINARY);
    Localization::Initialize();
    try {
        Log::Open("window_driver.log");
    } catch (const Exception&) {
    }
    Configuration configuration;
    configuration.SetDefaults();
    RegistryManager registry;
    registry.Locate(configuration.GetRegistryKey(), "");
    const std::string stored = registry.GetLanguage();
    if (!stored.empty()) Localization::SetLanguage(stored);

    UiServices services;
    services.InstallMessageBoxHook();
    services.StartGraphics();
    CountingCancelable cancelable;
    {
        GuiManager gui;
        std::string line;
        while (std::getline(std::cin, line)) {
            if (!line.empty() && line.back() == '\r') line.pop_back();
            const size_t space = line.find(' ');
            const std::string command = line.substr(0, space);
            const std::string argument = space == std::string::npos ? std::string() : line.substr(space + 1);
            if (command == "start") {
                gui.Start(&cancelable);
                gui.Show();
                // The window is shown by its own thread; answer once it is.
                HWND window = static_cast<HWND>(gui.GetWindowHandle());
                for (int waited = 0; window != nullptr && !IsWindowVisible(window) && waited < 10000; waited += 20) {
                    Sleep(20);
                }
                Reply("started");
            } else if (command == "overall" || command == "file") {
                // From another thread, as the downloader reports.
                const int value = std::stoi(argument);
                std::thread([&gui, command, value] {
                    if (command == "overall") {
                        gui.SetOverallProgress(value);
                    } else {
                        gui.SetFileProgress(value);
                    }
                }).join();
                Reply("ok");
            } else if (command == "status") {
                gui.SetStatusText(FromUtf8(argument));
                Reply("ok");
            } else if (command == "rect") {
                RECT rect;
                HWND window = static_cast<HWND>(gui.GetWindowHandle());
                if (window != nullptr && GetWindowRect(window, &rect)) {
                    Reply("rect " + std::to_string(rect.left) + " " + std::to_string(rect.top) + " " +
                          std::to_string(rect.right) + " " + std::to_string(rect.bottom));
                } else {
                    Reply("rect none");
                }
            } else if (command == "wait") {
                gui.WaitWhileConfirming();
                Reply(State(gui, cancelable));
            } else if (command == "stop") {
                gui.Stop();
                Reply(State(gui, cancelable));
            } else if (command == "ask") {
                Reply(gui.AskYesNo(FromUtf8(argument)) ? "answer yes" : "answer no");
            } else if (command == "error") {
                gui.ShowError(argument);
                Reply("answer ok");
            } else if (command == "retry") {
                MoveRetryBox question;
                Reply(question.AskRetryMove("C:\\Patched\\a.pak", "C:\\Games\\a.pak") ? "answer retry"
                                                                                      : "answer cancel");
            } else if (command == "language") {
                LanguageDialog dialog;
                std::string chosen;
                if (dialog.Run(chosen)) {
                    if (!chosen.empty()) registry.SetLanguage(chosen);
                    Reply("language " + chosen);
                } else {
                    Reply("language cancelled");
                }
            } else if (command == "dialogfont") {
                Reply(DescribeDialogFont());
            } else {
                Reply("unknown command " + command);
            }
        }
    }
    services.Shutdown();
    Log::Close();
    return 0;
}
