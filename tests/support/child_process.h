#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "base/unique_handle.h"

// A program of the test build run as a child process, which the test may kill at any moment: SIGKILL natively,
// TerminateProcess on Windows, so nothing of the child's own runs after the kill.
class ChildProcess {
public:
    ChildProcess(const std::string& program, const std::vector<std::string>& arguments);
    ChildProcess(const ChildProcess&) = delete;
    ChildProcess& operator=(const ChildProcess&) = delete;
    // Kills and reaps a child that still runs.
    ~ChildProcess();

    void Kill();
    // The exit code; -1 when the child was killed or could not start.
    int Wait();

private:
    // The process HANDLE on Windows; natively the pid, which is no handle (Wait reaps it). -1 for none.
    struct Traits {
        using Value = intptr_t;
        static Value Invalid() { return -1; }
        static void Close(Value value);
    };
    UniqueHandle<Traits> handle;
    bool waited = false;
    int exitCode = -1;
};

// A helper program built beside the test programs (tests/support/programs).
std::string TestProgramPath(const std::string& name);
