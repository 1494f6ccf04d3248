#include <signal.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <iostream>
#include <thread>

#include "base/encoding.h"
#include "base/exception.h"
#include "base/unique_handle_posix.h"
#include "text/localization.h"
#include "ui/gui_manager.h"

namespace {

// Where the Ctrl+C handler writes; -1 while nobody listens. A lock-free
// atomic, so the handler may read it.
std::atomic<int> interruptPipe{-1};

// One byte to the listener; a full pipe already holds a request.
void Send(int pipe, char command) {
    const ssize_t written = write(pipe, &command, 1);
    static_cast<void>(written);
}

void OnInterrupt(int) {
    const int pipe = interruptPipe;
    if (pipe >= 0) Send(pipe, 'i');
}

// "[###########-------------------]  37.5%  File: data/a.pak"
std::string ProgressLine(int32_t total, const std::wstring& status) {
    constexpr int32_t kBarWidth = 30;
    const int32_t filled = total * kBarWidth / 1000;
    char percent[16];
    std::snprintf(percent, sizeof(percent), "%5.1f%%", total / 10.0);
    std::string line = "[" + std::string(filled, '#') + std::string(kBarWidth - filled, '-') + "] " + percent;
    if (!status.empty()) line += "  " + NarrowToUtf8(status);
    return line;
}

}  // namespace

// The console front end: the progress line on stderr, rewritten in place
// on a terminal and one line per change otherwise, and a thread that waits
// for Ctrl+C and asks before it cancels.
class GuiManager::UiThread {
public:
    void Listen(GuiManager& owner);
    // Writes the progress line if it changed (or always, with force) while
    // the window would be visible and no question is open. Lock held.
    void Draw(const GuiManager& owner, bool force);
    // Finishes an in-place line, so that what follows starts on its own.
    // Lock held.
    void EndLine();
    void RestoreInterruptHandler();

    std::mutex mutex;  // progress reports come from any thread
    std::thread thread;
    std::atomic<bool> running{false};
    // Ctrl+C and Stop write to the listener through this pipe.
    UniqueFileDescriptor readEnd;
    UniqueFileDescriptor writeEnd;
    struct sigaction previousAction = {};
    bool handlerInstalled = false;
    bool terminal = false;
    bool shown = false;
    bool lineOpen = false;
    bool boxOpen = false;
    std::string lastLine;
};

void GuiManager::UiThread::Listen(GuiManager& owner) {
    for (;;) {
        char command = 0;
        const ssize_t count = read(readEnd.Get(), &command, 1);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0 || command == 'q') break;
        if (owner.ConfirmCancel(HitArea::Cancel)) break;
    }
    // After a confirmed cancel, another Ctrl+C ends the program as usual.
    RestoreInterruptHandler();
    running = false;
}

void GuiManager::UiThread::Draw(const GuiManager& owner, bool force) {
    if (!shown || boxOpen) return;
    const std::string line = ProgressLine(owner.progress.Total(), owner.GetStatusText());
    if (!force && line == lastLine) return;
    lastLine = line;
    if (terminal) {
        std::cerr << "\r" << line << "\x1b[K";
        lineOpen = true;
    } else {
        std::cerr << line << "\n";
    }
    std::cerr.flush();
}

void GuiManager::UiThread::EndLine() {
    if (!lineOpen) return;
    std::cerr << "\n";
    std::cerr.flush();
    lineOpen = false;
}

void GuiManager::UiThread::RestoreInterruptHandler() {
    std::lock_guard<std::mutex> lock(mutex);
    if (!handlerInstalled) return;
    interruptPipe = -1;
    sigaction(SIGINT, &previousAction, nullptr);
    handlerInstalled = false;
}

GuiManager::GuiManager() : ui(std::make_unique<UiThread>()) {}

GuiManager::~GuiManager() { Stop(); }

void GuiManager::Start(ICancelable* cancelableToTell) {
    if (ui->running) {
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
        if (ui->running) throw Exception("GuiManager is already running.");
    }
    Stop();
    cancelable = cancelableToTell;
    int ends[2];
    if (::pipe(ends) != 0) throw Exception("Could not start the console's listener.");
    ui->readEnd.Reset(ends[0]);
    ui->writeEnd.Reset(ends[1]);
    ui->terminal = isatty(STDERR_FILENO) != 0;
    {
        std::lock_guard<std::mutex> lock(ui->mutex);
        interruptPipe = ui->writeEnd.Get();
        struct sigaction action = {};
        action.sa_handler = OnInterrupt;
        action.sa_flags = SA_RESTART;
        sigemptyset(&action.sa_mask);
        ui->handlerInstalled = sigaction(SIGINT, &action, &ui->previousAction) == 0;
    }
    ui->running = true;
    ui->thread = std::thread([this] { ui->Listen(*this); });
}

void GuiManager::Stop() {
    if (!ui->thread.joinable()) return;
    Send(ui->writeEnd.Get(), 'q');
    ui->thread.join();
    ui->RestoreInterruptHandler();
    ui->readEnd.Reset();
    ui->writeEnd.Reset();
    std::lock_guard<std::mutex> lock(ui->mutex);
    ui->EndLine();
    ui->shown = false;
    ui->lastLine.clear();
}

void GuiManager::Show() {
    std::lock_guard<std::mutex> lock(ui->mutex);
    if (!ui->running || ui->shown) return;
    ui->shown = true;
    std::cerr << NarrowToUtf8(GetWindowTitle()) << "\n";
    ui->Draw(*this, true);
}

// Like the window's thread messages, reports reach the bar only while the
// front end runs.
void GuiManager::SetOverallProgress(int32_t permille) {
    std::lock_guard<std::mutex> lock(ui->mutex);
    if (ui->running && progress.SetOverall(permille)) ui->Draw(*this, false);
}

void GuiManager::SetFileProgress(int32_t permille) {
    std::lock_guard<std::mutex> lock(ui->mutex);
    if (ui->running && progress.SetFile(permille)) ui->Draw(*this, false);
}

void GuiManager::SetProgressTotal(int32_t permille) {
    std::lock_guard<std::mutex> lock(ui->mutex);
    if (ui->running && progress.SetTotal(permille)) ui->Draw(*this, false);
}

void GuiManager::SetStatusText(const std::wstring& text) {
    {
        std::lock_guard<std::mutex> lock(statusMutex);
        statusText = text;
    }
    std::lock_guard<std::mutex> lock(ui->mutex);
    ui->Draw(*this, false);
}

WindowHandle GuiManager::GetWindowHandle() const { return nullptr; }

void GuiManager::InvalidateProgress() {
    std::lock_guard<std::mutex> lock(ui->mutex);
    ui->Draw(*this, false);
}

MessageAnswer GuiManager::ShowOwnedBox(MessageBoxRequest& request) {
    {
        std::lock_guard<std::mutex> lock(ui->mutex);
        ui->EndLine();
        ui->boxOpen = true;
    }
    const MessageAnswer answer = ShowMessageBox(request);
    std::lock_guard<std::mutex> lock(ui->mutex);
    ui->boxOpen = false;
    // The in-place line was ended for the question; put it back below.
    if (ui->terminal) ui->Draw(*this, true);
    return answer;
}
