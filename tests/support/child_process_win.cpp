#include <windows.h>

#include <stdexcept>

#include "base/paths.h"
#include "base/unique_handle_win.h"
#include "tests/support/child_process.h"

void ChildProcess::Traits::Close(intptr_t value) { CloseHandle(reinterpret_cast<HANDLE>(value)); }

ChildProcess::ChildProcess(const std::string& program, const std::vector<std::string>& arguments) {
    std::string commandLine = "\"" + program + "\"";
    for (const std::string& argument : arguments) commandLine += " \"" + argument + "\"";
    std::vector<char> buffer(commandLine.begin(), commandLine.end());
    buffer.push_back('\0');
    STARTUPINFOA startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessA(nullptr, buffer.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &process)) {
        throw std::runtime_error("cannot start " + program);
    }
    const UniqueKernelHandle thread(process.hThread);
    handle.Reset(reinterpret_cast<intptr_t>(process.hProcess));
}

ChildProcess::~ChildProcess() {
    Kill();
    Wait();
}

void ChildProcess::Kill() { TerminateProcess(reinterpret_cast<HANDLE>(handle.Get()), 137); }

int ChildProcess::Wait() {
    if (!waited) {
        WaitForSingleObject(reinterpret_cast<HANDLE>(handle.Get()), INFINITE);
        DWORD code = 0;
        GetExitCodeProcess(reinterpret_cast<HANDLE>(handle.Get()), &code);
        exitCode = code == 137 ? -1 : static_cast<int>(code);
        waited = true;
    }
    return exitCode;
}

std::string TestProgramPath(const std::string& name) {
    char self[MAX_PATH] = {};
    if (GetModuleFileNameA(nullptr, self, MAX_PATH) == 0) throw std::runtime_error("cannot find the test program");
    return PathJoin(PathJoin(GetParentDirectory(self), "support\\programs"), name + ".exe");
}
