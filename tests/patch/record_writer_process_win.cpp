#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <stdexcept>
#include <string>

#include "tests/patch/record_writer_process.h"

namespace {

const char kFolderVariable[] = "IRONVALE_RECORD_WRITER_FOLDER";

}  // namespace

// Without fork, the child is this test program again, running only this
// test (disabled, so the suite itself never runs it).
TEST(RecordWriterChild, DISABLED_WritesUntilKilled) {
    const char* folder = std::getenv(kFolderVariable);
    if (folder == nullptr) GTEST_SKIP() << "runs only as the child of a torn-write test";
    WriteRecordsForever(folder);
}

RecordWriterProcess::RecordWriterProcess(const std::string& folder) {
    char self[MAX_PATH];
    if (GetModuleFileNameA(nullptr, self, MAX_PATH) == 0) throw std::runtime_error("GetModuleFileNameA failed");
    std::string commandLine = std::string("\"") + self +
                              "\" --gtest_filter=RecordWriterChild.DISABLED_WritesUntilKilled"
                              " --gtest_also_run_disabled_tests";
    SetEnvironmentVariableA(kFolderVariable, folder.c_str());
    SECURITY_ATTRIBUTES inherit = {sizeof(inherit), nullptr, TRUE};
    HANDLE nul = CreateFileA("NUL", GENERIC_WRITE, FILE_SHARE_WRITE, &inherit, OPEN_EXISTING, 0, nullptr);
    STARTUPINFOA startup = {};
    startup.cb = sizeof(startup);
    startup.dwFlags = STARTF_USESTDHANDLES;
    startup.hStdInput = GetStdHandle(STD_INPUT_HANDLE);
    startup.hStdOutput = nul;
    startup.hStdError = nul;
    PROCESS_INFORMATION info = {};
    const BOOL started =
        CreateProcessA(self, &commandLine[0], nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup, &info);
    SetEnvironmentVariableA(kFolderVariable, nullptr);
    if (nul != INVALID_HANDLE_VALUE) CloseHandle(nul);
    if (!started) throw std::runtime_error("CreateProcessA failed");
    CloseHandle(info.hThread);
    process = reinterpret_cast<intptr_t>(info.hProcess);
}

RecordWriterProcess::~RecordWriterProcess() {
    HANDLE handle = reinterpret_cast<HANDLE>(process);
    TerminateProcess(handle, 9);
    WaitForSingleObject(handle, INFINITE);
    CloseHandle(handle);
}
