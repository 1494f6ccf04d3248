#include <windows.h>

#include "tests/net/download_test_helpers.h"

// The extended-length form is a UNC path that reaches local drives too.
std::string UncFormOf(const std::string& absolutePath) { return "\\\\?\\" + absolutePath; }

std::string AbsoluteLocation() { return "C:\\patches\\a.bin"; }

// Wine's CopyFileEx copies without ever calling the progress routine (and
// so cannot be cancelled); Windows calls it after every piece.
bool PlatformCopyReportsProgress() {
    return GetProcAddress(GetModuleHandleA("ntdll.dll"), "wine_get_version") == nullptr;
}
