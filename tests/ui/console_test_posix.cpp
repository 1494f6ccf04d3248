// The console front end of the native build: the progress line on stderr (one line per change, or rewritten in place on
// a terminal), Ctrl+C with the confirmation question, the language question and the move retry box, answered on stdin.

#include <gtest/gtest.h>

#include <poll.h>
#include <pty.h>
#include <signal.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <iostream>
#include <sstream>
#include <string>

#include "base/paths.h"
#include "tests/support/batch_fixture.h"
#include "text/localization.h"
#include "ui/gui_manager.h"
#include "ui/language_dialog.h"
#include "ui/retry_box.h"

namespace {

// While it lives, std::cin reads the answers and descriptor 2 (where the front end writes, and which it asks whether it
// is a terminal) is a pipe or a terminal, whose other end Shown() reads.
class Console {
public:
    Console(bool terminal, const std::string& text) : answers(text), input(std::cin.rdbuf(answers.rdbuf())) {
        Localization::Initialize();
        EXPECT_EQ(terminal ? openpty(&ends[0], &ends[1], nullptr, nullptr, nullptr) : pipe(ends), 0);
        std::fflush(stderr);
        saved = dup(STDERR_FILENO);
        dup2(ends[1], STDERR_FILENO);
    }
    ~Console() {
        std::cin.rdbuf(input);
        dup2(saved, STDERR_FILENO);
        for (int end : {saved, ends[0], ends[1]}) close(end);
    }
    // Everything written so far: reads until nothing more comes for 200 ms.
    std::string Shown() const {
        std::cerr.flush();
        std::string text;
        char buffer[4096];
        pollfd ready = {ends[0], POLLIN, 0};
        for (ssize_t count = 0; poll(&ready, 1, 200) > 0 && (count = read(ends[0], buffer, sizeof(buffer))) > 0;) {
            text.append(buffer, static_cast<size_t>(count));
        }
        return text;
    }

private:
    std::istringstream answers;
    std::streambuf* input;
    int ends[2] = {-1, -1};
    int saved;
};

class CountingCancelable final : public ICancelable {
public:
    void Cancel() override { ++calls; }
    std::atomic<int> calls{0};
};

// Off a terminal one line per change; on one the line is rewritten in place, a question ends it, the line comes back
// below after the answer, and Stop ends it.
TEST(ConsoleFrontEnd, ProgressLineOffAndOnATerminal) {
    const std::pair<bool, std::string> cases[] = {
        {false,
         "Ironvale - Updater\n[------------------------------]   0.0%\n[------------------------------]   0.0%  File: "
         "a.pak\n"
         "[############------------------]  42.5%  File: a.pak\n[#################-------------]  57.5%  File: "
         "a.pak\n"},
        {true,
         "Ironvale - Updater\r\n\r[------------------------------]   0.0%\x1b[K"
         "\r[------------------------------]   0.0%  File: a.pak\x1b[K\r[############------------------]  42.5%  File: "
         "a.pak"
         "\x1b[K\r\n[Question] Ironvale - Updater\r\nStart the game?\r\n[Y]es / [n]o? "
         "\r[############------------------]  42.5%  File: a.pak\x1b[K"
         "\r[#################-------------]  57.5%  File: a.pak\x1b[K\r\n"},
    };
    for (const auto& [terminal, shown] : cases) {
        Console console(terminal, "y\n");
        {
            GuiManager gui;
            gui.SetOverallProgress(100);  // before the front end runs: dropped
            gui.Start(nullptr);
            gui.Show();
            gui.SetStatusText(L"File: a.pak");
            gui.SetOverallProgress(500);
            gui.SetOverallProgress(501);  // the same after weighting
            gui.SetStatusText(L"File: a.pak");
            EXPECT_TRUE(!terminal || gui.AskYesNo(L"Start the game?"));
            gui.SetFileProgress(1000);
        }
        EXPECT_EQ(console.Shown(), shown) << terminal;
    }
}

TEST(ConsoleFrontEnd, CtrlCAsksAndOnlyYesCancelsOnce) {
    struct sigaction before = {}, after = {};
    sigaction(SIGINT, nullptr, &before);
    Console console(false, "n\ny\n");
    CountingCancelable cancelable;
    GuiManager gui;
    gui.Start(&cancelable);
    gui.Show();
    // The first is answered No, and the run goes on to hear the second.
    raise(SIGINT);
    raise(SIGINT);
    gui.Stop();
    EXPECT_EQ(cancelable.calls, 1);
    const std::string question = "[Question] Ironvale - Updater\nAre you sure you want to cancel?\n[Y]es / [n]o? ";
    EXPECT_EQ(console.Shown(), "Ironvale - Updater\n[------------------------------]   0.0%\n" + question + question);
    // After a confirmed cancel, Ctrl+C ends the program again.
    sigaction(SIGINT, nullptr, &after);
    EXPECT_EQ(after.sa_handler, before.sa_handler);
}

TEST(ConsoleFrontEnd, LanguageQuestion) {
    const struct {
        const char* answers;
        const char* chosen;  // null: cancelled
    } cases[] = {
        {"\n", "English"},  // the current one
        {" german \n", "German"},
        {"0\n9\nKlingon\n2\n", "French"},  // asked again until the answer names a language
        {"", nullptr},
    };
    for (const auto& c : cases) {
        Console console(false, c.answers);
        std::string name;
        EXPECT_EQ(LanguageDialog().Run(name), c.chosen != nullptr) << c.answers;
        EXPECT_EQ(name, c.chosen != nullptr ? c.chosen : "") << c.answers;
        EXPECT_NE(console.Shown().find("  1) English (current)\n"), std::string::npos);
    }
}

// A prepared file that something blocks: Retry asks again, Cancel ends stage two with StepFailed.
TEST(ConsoleFrontEnd, MoveRetryAsksAgainUntilCancelled) {
    Console console(false, "r\nc\n");
    TestBatch batch(Tree(), TreeOf("blocked.bin=new content"));
    BatchRun run(batch);
    RetryBox retryBox;
    run.retryQuestion = &retryBox;
    run.Prepare();
    WriteTextFile(PathJoin(batch.Installation(), "blocked.bin"), "a file nothing may replace");
    SetImmutable(PathJoin(batch.Installation(), "blocked.bin"), true);
    const std::string error = ErrorOf([&] { run.Apply(); });
    SetImmutable(PathJoin(batch.Installation(), "blocked.bin"), false);
    EXPECT_TRUE(EndsWith(error, " (9)")) << error;  // StepFailed
    const std::string shown = console.Shown();
    const size_t first = shown.find("[R]etry / [c]ancel? ");  // asked exactly twice
    EXPECT_TRUE(first != shown.npos && shown.find("[R]etry", first + 1) == shown.rfind("[R]etry")) << shown;
    EXPECT_TRUE(PathExists(PathJoin(batch.PatchedFiles(), "blocked.bin")));
}

}  // namespace
