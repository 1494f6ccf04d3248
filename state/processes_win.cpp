#include <windows.h>

#include <shellapi.h>

#include <vector>

#include "base/command_line.h"
#include "base/paths.h"
#include "base/unique_handle_win.h"
#include "state/processes.h"

namespace {

// Waits for a started process and takes its exit code; one that reports
// itself still active is ended with 0.
int32_t WaitForExit(const UniqueKernelHandle& process) {
    WaitForSingleObject(process.Get(), INFINITE);
    DWORD code = 0;
    GetExitCodeProcess(process.Get(), &code);
    if (code == STILL_ACTIVE) {
        TerminateProcess(process.Get(), 0);
        code = 0;
    }
    return static_cast<int32_t>(code);
}

}  // namespace

int32_t RunProcess(const std::string& programPath, const std::string& parameters, bool wait) {
    const std::string commandLine = programPath.empty() ? parameters : "\"" + programPath + "\" " + parameters;
    std::string folder = GetParentDirectory(programPath);
    if (programPath.empty()) {
        const std::vector<std::string> words = SplitCommandLine(parameters);
        if (!words.empty()) folder = GetParentDirectory(words.front());
    }
    std::vector<char> buffer(commandLine.begin(), commandLine.end());
    buffer.push_back('\0');
    STARTUPINFOA startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessA(nullptr, buffer.data(), nullptr, nullptr, FALSE, 0, nullptr,
                        folder.empty() ? nullptr : folder.c_str(), &startup, &process)) {
        return -1;
    }
    const UniqueKernelHandle thread(process.hThread);
    const UniqueKernelHandle started(process.hProcess);
    return wait ? WaitForExit(started) : 0;
}

int32_t RunElevated(const std::string& parameters, const std::string& programPath) {
    const ProgramCall call = ElevatedCall(parameters, programPath);
    const std::string folder = GetParentDirectory(call.program);
    SHELLEXECUTEINFOA execute = {};
    execute.cbSize = sizeof(execute);
    execute.fMask = SEE_MASK_NOCLOSEPROCESS;
    execute.lpVerb = "runas";
    execute.lpFile = call.program.c_str();
    execute.lpParameters = call.parameters.c_str();
    execute.lpDirectory = folder.empty() ? nullptr : folder.c_str();
    execute.nShow = SW_SHOW;
    if (!ShellExecuteExA(&execute) || execute.hProcess == nullptr) return -1;
    return WaitForExit(UniqueKernelHandle(execute.hProcess));
}

std::string GetOwnCommandLine() { return GetCommandLineA(); }
