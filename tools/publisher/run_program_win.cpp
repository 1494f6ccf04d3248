#include "tools/publisher/run_program.h"

#include <windows.h>

#include "base/encoding.h"
#include "base/unique_handle_win.h"

namespace {

// One argument quoted the way the C runtime's command-line parser splits
// it again: backslashes doubled only where they precede a quote.
std::wstring Quote(const std::wstring& argument) {
    if (!argument.empty() && argument.find_first_of(L" \t\"") == std::wstring::npos) return argument;
    std::wstring quoted = L"\"";
    size_t backslashes = 0;
    for (wchar_t c : argument) {
        if (c == L'\\') {
            ++backslashes;
            continue;
        }
        if (c == L'"')
            quoted.append(backslashes * 2 + 1, L'\\');
        else
            quoted.append(backslashes, L'\\');
        backslashes = 0;
        quoted += c;
    }
    quoted.append(backslashes * 2, L'\\');
    return quoted + L"\"";
}

}  // namespace

int RunProgram(const std::vector<std::string>& arguments, bool quiet) {
    if (arguments.empty()) return -1;
    std::wstring commandLine;
    for (const std::string& argument : arguments) {
        if (!commandLine.empty()) commandLine += L' ';
        commandLine += Quote(WidenFromCodePage(argument));
    }
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    SECURITY_ATTRIBUTES inheritable = {sizeof(inheritable), nullptr, TRUE};
    UniqueFileHandle nowhere;
    if (quiet) {
        nowhere.Reset(CreateFileW(L"NUL", GENERIC_WRITE, FILE_SHARE_READ | FILE_SHARE_WRITE, &inheritable,
                                  OPEN_EXISTING, 0, nullptr));
        startup.dwFlags = STARTF_USESTDHANDLES;
        startup.hStdInput = GetStdHandle(STD_INPUT_HANDLE);
        startup.hStdOutput = nowhere.Get();
        startup.hStdError = nowhere.Get();
    }
    PROCESS_INFORMATION process = {};
    const BOOL started = CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, quiet ? TRUE : FALSE, 0, nullptr,
                                        nullptr, &startup, &process);
    nowhere.Reset();
    if (!started) return -1;
    const UniqueKernelHandle thread(process.hThread);
    const UniqueKernelHandle child(process.hProcess);
    WaitForSingleObject(child.Get(), INFINITE);
    DWORD code = 0;
    const BOOL known = GetExitCodeProcess(child.Get(), &code);
    return known ? static_cast<int>(code) : -1;
}
