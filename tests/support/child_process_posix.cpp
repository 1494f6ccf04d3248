#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>

#include "base/paths.h"
#include "tests/support/child_process.h"

extern char** environ;

void ChildProcess::Traits::Close(intptr_t) {}

ChildProcess::ChildProcess(const std::string& program, const std::vector<std::string>& arguments) {
    // posix_spawn leaves the words as they are.
    std::vector<char*> argv{const_cast<char*>(program.c_str())};
    for (const std::string& word : arguments) argv.push_back(const_cast<char*>(word.c_str()));
    argv.push_back(nullptr);
    pid_t child = 0;
    if (posix_spawn(&child, program.c_str(), nullptr, nullptr, argv.data(), environ) != 0) {
        throw std::runtime_error("cannot start " + program);
    }
    handle.Reset(child);
}

ChildProcess::~ChildProcess() {
    if (!waited) {
        Kill();
        Wait();
    }
}

void ChildProcess::Kill() { kill(static_cast<pid_t>(handle.Get()), SIGKILL); }

int ChildProcess::Wait() {
    if (!waited) {
        int status = 0;
        waitpid(static_cast<pid_t>(handle.Get()), &status, 0);
        exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
        waited = true;
    }
    return exitCode;
}

std::string TestProgramPath(const std::string& name) {
    return PathJoin(IRONVALE_BINARY_DIR "/tests/support/programs", name);
}
