#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>

#include "base/status_interfaces.h"
#include "ui/main_window_layout.h"
#include "ui/message_box.h"
#include "ui/progress_meter.h"

// A window of the system (an HWND on Windows), opaque here; null for none.
using WindowHandle = void*;

// The messages the UI thread understands, posted to it with no window.
constexpr uint32_t kShowWindowMessage = 0x81F5;       // centre the window and show it
constexpr uint32_t kQuitUiThreadMessage = 0x81F6;     // end the message loop
constexpr uint32_t kOverallProgressMessage = 0x81F7;  // lParam: per mille
constexpr uint32_t kFileProgressMessage = 0x81F8;     // lParam: per mille

// What the player sees of a run. On Windows: the skinned main window on a
// thread of its own with its own message loop, so the main thread can work
// without pumping messages; the player may drag it, and "Cancel" or the
// close spot ask for confirmation before the run is cancelled. On POSIX:
// the same interface on the console, with the progress line on stderr and
// Ctrl+C in place of "Cancel".
//
// Start, Stop, Show, SetStatusText, WaitWhileConfirming and the boxes are
// for the main thread; the progress reports may come from any thread.
class GuiManager {
public:
    GuiManager();
    GuiManager(const GuiManager&) = delete;
    GuiManager& operator=(const GuiManager&) = delete;
    // Stops the UI thread if it still runs.
    virtual ~GuiManager();

    // Starts the UI thread and returns once its window exists (or the
    // thread has ended). cancelable, which may be null, is told when the
    // player confirms a cancel (and nothing else keeps that news). Throws Exception when the previous UI
    // thread still runs.
    void Start(ICancelable* cancelable);
    // Ends the UI thread and waits for it; nothing when none runs.
    void Stop();
    // Centres the window on the screen and shows it.
    void Show();

    // The overall progress of the run and the progress of the file being
    // patched, each 0..1000. Safe from any thread.
    void SetOverallProgress(int32_t permille);
    void SetFileProgress(int32_t permille);
    // The bar itself, 0..1000, for the version check's own animation.
    void SetProgressTotal(int32_t permille);
    void SetStatusText(const std::wstring& text);
    std::wstring GetStatusText() const;

    // Returns once the player has answered a confirmation the window put
    // up, if one is open; the bar is repainted meanwhile.
    void WaitWhileConfirming();
    // The main window; null while there is none (always on POSIX).
    WindowHandle GetWindowHandle() const;

    // Message boxes with the window title as caption, owned by the window
    // while it exists.
    void ShowError(const std::string& text);
    void ShowError(const std::wstring& text);
    bool AskYesNo(const std::wstring& text);
    // True when the player pressed OK.
    bool ShowInfo(const std::wstring& text);

private:
    class UiThread;  // the OS part: window and thread, or the console

    MessageAnswer ShowBox(const std::wstring& text, MessageButtons buttons, MessageIcon icon);
    // Puts up a box owned by the window, in the OS part's way.
    MessageAnswer ShowOwnedBox(MessageBoxRequest& request);
    // On the UI thread, when the player asks to leave through area: asks
    // for confirmation and, on Yes, cancels the run. True on Yes.
    bool ConfirmCancel(HitArea area);
    void InvalidateProgress();

    std::unique_ptr<UiThread> ui;
    ProgressMeter progress;
    mutable std::mutex statusMutex;  // the status text is read by the painting thread
    std::wstring statusText;
    std::atomic<bool> confirming{false};
    ICancelable* cancelable = nullptr;
};
