// window_driver: the updater's main window and boxes, shown as the update run shows them on commands from stdin, each
// answered by one line on stdout once done; dialog_answer plays the player at the boxes. Start-up is the updater's: the
// language from the game's registry key, the button hook on the main thread, GDI+; the log goes to window_driver.log.
//   start        shows the window with a status line: "started"
//   rect         "LEFT TOP" of the window
//   progress N   overall and file progress: "ok"
//   state        once the confirmation a click put up is answered: "cancels=N window=0|1"
//   ask TEXT     a question owned by the window: "yes|no"
//   retry        the question after a failed move: "retry|cancel"
//   language     the language dialog, the choice stored: "NAME|cancelled"
//   dialogfont   the Japanese dialog font: "none" or "'FACE' HEIGHT WEIGHT"
#include <windows.h>

#include <algorithm>
#include <atomic>
#include <iostream>
#include <string>

#include "base/encoding.h"
#include "base/log.h"
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

template <typename Done>
void WaitFor(Done done) {
    for (int waited = 0; !done() && waited < 10000; waited += 20) Sleep(20);
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
    for (std::string line; std::getline(std::cin, line);) {
        const std::string command = line.substr(0, line.find(' '));
        const std::string argument = line.substr(std::min(line.size(), command.size() + 1));
        std::string reply = "unknown command";
        if (command == "start") {
            gui.Start(&cancelable);
            gui.SetStatusText(L"File: data/levels/level2.map");
            gui.Show();
            WaitFor([&] { return IsWindowVisible(window()); });  // the window's own thread shows it
            reply = "started";
        } else if (command == "rect") {
            RECT rect = {};
            GetWindowRect(window(), &rect);
            reply = std::to_string(rect.left) + " " + std::to_string(rect.top);
        } else if (command == "progress") {
            gui.SetOverallProgress(std::stoi(argument));
            gui.SetFileProgress(std::stoi(argument));
            reply = "ok";
        } else if (command == "state") {
            gui.WaitWhileConfirming();
            // After Yes the window's thread ends and takes the window.
            WaitFor([&] { return cancelable.calls == 0 || !IsWindow(window()); });
            reply = "cancels=" + std::to_string(cancelable.calls) + " window=" + std::to_string(IsWindow(window()));
        } else if (command == "ask") {
            reply = gui.AskYesNo(WidenFromCodePage(argument)) ? "yes" : "no";
        } else if (command == "retry") {
            reply = RetryBox().AskRetryMove("C:\\Patched\\a.pak", "C:\\Games\\a.pak") ? "retry" : "cancel";
        } else if (command == "language") {
            std::string chosen;
            const bool confirmed = LanguageDialog().Run(chosen);
            if (confirmed) registry.SetLanguage(chosen);
            reply = confirmed ? chosen : "cancelled";
        } else if (command == "dialogfont") {
            LOGFONTA font = {};
            reply = GetObjectA(GetDialogFont(), sizeof(font), &font) == 0
                        ? "none"
                        : "'" + std::string(font.lfFaceName) + "' " + std::to_string(font.lfHeight) + " " +
                              std::to_string(font.lfWeight);
        }
        std::cout << reply << std::endl;
    }
    return 0;
}
