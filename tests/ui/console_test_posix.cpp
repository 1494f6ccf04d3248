// The console front end of the native build: the progress line on stderr
// (one line per change, or rewritten in place on a terminal), Ctrl+C with
// the confirmation question, the boxes and the language question answered
// on stdin.

#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <termios.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <sstream>
#include <string>

#include "patch/lzma_decoder.h"
#include "text/localization.h"
#include "ui/gui_manager.h"
#include "ui/language_dialog.h"

namespace {

// Swaps a stream's buffer for the lifetime of the object.
class StreamSwap {
public:
    StreamSwap(std::ios& swapped, std::streambuf* replacement) : stream(swapped), saved(swapped.rdbuf(replacement)) {}
    ~StreamSwap() { stream.rdbuf(saved); }

private:
    std::ios& stream;
    std::streambuf* saved;
};

// Points the process's stderr (descriptor 2, where the front end writes
// and which it asks whether it is a terminal) elsewhere for the object's
// lifetime.
class StderrRedirect {
public:
    explicit StderrRedirect(int target) : saved(dup(STDERR_FILENO)) {
        std::fflush(stderr);
        dup2(target, STDERR_FILENO);
    }
    ~StderrRedirect() {
        std::cerr.flush();
        std::fflush(stderr);
        dup2(saved, STDERR_FILENO);
        close(saved);
    }

private:
    int saved;
};

std::string ReadBack(FILE* file) {
    std::string text;
    std::rewind(file);
    for (int c = std::fgetc(file); c != EOF; c = std::fgetc(file)) text += static_cast<char>(c);
    std::fclose(file);
    return text;
}

// A terminal whose other end the test reads; raw, so that line ends pass
// unchanged.
class PseudoTerminal {
public:
    PseudoTerminal() : master(posix_openpt(O_RDWR | O_NOCTTY)) {
        grantpt(master);
        unlockpt(master);
        terminal = open(ptsname(master), O_RDWR | O_NOCTTY);
        termios mode;
        tcgetattr(terminal, &mode);
        cfmakeraw(&mode);
        tcsetattr(terminal, TCSANOW, &mode);
    }
    ~PseudoTerminal() {
        close(terminal);
        close(master);
    }
    int Terminal() const { return terminal; }
    // Everything written so far: reads until nothing more comes for 200 ms.
    std::string Drain() const {
        std::string text;
        pollfd ready = {master, POLLIN, 0};
        char buffer[4096];
        while (poll(&ready, 1, 200) > 0) {
            const ssize_t count = read(master, buffer, sizeof(buffer));
            if (count <= 0) break;
            text.append(buffer, static_cast<size_t>(count));
        }
        return text;
    }

private:
    int master;
    int terminal = -1;
};

class CountingCancelable final : public ICancelable {
public:
    void Cancel() override { ++calls; }
    std::atomic<int> calls{0};
};

size_t Count(const std::string& text, const std::string& what) {
    size_t count = 0;
    for (size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++count;
    return count;
}

class Console : public ::testing::Test {
protected:
    void SetUp() override { Localization::Initialize(); }
    // The flag is process-wide; a confirmed cancel must not stop the LZMA
    // tests that run after this one.
    void TearDown() override { quitRequested = false; }
};

TEST_F(Console, OneLinePerChangeOffATerminal) {
    FILE* file = std::tmpfile();
    {
        StderrRedirect redirect(fileno(file));
        GuiManager gui;
        gui.SetOverallProgress(100);  // before the front end runs: dropped
        gui.Start(nullptr);
        gui.Show();
        gui.SetStatusText(L"File: a.pak");
        gui.SetOverallProgress(500);
        gui.SetOverallProgress(501);  // the same after weighting
        gui.SetStatusText(L"File: a.pak");
        gui.SetFileProgress(1000);
        gui.Stop();
    }
    EXPECT_EQ(ReadBack(file),
              "Ironvale - Updater\n"
              "[------------------------------]   0.0%\n"
              "[------------------------------]   0.0%  File: a.pak\n"
              "[############------------------]  42.5%  File: a.pak\n"
              "[#################-------------]  57.5%  File: a.pak\n");
}

TEST_F(Console, InPlaceOnATerminalWithQuestionsOnTheirOwnLines) {
    PseudoTerminal terminal;
    std::istringstream answers("y\n");
    bool startGame = false;
    {
        StreamSwap input(std::cin, answers.rdbuf());
        StderrRedirect redirect(terminal.Terminal());
        GuiManager gui;
        gui.Start(nullptr);
        gui.Show();
        gui.SetOverallProgress(500);
        startGame = gui.AskYesNo(L"Start the game?");
        gui.SetFileProgress(1000);
        gui.Stop();
    }
    EXPECT_TRUE(startGame);
    const std::string shown = terminal.Drain();
    const std::string frames =
        "Ironvale - Updater\n"
        "\r[------------------------------]   0.0%\x1b[K"
        "\r[############------------------]  42.5%\x1b[K\n";
    EXPECT_EQ(shown.substr(0, frames.size()), frames) << shown;
    EXPECT_NE(shown.find("\x1b[K\n[Question] Ironvale - Updater\nStart the game?\n"), std::string::npos) << shown;
    // After the answer the line comes back below, and Stop ends it.
    const std::string last =
        "\r[############------------------]  42.5%\x1b[K\r[#################-------------]  57.5%\x1b[K\n";
    ASSERT_GE(shown.size(), last.size());
    EXPECT_EQ(shown.substr(shown.size() - last.size()), last) << shown;
}

TEST_F(Console, CtrlCAsksAndOnlyYesCancelsOnce) {
    struct sigaction before = {};
    sigaction(SIGINT, nullptr, &before);
    std::istringstream answers("n\ny\n");
    FILE* file = std::tmpfile();
    CountingCancelable cancelable;
    {
        StreamSwap input(std::cin, answers.rdbuf());
        StderrRedirect redirect(fileno(file));
        GuiManager gui;
        gui.Start(&cancelable);
        gui.Show();
        // The first is answered No, and the run goes on to hear the second.
        raise(SIGINT);
        raise(SIGINT);
        gui.Stop();
        EXPECT_TRUE(gui.IsCancelled());
    }
    EXPECT_EQ(cancelable.calls, 1);
    EXPECT_TRUE(quitRequested);
    EXPECT_EQ(Count(ReadBack(file), "Are you sure you want to cancel?"), 2u);
    // After a confirmed cancel, Ctrl+C ends the program again.
    struct sigaction after = {};
    sigaction(SIGINT, nullptr, &after);
    EXPECT_EQ(after.sa_handler, before.sa_handler);
}

TEST_F(Console, LanguageQuestion) {
    struct Case {
        const char* answers;
        bool confirmed;
        std::string name;
    };
    const Case cases[] = {
        {"\n", true, "English"},
        {"6\n", true, "Polish"},
        {" german \n", true, "German"},
        {"9\nKlingon\n2\n", true, "French"},
        {"", false, ""},
        {"0\n", false, ""},
    };
    for (const Case& c : cases) {
        std::istringstream answers(c.answers);
        std::ostringstream shown;
        StreamSwap input(std::cin, answers.rdbuf());
        StreamSwap output(std::cerr, shown.rdbuf());
        LanguageDialog dialog;
        std::string name;
        EXPECT_EQ(dialog.Run(name), c.confirmed) << c.answers;
        EXPECT_EQ(name, c.name) << c.answers;
        EXPECT_NE(shown.str().find("1) English (current)\n"), std::string::npos) << shown.str();
    }
}

}  // namespace
